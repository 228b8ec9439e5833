#include "support/spysorvik.h"

#include "support/refcountedfake.h"

#include <algorithm>

namespace testsupport {

namespace {

using cv::krn::RefPtr;
using cv::krn::WString;
using cv::rovo::CalendarTime;
using cv::vekex::IContainer;
using cv::vekex::IStringList;
namespace rovo = cv::rovo;

std::string Text(const WString &text)
{
    std::string narrow;
    for (char16_t c : std::u16string_view(text.c_str(), text.size()))
        narrow += c < 0x80 ? char(c) : '?';
    return narrow;
}

std::string Texts(IStringList *list)
{
    std::string joined;
    if (!list)
        return "(none)";
    for (std::uint32_t i = 0; i < list->GetCount(); ++i)
        joined += (i ? "," : "") + Text(list->GetElements()[i]);
    return joined;
}

template <typename Interface>
class Spy : public RefCountedFake<Interface>
{
public:
    Spy(RefPtr<Interface> real, std::shared_ptr<CallLog> log) : m_real(std::move(real)), m_log(std::move(log)) {}

    Interface *Real() const { return m_real.get(); }

protected:
    bool Enter(std::string_view operation, std::int32_t *status, const std::vector<std::string> &arguments = {})
    {
        return m_log->Enter(operation, status, arguments);
    }

    RefPtr<Interface> m_real;
    std::shared_ptr<CallLog> m_log;
};

class SpyEditor final : public Spy<rovo::IConfigurationEditor>
{
public:
    using Spy::Spy;

