#include "serverlibs/searchareas.h"

#include "entry/errors/raiseerror.h"
#include "entry/errors/statuscall.h"
#include "krn/nocase.h"
#include "serverlibs/objectcall.h"
#include "serverlibs/opensorvik.h"
#include "serverlibs/serverpaths.h"

namespace cv::vek::rovo::serverlibs {

using cv::rovo::IConfigurationEditor;
using cv::rovo::IConfigurationView;
using krn::WString;

namespace {

[[noreturn]] void RaiseOutOfMemory(int line)
{
    RaiseError(u"out of memory", errors::OutOfMemory, u"", line);
}

void AddFolder(IConfigurationEditor &editor, std::u16string_view path, std::u16string_view clientPath,
               std::u16string_view alias, std::int32_t isArea, std::int32_t isExcluded)
{
    WString kept;
    CallWithStatus([&](std::int32_t *status) {
        editor.AddFolder(&kept, WString(path), WString(clientPath), WString(alias), isArea, isExcluded, WString(),
                         status);
    });
}

void MoveFolder(IConfigurationEditor &editor, std::u16string_view oldPath, std::u16string_view clientPath,
                std::u16string_view newPath)
{
    CallWithStatus([&](std::int32_t *status) {
        editor.MoveFolder(WString(oldPath), WString(clientPath), WString(newPath), status);
    });
}

void UpdateArea(IConfigurationEditor &editor, std::u16string_view path, std::u16string_view clientPath,
                std::u16string_view alias)
{
    CallWithStatus([&](std::int32_t *status) {
        editor.UpdateFolder(WString(path), WString(clientPath), WString(alias), 1, 0, status);
    });
}

} // namespace

std::span<const WString> Texts(cv::vekex::IStringList *list)
{
    const std::uint32_t count = list ? list->GetCount() : 0;
    const WString *elements = count ? list->GetElements() : nullptr;
    return elements ? std::span<const WString>(elements, count) : std::span<const WString>();
}

SorvikOpener ModuleSorvikOpener()
{
    return [](const WString &connection) { return OpenSorvik(connection).sorvik; };
}

SorvikConfiguration OpenConfiguration(const SorvikOpener &open, const WString &connection)
{
    SorvikConfiguration taken;
    taken.sorvik = open(connection);
    if (!taken.sorvik)
        RaiseOutOfMemory(__LINE__);
    taken.view = AdoptWithStatus([&](std::int32_t *status) { return taken.sorvik->GetConfigurationView(status); });
    if (!taken.view)
        RaiseOutOfMemory(__LINE__);
    taken.editor =
        AdoptWithStatus([&](std::int32_t *status) { return taken.sorvik->GetConfigurationEditor(status); });
    if (!taken.editor)
        RaiseOutOfMemory(__LINE__);
    return taken;
}

SorvikConfiguration OpenConfigurationEditor(const SorvikOpener &open, const WString &connection)
{
    SorvikConfiguration taken;
    taken.sorvik = open(connection);
    if (!taken.sorvik)
        RaiseOutOfMemory(__LINE__);
    taken.editor =
        AdoptWithStatus([&](std::int32_t *status) { return taken.sorvik->GetConfigurationEditor(status); });
    if (!taken.editor)
        RaiseOutOfMemory(__LINE__);
    return taken;
}

krn::RefPtr<cv::vekex::IStringList> ListSearchAreas(IConfigurationView &view)
{
    return AdoptWithStatus([&](std::int32_t *status) { return view.ListSearchAreas(status); });
}

krn::RefPtr<cv::vekex::IStringList> ListExcludedFolders(IConfigurationView &view, std::u16string_view area)
{
    return AdoptWithStatus([&](std::int32_t *status) { return view.ListExcludedFolders(WString(area), status); });
}

SearchAreaNames GetSearchArea(IConfigurationView &view, const WString &path)
{
    SearchAreaNames names;
    CallWithStatus(
        [&](std::int32_t *status) { view.GetSearchArea(path, &names.clientPath, &names.alias, 0, status); });
    return names;
}

bool IsSearchArea(IConfigurationView &view, const WString &path)
{
    return CallWithStatus([&](std::int32_t *status) { return view.IsSearchArea(path, status); });
}

bool IsExcludedFolder(IConfigurationView &view, const WString &path)
{
    return CallWithStatus([&](std::int32_t *status) { return view.IsExcludedFolder(path, status); });
}

void AddSearchArea(IConfigurationEditor &editor, IConfigurationView &view, std::u16string_view path,
                   std::u16string_view alias, std::u16string_view clientPath)
{
    const std::u16string_view workPath = WithoutTrailingSeparator(path);
    const std::u16string_view workClientPath =
        clientPath.size() >= 2 ? WithoutTrailingSeparator(clientPath) : clientPath;
    const char16_t separator = SeparatorOf(path);
    AddFolder(editor, workPath, workClientPath, alias, 1, 0);

    const auto areas = ListSearchAreas(view);
    for (const WString &area : Texts(areas.get())) {
        const SearchAreaNames names = GetSearchArea(view, area);
        // Two empty client paths say nothing about being the same area.
        if (krn::EqualsNoCase(area, path) ||
            (!clientPath.empty() && krn::EqualsNoCase(names.clientPath, clientPath)))
            continue;

        std::u16string_view relative;
        if (IsFolderPrefix(path, area))
            relative = area.view().substr(path.size());
        else if (IsFolderPrefix(clientPath, names.clientPath))
            relative = names.clientPath.view().substr(clientPath.size());
        relative = WithoutLeadingSeparator(relative);
        if (relative.empty())
            continue;

        RemoveFolder(editor, area);
        const auto excluded = ListExcludedFolders(view, area);
        for (const std::u16string_view folder : Texts(excluded.get())) {
            // An exclusion outside its own area has no place in the new one.
            if (!IsFolderPrefix(area, folder))
                continue;
            const std::u16string name = JoinPath(relative, folder.substr(area.size()), separator);
            AddFolder(editor, JoinPath(workPath, name, separator), u"", name, 0, 1);
        }
    }
}

void EditSearchArea(IConfigurationEditor &editor, IConfigurationView &view, std::u16string_view oldPath,
                    std::u16string_view clientPath, std::u16string_view oldAlias, std::u16string_view newPath,
                    std::u16string_view newAlias)
{
    if (krn::EqualsNoCase(newPath, oldPath)) {
        UpdateArea(editor, oldPath, clientPath, newAlias);
        return;
    }
    const std::u16string_view from = WithoutTrailingSeparator(oldPath);
    const std::u16string_view to = WithoutTrailingSeparator(newPath);
    const std::u16string_view client = WithoutTrailingSeparator(clientPath);
    // The alias the user entered is kept across the move: it is recorded on
    // the old path, and the move takes it along.
    if (newAlias != oldAlias)
        UpdateArea(editor, from, client, newAlias);
    const auto excluded = ListExcludedFolders(view, from);
    MoveFolder(editor, from, client, to);
    for (const std::u16string_view folder : Texts(excluded.get())) {
        if (IsFolderPrefix(from, folder))
            MoveFolder(editor, folder, u"", std::u16string(to).append(folder.substr(from.size())));
    }
}

void ExcludeFolder(IConfigurationEditor &editor, std::u16string_view path)
{
    AddFolder(editor, path, u"", LastComponent(path), 0, 1);
}

void RemoveFolder(IConfigurationEditor &editor, std::u16string_view path)
{
    CallWithStatus([&](std::int32_t *status) { editor.RemoveFolder(WString(path), 1, status); });
}

void Commit(IConfigurationEditor &editor)
{
    CallWithStatus([&](std::int32_t *status) { editor.CommitConfiguration(status); });
}

} // namespace cv::vek::rovo::serverlibs