    void AddFolder(WString *result, const WString &path, const WString &clientPath, const WString &alias,
                   std::int32_t isArea, std::int32_t isExcluded, const WString &tag, std::int32_t *status) override
    {
        if (Enter("AddFolder", status,
                  {Text(path), Text(clientPath), Text(alias), std::to_string(isArea), std::to_string(isExcluded)}))
            m_real->AddFolder(result, path, clientPath, alias, isArea, isExcluded, tag, status);
    }
    void RemoveFolder(const WString &path, std::int32_t flags, std::int32_t *status) override
    {
        if (Enter("RemoveFolder", status, {Text(path), std::to_string(flags)}))
            m_real->RemoveFolder(path, flags, status);
    }
    void UpdateFolder(const WString &path, const WString &clientPath, const WString &alias, std::int32_t isArea,
                      std::int32_t isExcluded, std::int32_t *status) override
    {
        if (Enter("UpdateFolder", status, {Text(path), Text(clientPath), Text(alias)}))
            m_real->UpdateFolder(path, clientPath, alias, isArea, isExcluded, status);
    }
    void MoveFolder(const WString &oldPath, const WString &clientPath, const WString &newPath,
                    std::int32_t *status) override
    {
        if (Enter("MoveFolder", status, {Text(oldPath), Text(clientPath), Text(newPath)}))
            m_real->MoveFolder(oldPath, clientPath, newPath, status);
    }
    std::int32_t CheckAreaAllowed(const WString &path, const WString &clientPath, const WString &alias,
                                  std::int32_t isArea, std::int32_t isExcluded, std::int32_t *status) override
    {
        if (!Enter("CheckAreaAllowed", status, {Text(path), Text(clientPath), Text(alias)}))
            return 0;
        return m_real->CheckAreaAllowed(path, clientPath, alias, isArea, isExcluded, status);
    }
    void SetSearchAreaOrder(IContainer *paths, std::int32_t *status) override
    {
        if (Enter("SetSearchAreaOrder", status, {Texts(paths)}))
            m_real->SetSearchAreaOrder(paths, status);
    }
    void CommitConfiguration(std::int32_t *status) override
    {
        if (Enter("CommitConfiguration", status))
            m_real->CommitConfiguration(status);
    }
    void SetFileTimeout(std::uint32_t milliseconds, std::int32_t *status) override
    {
        if (Enter("SetFileTimeout", status, {std::to_string(milliseconds)}))
            m_real->SetFileTimeout(milliseconds, status);
    }
    void SetIdleTime(std::uint32_t seconds, std::int32_t *status) override
    {
        if (Enter("SetIdleTime", status, {std::to_string(seconds)}))
            m_real->SetIdleTime(seconds, status);
    }
    void PrepareTriggerChange(std::int32_t mode, std::int32_t *status) override
    {
        if (Enter("PrepareTriggerChange", status, {std::to_string(mode)}))
            m_real->PrepareTriggerChange(mode, status);
    }
    void SetTriggerOptions(std::int32_t scope, std::int32_t events, std::int32_t *status) override
    {
        if (Enter("SetTriggerOptions", status, {std::to_string(scope), std::to_string(events)}))
            m_real->SetTriggerOptions(scope, events, status);
    }
    void SetChangeTrigger(std::int32_t trigger, std::int32_t *status) override
    {
        if (Enter("SetChangeTrigger", status, {std::to_string(trigger)}))
            m_real->SetChangeTrigger(trigger, status);
    }
    void SetSchedule(std::int32_t kind, const CalendarTime &when, std::int32_t *status) override
    {
        if (Enter("SetSchedule", status,
                  {std::to_string(kind), std::to_string(when.year) + "-" + std::to_string(when.month) + "-" +
                                             std::to_string(when.day) + " " + std::to_string(when.hour) + ":" +
                                             std::to_string(when.minute) + ":" + std::to_string(when.second)}))
            m_real->SetSchedule(kind, when, status);
    }
    void StartIndexingNow(std::int32_t mode, std::int32_t *status) override
    {
        if (Enter("StartIndexingNow", status, {std::to_string(mode)}))
            m_real->StartIndexingNow(mode, status);
    }
    void SetBrowseTimeout(std::uint32_t seconds, std::int32_t *status) override
    {
        if (Enter("SetBrowseTimeout", status, {std::to_string(seconds)}))
            m_real->SetBrowseTimeout(seconds, status);
    }
    void SetSearchQueryTimeout(std::uint32_t seconds, std::int32_t *status) override
    {
        if (Enter("SetSearchQueryTimeout", status, {std::to_string(seconds)}))
            m_real->SetSearchQueryTimeout(seconds, status);
    }
    void SetIndexPath(const WString &path, std::int32_t *status) override
    {
        if (Enter("SetIndexPath", status, {Text(path)}))
            m_real->SetIndexPath(path, status);
    }
    void SetParseletActive(const WString &name, std::int32_t active, std::int32_t *status) override
    {
        if (Enter("SetParseletActive", status, {Text(name), std::to_string(active)}))
            m_real->SetParseletActive(name, active, status);
    }
    void ReindexParselets(IContainer *names, std::int32_t *status) override
    {
        if (Enter("ReindexParselets", status, {Texts(names)}))
            m_real->ReindexParselets(names, status);
    }
    void SetExtensionParselets(const WString &extension, IContainer *names, std::int32_t *status) override
    {
        if (Enter("SetExtensionParselets", status, {Text(extension), Texts(names)}))
            m_real->SetExtensionParselets(extension, names, status);
    }
};

class SpyView final : public Spy<rovo::IConfigurationView>
{
public:
    using Spy::Spy;

    IStringList *ListSearchAreas(std::int32_t *status) override
    {
        return Enter("ListSearchAreas", status) ? m_real->ListSearchAreas(status) : nullptr;
    }
    IStringList *ListExcludedFolders(const WString &areaPath, std::int32_t *status) override
    {
        return Enter("ListExcludedFolders", status, {Text(areaPath)}) ? m_real->ListExcludedFolders(areaPath, status)
                                                                      : nullptr;
    }
    void GetSearchArea(const WString &path, WString *clientPath, WString *alias, std::int32_t flags,
                       std::int32_t *status) override
    {
        if (Enter("GetSearchArea", status, {Text(path)}))
            m_real->GetSearchArea(path, clientPath, alias, flags, status);
    }
    bool IsSearchArea(const WString &path, std::int32_t *status) override
    {
        return Enter("IsSearchArea", status, {Text(path)}) && m_real->IsSearchArea(path, status);
    }
    bool IsExcludedFolder(const WString &path, std::int32_t *status) override
    {
        return Enter("IsExcludedFolder", status, {Text(path)}) && m_real->IsExcludedFolder(path, status);
    }
    void ImportConfiguration(const WString &file, rovo::IConfigurationEditor *editor, std::int32_t *status) override
    {
        if (Enter("ImportConfiguration", status, {Text(file)}))
            m_real->ImportConfiguration(file, Unwrapped(editor), status);
    }
    void ExportConfiguration(const WString &file, rovo::IConfigurationEditor *editor, std::int32_t *status) override
    {
        if (Enter("ExportConfiguration", status, {Text(file)}))
            m_real->ExportConfiguration(file, Unwrapped(editor), status);
    }
    std::int32_t GetChangeTrigger(std::int32_t *status) override
    {
        return Enter("GetChangeTrigger", status) ? m_real->GetChangeTrigger(status) : 0;
    }
    std::uint32_t GetFileTimeout(std::int32_t *status) override
    {
        return Enter("GetFileTimeout", status) ? m_real->GetFileTimeout(status) : 0;
    }
    std::uint32_t GetIdleTime(std::int32_t *status) override
    {
        return Enter("GetIdleTime", status) ? m_real->GetIdleTime(status) : 0;
    }
    void GetSchedule(std::int32_t *kind, CalendarTime *when, std::int32_t *status) override
    {
        if (Enter("GetSchedule", status))
            m_real->GetSchedule(kind, when, status);
    }
    void GetTimeouts(std::uint32_t *browseSeconds, std::uint32_t *querySeconds, std::int32_t *status) override
    {
        if (Enter("GetTimeouts", status))
            m_real->GetTimeouts(browseSeconds, querySeconds, status);
    }
    void GetIndexPath(WString *path, std::int32_t *status) override
    {
        if (Enter("GetIndexPath", status))
            m_real->GetIndexPath(path, status);
    }
    std::int32_t IsParseletActive(const WString &name, std::int32_t *status) override
    {
        return Enter("IsParseletActive", status, {Text(name)}) ? m_real->IsParseletActive(name, status) : 0;
    }
    IStringList *GetExtensionParselets(const WString &extension, std::int32_t *status) override
    {
        return Enter("GetExtensionParselets", status, {Text(extension)})
                   ? m_real->GetExtensionParselets(extension, status)
                   : nullptr;
    }
};

class SpyIndexManager final : public Spy<rovo::IIndexManager>
{
public:
    using Spy::Spy;

    double GetVersion(std::int32_t *status) override
    {
        return Enter("GetVersion", status) ? m_real->GetVersion(status) : 0.0;
    }
    void ResetTimeoutFiles(std::int32_t *status) override
    {
        if (Enter("ResetTimeoutFiles", status))
            m_real->ResetTimeoutFiles(status);
    }
    void ResetFailedFiles(std::int32_t *status) override
    {
        if (Enter("ResetFailedFiles", status))
            m_real->ResetFailedFiles(status);
    }
    void SetServiceTimeout(std::int32_t kind, std::uint32_t milliseconds, std::int32_t *status) override
    {
        if (Enter("SetServiceTimeout", status, {std::to_string(kind), std::to_string(milliseconds)}))
            m_real->SetServiceTimeout(kind, milliseconds, status);
    }
    void WaitForUpdate(std::int32_t *status) override
    {
        if (Enter("WaitForUpdate", status))
            m_real->WaitForUpdate(status);
    }
    rovo::ILevelPropertyList *GetLevelProperties(const WString &level, std::int32_t *status) override
    {
        return Enter("GetLevelProperties", status, {Text(level)}) ? m_real->GetLevelProperties(level, status) : nullptr;
    }
    rovo::IServerContext *GetServerContext(std::int32_t *status) override
    {
        return Enter("GetServerContext", status) ? m_real->GetServerContext(status) : nullptr;
    }
    bool GetServerFlag(std::int32_t *status) override
    {
        return Enter("GetServerFlag", status) && m_real->GetServerFlag(status);
    }
    rovo::IOptimizationEditor *GetOptimizationEditor(std::int32_t *status) override
    {
        return Enter("GetOptimizationEditor", status) ? m_real->GetOptimizationEditor(status) : nullptr;
    }
    rovo::IIndexStatus *GetIndexStatus(std::int32_t *status) override
    {
        return Enter("GetIndexStatus", status) ? m_real->GetIndexStatus(status) : nullptr;
    }
};

class SpySorvik final : public Spy<rovo::ISorvik>
{
public:
    using Spy::Spy;

    WString GetSorvikName(std::int32_t *status) override
    {
        return Enter("GetSorvikName", status) ? m_real->GetSorvikName(status) : WString();
    }
    rovo::IConfigurationView *GetConfigurationView(std::int32_t *status) override
    {
        if (!Enter("GetConfigurationView", status))
            return nullptr;
        return Wrapped<SpyView>(m_real->GetConfigurationView(status));
    }
    rovo::IConfigurationEditor *GetConfigurationEditor(std::int32_t *status) override
    {
        if (!Enter("GetConfigurationEditor", status))
            return nullptr;
        return Wrapped<SpyEditor>(m_real->GetConfigurationEditor(status));
    }
    rovo::IIndexManager *GetIndexManager(std::int32_t *status) override
    {
        if (!Enter("GetIndexManager", status) || m_log->noIndexManager)
            return nullptr;
        if (m_log->indexManager)
            return Wrapped<SpyIndexManager>(RefPtr<rovo::IIndexManager>(m_log->indexManager).Detach());
        return Wrapped<SpyIndexManager>(m_real->GetIndexManager(status));
    }
    void ResetSorvik(std::int32_t mode, std::int32_t flags, std::int32_t *status) override
    {
        if (Enter("ResetSorvik", status, {std::to_string(mode), std::to_string(flags)}))
            m_real->ResetSorvik(mode, flags, status);
    }

private:
    template <typename SpyType, typename Interface>
    Interface *Wrapped(Interface *real)
    {
        if (!real)
            return nullptr;
        return new SpyType(RefPtr<Interface>::Adopt(real), m_log);
    }
};

} // namespace

void CallLog::Clear()
{
    const std::lock_guard<std::mutex> guard(m_lock);
    calls.clear();
}

int CallLog::Count(std::string_view operation) const
{
    const std::lock_guard<std::mutex> guard(m_lock);
    return int(std::count_if(calls.begin(), calls.end(), [operation](const std::string &call) {
        return call == operation || call.rfind(std::string(operation) + " ", 0) == 0;
    }));
}

std::vector<std::string> CallLog::Only(std::initializer_list<std::string_view> names) const
{
    const std::lock_guard<std::mutex> guard(m_lock);
    std::vector<std::string> kept;
    for (const std::string &call : calls) {
        const std::string_view operation = std::string_view(call).substr(0, call.find(' '));
        if (std::find(names.begin(), names.end(), operation) != names.end())
            kept.push_back(call);
    }
    return kept;
}

bool CallLog::Enter(std::string_view operation, std::int32_t *status, const std::vector<std::string> &arguments)
{
    std::string line(operation);
    for (std::size_t i = 0; i < arguments.size(); ++i)
        line += (i ? " | " : " ") + arguments[i];
    const std::lock_guard<std::mutex> guard(m_lock);
    calls.push_back(line);
    const auto failure = failures.find(operation);
    if (failure == failures.end())
        return true;
    if (status)
        *status = failure->second;
    return false;
}

RefPtr<rovo::ISorvik> SpyOn(RefPtr<rovo::ISorvik> sorvik, std::shared_ptr<CallLog> log)
{
    if (!sorvik)
        return {};
    return RefPtr<rovo::ISorvik>::Adopt(new SpySorvik(std::move(sorvik), std::move(log)));
}

RefPtr<rovo::IConfigurationView> SpyOn(RefPtr<rovo::IConfigurationView> view, std::shared_ptr<CallLog> log)
{
    if (!view)
        return {};
    return RefPtr<rovo::IConfigurationView>::Adopt(new SpyView(std::move(view), std::move(log)));
}

RefPtr<rovo::IConfigurationEditor> SpyOn(RefPtr<rovo::IConfigurationEditor> editor, std::shared_ptr<CallLog> log)
{
    if (!editor)
        return {};
    return RefPtr<rovo::IConfigurationEditor>::Adopt(new SpyEditor(std::move(editor), std::move(log)));
}

rovo::IConfigurationEditor *Unwrapped(rovo::IConfigurationEditor *editor)
{
    auto *spy = dynamic_cast<SpyEditor *>(editor);
    return spy ? spy->Real() : editor;
}

} // namespace testsupport
