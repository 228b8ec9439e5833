#include "reference/rovoapi/objects.h"

#include "reference/rovoapi/catalogueinfo.h"
#include "reference/rovoapi/config.h"
#include "reference/rovoapi/configanswers.h"
#include "reference/rovoapi/connection.h"
#include "reference/rovoapi/indexmanager.h"
#include "reference/rovoapi/skc.h"
#include "reference/rovoapi/store.h"
#include "reference/rovoapi/writer.h"
#include "sorvik/wstringqt.h"

#include <QSet>

#include <functional>
#include <mutex>
#include <optional>
#include <vector>

namespace sorvik::rovo {

namespace {

using cv::krn::FromQString;
using cv::krn::RefPtr;
using cv::krn::ToQString;
using cv::krn::WString;
namespace status = cv::rovo::status;

template <typename Body>
auto Guard(std::int32_t *status, Body &&body)
{
    return ref::Guarded(kCodes, status, std::forward<Body>(body));
}

[[noreturn]] void Bad(std::int32_t code, const QString &text)
{
    ref::Fail(code, text.toStdU16String());
}

template <typename T>
T &Required(T *pointer, const char16_t *what)
{
    if (!pointer)
        ref::Fail(status::InvalidArgument, std::u16string(what) + u" is null");
    return *pointer;
}

// Names and aliases must be text a configuration file can hold.
QString CheckedText(const WString &text, const char16_t *what)
{
    QString value = ToQString(text);
    for (QChar c : value) {
        if (c.unicode() < 0x20)
            Bad(status::InvalidArgument,
                QStringLiteral("the %1 \"%2\" holds a control character").arg(QString::fromUtf16(what), value));
    }
    return value;
}

std::vector<QString> Texts(cv::vekex::IContainer *container)
{
    Required(container, u"the container");
    std::vector<QString> texts;
    const WString *items = container->GetElements();
    for (std::uint32_t i = 0; i < container->GetCount(); ++i)
        texts.push_back(ToQString(items[i]));
    return texts;
}

struct StartState
{
    std::mutex lock;
    int uses = 0;
    QSet<QString> verified;
};

StartState &Started()
{
    static StartState state;
    return state;
}

class Editor;
using Change = std::function<void(ConfigWriter &)>;

// What the objects of one opened Sorvik share.
class SorvikContext
{
public:
    SorvikContext(Connection connection, QString storeFile, RefPtr<cv::vekex::IEnvironment> dataStore)
        : connection(std::move(connection)), storeFile(std::move(storeFile)), m_dataStore(std::move(dataStore))
    {
    }

    std::shared_ptr<const CatalogueInfo> Catalogue()
    {
        std::lock_guard guard(m_lock);
        if (!m_catalogue)
            m_catalogue = ReadCatalogueInfo(m_dataStore.get());
        return m_catalogue;
    }

    ConfigWriter::CatalogueSource CatalogueSource()
    {
        return [this] { return Catalogue(); };
    }

    // The editor of this Sorvik object holding an import, whose configuration
    // the views show until it is committed or gone.
    void SetImporter(Editor *editor)
    {
        std::lock_guard guard(m_importLock);
        m_importer = editor;
    }
    void ForgetImporter(Editor *editor)
    {
        std::lock_guard guard(m_importLock);
        if (m_importer == editor)
            m_importer = nullptr;
    }
    // Null when no import waits.
    std::shared_ptr<const Configuration> ImportedConfiguration();

    const Connection connection;
    const QString storeFile;

private:
    std::mutex m_importLock; // guards m_importer, and keeps it alive while it is asked
    Editor *m_importer = nullptr;
    std::mutex m_lock;
    RefPtr<cv::vekex::IEnvironment> m_dataStore;
    std::shared_ptr<const CatalogueInfo> m_catalogue;
};

class Editor final : public ref::RefObject<cv::rovo::IConfigurationEditor>
{
public:
    explicit Editor(std::shared_ptr<SorvikContext> context)
        : m_context(std::move(context)), m_db(OpenStore(m_context->storeFile, false))
    {
    }
    ~Editor() override { m_context->ForgetImporter(this); }

    // An import replaces the whole configuration; the views of this Sorvik
    // show it from now on, with the changes recorded after it.
    void RecordImport(Change change)
    {
        Record(std::move(change));
        m_context->SetImporter(this);
    }

    // State(), kept while nothing new is recorded.
    std::shared_ptr<const Configuration> PendingState()
    {
        {
            std::lock_guard guard(m_db->Lock());
            if (m_pendingState && m_pendingChanges == m_changes.size())
                return m_pendingState;
        }
        auto state = std::make_shared<const Configuration>(State());
        std::lock_guard guard(m_db->Lock());
        m_pendingState = state;
        m_pendingChanges = m_changes.size();
        return state;
    }

    const SorvikContext *Context() const { return m_context.get(); }

    // The configuration as it would be after a commit; nothing is written.
    Configuration State()
    {
        std::lock_guard guard(m_db->Lock());
        if (m_changes.empty()) {
            Transaction read(*m_db, Transaction::Kind::Read, status::StoreUnavailable);
            return ReadConfiguration(*m_db);
        }
        m_db->SetBusyTimeout(CommitTimeoutMilliseconds());
        Transaction trial(*m_db, Transaction::Kind::Write, status::UpdateTimedOut);
        ApplyAll();
        return ReadConfiguration(*m_db); // the transaction rolls back
    }

    void Record(Change change)
    {
        std::lock_guard guard(m_db->Lock());
        m_changes.push_back(std::move(change));
    }

    std::shared_ptr<const CatalogueInfo> Catalogue() { return m_context->Catalogue(); }

    void AddFolder(WString *result, const WString &path, const WString &clientPath, const WString &alias,
                   std::int32_t isArea, std::int32_t isExcluded, const WString &tag, std::int32_t *status) override
    {
        Guard(status, [&] {
            const bool area = Kind(isArea, isExcluded);
            Folder folder;
            folder.path = NormalizePath(ToQString(path), u"path");
            folder.clientPath = clientPath.empty() ? QString() : NormalizePath(ToQString(clientPath), u"client path");
            folder.alias = CheckedText(alias, u"alias");
            folder.tag = CheckedText(tag, u"tag");
            if (area && folder.alias.trimmed().isEmpty())
                Bad(status::InvalidArgument, QStringLiteral("the search area %1 needs an alias").arg(folder.path));
            Record([folder, area](ConfigWriter &writer) {
                area ? writer.AddArea(folder) : writer.AddExcluded(folder);
            });
            if (result)
                *result = FromQString(folder.path);
        });
    }

    void RemoveFolder(const WString &path, std::int32_t flags, std::int32_t *status) override
    {
        Guard(status, [&] {
            const QString folder = NormalizePath(ToQString(path), u"path");
            if (flags != 0 && flags != 1)
                Bad(status::InvalidArgument, QStringLiteral("RemoveFolder takes the flags 0 or 1, not %1").arg(flags));
            Record([folder, flags](ConfigWriter &writer) { writer.RemoveFolder(folder, flags); });
        });
    }

    void UpdateFolder(const WString &path, const WString &clientPath, const WString &alias, std::int32_t isArea,
                      std::int32_t isExcluded, std::int32_t *status) override
    {
        Guard(status, [&] {
            const bool area = Kind(isArea, isExcluded);
            const QString folder = NormalizePath(ToQString(path), u"path");
            const QString client =
                clientPath.empty() ? QString() : NormalizePath(ToQString(clientPath), u"client path");
            const QString name = CheckedText(alias, u"alias");
            if (area && name.trimmed().isEmpty())
                Bad(status::InvalidArgument, QStringLiteral("the search area %1 needs an alias").arg(folder));
            Record([=](ConfigWriter &writer) { writer.UpdateFolder(folder, client, name, area); });
        });
    }

    void MoveFolder(const WString &oldPath, const WString &clientPath, const WString &newPath,
                    std::int32_t *status) override
    {
        Guard(status, [&] {
            const QString from = NormalizePath(ToQString(oldPath), u"old path");
            const QString to = NormalizePath(ToQString(newPath), u"new path");
            const QString client =
                clientPath.empty() ? QString() : NormalizePath(ToQString(clientPath), u"client path");
            Record([=](ConfigWriter &writer) { writer.MoveFolder(from, client, to); });
        });
    }

    std::int32_t CheckAreaAllowed(const WString &path, const WString &clientPath, const WString &, std::int32_t isArea,
                                  std::int32_t isExcluded, std::int32_t *status) override
    {
        return Guard(status, [&] {
            if (!Kind(isArea, isExcluded))
                return cv::rovo::kAreaAllowed;
            std::lock_guard guard(m_db->Lock());
            return AreaPolicy(*m_db, ToQString(path), ToQString(clientPath));
        });
    }

    void SetSearchAreaOrder(cv::vekex::IContainer *paths, std::int32_t *status) override
    {
        Guard(status, [&] {
            std::vector<QString> order;
            QSet<QString> keys;
            for (const QString &path : Texts(paths)) {
                order.push_back(NormalizePath(path, u"path"));
                if (keys.contains(Key(order.back())))
                    Bad(status::InvalidArgument, QStringLiteral("the order names %1 twice").arg(path));
                keys.insert(Key(order.back()));
            }
            Record([order](ConfigWriter &writer) { writer.SetAreaOrder(order); });
        });
    }

    void CommitConfiguration(std::int32_t *status) override
    {
        Guard(status, [&] {
            std::lock_guard guard(m_db->Lock());
            if (m_changes.empty())
                return;
            m_db->SetBusyTimeout(CommitTimeoutMilliseconds());
            Transaction transaction(*m_db, Transaction::Kind::Write, status::UpdateTimedOut);
            ApplyAll();
            const std::int64_t generation = AdvanceConfigGeneration(*m_db);
            transaction.Commit();
            m_changes.clear();
            m_pendingState.reset();
            m_context->ForgetImporter(this);
            AnnounceCommit(m_context->storeFile, generation);
        });
    }

    void SetFileTimeout(std::uint32_t milliseconds, std::int32_t *status) override
    {
        Guard(status, [&] {
            CheckFileTimeout(milliseconds, status::InvalidArgument);
            RecordSettings([milliseconds](Settings &settings) { settings.fileTimeout = milliseconds; });
        });
    }

    void SetIdleTime(std::uint32_t seconds, std::int32_t *status) override
    {
        Guard(status, [&] {
            CheckIdleTime(seconds, status::InvalidArgument);
            RecordSettings([seconds](Settings &settings) { settings.idleTime = seconds; });
        });
    }

    void PrepareTriggerChange(std::int32_t mode, std::int32_t *status) override
    {
        Guard(status, [&] {
            if (mode != 0)
                Bad(status::InvalidArgument, QStringLiteral("the trigger change mode %1 is not 0").arg(mode));
            RecordSettings([](Settings &settings) {
                const Settings defaults;
                settings.triggerScope = defaults.triggerScope;
                settings.triggerEvents = defaults.triggerEvents;
            });
        });
    }

    void SetTriggerOptions(std::int32_t scope, std::int32_t events, std::int32_t *status) override
    {
        Guard(status, [&] {
            CheckTriggerOptions(scope, events, status::InvalidArgument);
            RecordSettings([scope, events](Settings &settings) {
                settings.triggerScope = scope;
                settings.triggerEvents = events;
            });
        });
    }

    void SetChangeTrigger(std::int32_t trigger, std::int32_t *status) override
    {
        Guard(status, [&] {
            CheckChangeTrigger(trigger, status::InvalidArgument);
            RecordSettings([trigger](Settings &settings) { settings.changeTrigger = trigger; });
        });
    }

    void SetSchedule(std::int32_t kind, const cv::rovo::CalendarTime &when, std::int32_t *status) override
    {
        Guard(status, [&] {
            CheckSchedule(kind, when, status::InvalidArgument);
            RecordSettings([kind, when](Settings &settings) {
                settings.scheduleKind = kind;
                settings.scheduleTime = when;
            });
        });
    }

    void StartIndexingNow(std::int32_t mode, std::int32_t *status) override
    {
        Guard(status, [&] {
            if (mode != 0)
                Bad(status::InvalidArgument, QStringLiteral("the indexing mode %1 is not 0").arg(mode));
            Record([](ConfigWriter &writer) { writer.Request(QStringLiteral("start-indexing"), QStringLiteral("0")); });
        });
    }

    void SetBrowseTimeout(std::uint32_t seconds, std::int32_t *status) override
    {
        Guard(status, [&] {
            CheckServiceTimeout(seconds, status::InvalidArgument);
            RecordSettings([seconds](Settings &settings) { settings.browseTimeout = seconds; });
        });
    }

    void SetSearchQueryTimeout(std::uint32_t seconds, std::int32_t *status) override
    {
        Guard(status, [&] {
            CheckServiceTimeout(seconds, status::InvalidArgument);
            RecordSettings([seconds](Settings &settings) { settings.queryTimeout = seconds; });
        });
    }

    void SetIndexPath(const WString &path, std::int32_t *status) override
    {
        Guard(status, [&] {
            const QString folder = NormalizePath(ToQString(path), u"index path");
            Record([folder](ConfigWriter &writer) {
                bool moved = false;
                writer.ChangeSettings([&](Settings &settings) {
                    moved = Key(settings.indexPath) != Key(folder);
                    settings.indexPath = folder;
                });
                if (moved)
                    writer.Request(QStringLiteral("move-index"), folder);
            });
        });
    }

    void SetParseletActive(const WString &name, std::int32_t active, std::int32_t *status) override
    {
        Guard(status, [&] {
            const QString parselet = Catalogue()->Require(ToQString(name), status::NotFound).name;
            const bool on = active != 0;
            Record([parselet, on](ConfigWriter &writer) { writer.SetParseletActive(parselet, on); });
        });
    }

    void ReindexParselets(cv::vekex::IContainer *names, std::int32_t *status) override
    {
        Guard(status, [&] {
            std::vector<QString> parselets;
            const auto catalogue = Catalogue();
            for (const QString &name : Texts(names))
                parselets.push_back(catalogue->Require(name, status::NotFound).name);
            Record([parselets](ConfigWriter &writer) {
                for (const QString &name : parselets)
                    writer.Request(QStringLiteral("reindex-parselet"), name);
            });
        });
    }

    void SetExtensionParselets(const WString &extension, cv::vekex::IContainer *names, std::int32_t *status) override
    {
        Guard(status, [&] {
            const QString key = Key(ToQString(extension));
            if (key.isEmpty() || key.startsWith(u'*') || key.startsWith(u'.'))
                Bad(status::InvalidArgument, QStringLiteral("\"%1\" is not an extension").arg(key));
            const auto catalogue = Catalogue();
            std::vector<QString> parselets;
            for (const QString &name : Texts(names)) {
                const ParseletInfo &parselet = catalogue->Require(name, status::NotFound);
                if (!parselet.Reads(key))
                    Bad(status::InvalidArgument, QStringLiteral("the Parselet %1 does not read *.%2").arg(parselet.name, key));
                if (std::find(parselets.begin(), parselets.end(), parselet.name) != parselets.end())
                    Bad(status::InvalidArgument, QStringLiteral("the Parselet %1 is named twice").arg(parselet.name));
                parselets.push_back(parselet.name);
            }
            Record([key, parselets](ConfigWriter &writer) { writer.SetExtensionParselets(key, parselets); });
        });
    }

private:
    // true for a search area (1, 0), false for an excluded folder (0, 1).
    static bool Kind(std::int32_t isArea, std::int32_t isExcluded)
    {
        if (isArea == 1 && isExcluded == 0)
            return true;
        if (isArea == 0 && isExcluded == 1)
            return false;
        Bad(status::InvalidArgument, QStringLiteral("a folder is either a search area (1, 0) or excluded (0, 1)"));
    }

    template <typename Edit>
    void RecordSettings(Edit edit)
    {
        Record([edit](ConfigWriter &writer) { writer.ChangeSettings(edit); });
    }

    // Inside a write transaction, with the connection locked.
    void ApplyAll()
    {
        ConfigWriter writer(*m_db, m_context->CatalogueSource());
        for (const Change &change : m_changes)
            change(writer);
        writer.Finish();
    }

    const std::shared_ptr<SorvikContext> m_context;
    const std::unique_ptr<Db> m_db;
    std::vector<Change> m_changes;
    std::shared_ptr<const Configuration> m_pendingState;
    std::size_t m_pendingChanges = 0;
};

std::shared_ptr<const Configuration> SorvikContext::ImportedConfiguration()
{
    std::lock_guard guard(m_importLock);
    return m_importer ? m_importer->PendingState() : nullptr;
}

class View final : public ref::RefObject<cv::rovo::IConfigurationView>
{
public:
    explicit View(std::shared_ptr<SorvikContext> context)
        : m_context(std::move(context)), m_db(OpenStore(m_context->storeFile, false))
    {
    }

    cv::vekex::IStringList *ListSearchAreas(std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::vekex::IStringList * {
            if (const auto imported = Imported())
                return Strings(imported->Answers().SearchAreas());
            std::lock_guard guard(m_db->Lock());
            Statement select(*m_db, "SELECT path FROM folders WHERE area_id IS NULL ORDER BY position, id");
            return Strings(select);
        });
    }

    cv::vekex::IStringList *ListExcludedFolders(const WString &areaPath, std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::vekex::IStringList * {
            if (areaPath.empty())
                return nullptr;
            if (const auto imported = Imported()) {
                const auto folders = imported->Answers().ExcludedFolders(LookupKey(areaPath));
                return folders ? Strings(*folders) : nullptr;
            }
            std::lock_guard guard(m_db->Lock());
            Transaction read(*m_db, Transaction::Kind::Read, status::StoreUnavailable);
            Statement area(*m_db, "SELECT id FROM folders WHERE path_key = ? AND area_id IS NULL");
            area.Bind(1, LookupKey(areaPath));
            if (!area.Step())
                return nullptr;
            Statement select(*m_db, "SELECT path FROM folders WHERE area_id = ? ORDER BY id");
            select.Bind(1, area.Int(0));
            return Strings(select);
        });
    }

    void GetSearchArea(const WString &path, WString *clientPath, WString *alias, std::int32_t flags,
                       std::int32_t *status) override
    {
        Guard(status, [&] {
            Required(clientPath, u"the client path out-argument");
            Required(alias, u"the alias out-argument");
            if (flags != 0)
                Bad(status::InvalidArgument, QStringLiteral("GetSearchArea takes the flags 0, not %1").arg(flags));
            if (const auto imported = Imported()) {
                const Folder *folder = imported->Answers().FindFolder(LookupKey(path));
                if (!folder)
                    Bad(status::NotFound,
                        QStringLiteral("%1 is neither a search area nor an excluded folder").arg(ToQString(path)));
                *clientPath = FromQString(folder->clientPath);
                *alias = FromQString(folder->alias);
                return;
            }
            std::lock_guard guard(m_db->Lock());
            Statement select(*m_db, "SELECT client_path, alias FROM folders WHERE path_key = ?");
            select.Bind(1, LookupKey(path));
            if (!select.Step())
                Bad(status::NotFound, QStringLiteral("%1 is neither a search area nor an excluded folder").arg(ToQString(path)));
            *clientPath = FromQString(select.Text(0));
            *alias = FromQString(select.Text(1));
        });
    }

    bool IsSearchArea(const WString &path, std::int32_t *status) override
    {
        return Guard(status, [&] {
            if (const auto imported = Imported())
                return !path.empty() && imported->Answers().IsSearchArea(LookupKey(path));
            return Exists(path, "SELECT 1 FROM folders WHERE path_key = ? AND area_id IS NULL");
        });
    }

    bool IsExcludedFolder(const WString &path, std::int32_t *status) override
    {
        return Guard(status, [&] {
            if (const auto imported = Imported())
                return !path.empty() && imported->Answers().IsExcludedFolder(LookupKey(path));
            return Exists(path, "SELECT 1 FROM folders WHERE path_key = ? AND area_id IS NOT NULL");
        });
    }

    void ImportConfiguration(const WString &file, cv::rovo::IConfigurationEditor *editor, std::int32_t *status) override
    {
        Guard(status, [&] {
            Editor &target = OwnEditor(Required(editor, u"the editor"));
            Configuration configuration = ReadConfigurationFile(ToQString(file), *m_context->Catalogue());
            target.RecordImport([configuration](ConfigWriter &writer) { writer.Replace(configuration); });
        });
    }

    void ExportConfiguration(const WString &file, cv::rovo::IConfigurationEditor *editor, std::int32_t *status) override
    {
        Guard(status, [&] {
            Configuration configuration;
            if (editor) {
                configuration = OwnEditor(*editor).State();
            } else {
                std::lock_guard guard(m_db->Lock());
                Transaction read(*m_db, Transaction::Kind::Read, status::StoreUnavailable);
                configuration = ReadConfiguration(*m_db);
            }
            WriteConfigurationFile(ToQString(file), configuration);
        });
    }

    std::int32_t GetChangeTrigger(std::int32_t *status) override
    {
        return Guard(status, [&] { return Current().changeTrigger; });
    }

    std::uint32_t GetFileTimeout(std::int32_t *status) override
    {
        return Guard(status, [&] { return Current().fileTimeout; });
    }

    std::uint32_t GetIdleTime(std::int32_t *status) override
    {
        return Guard(status, [&] { return Current().idleTime; });
    }

    void GetSchedule(std::int32_t *kind, cv::rovo::CalendarTime *when, std::int32_t *status) override
    {
        Guard(status, [&] {
            Required(kind, u"the kind out-argument");
            Required(when, u"the time out-argument");
            const Settings settings = Current();
            *kind = settings.scheduleKind;
            *when = settings.scheduleTime;
        });
    }

    void GetTimeouts(std::uint32_t *browseSeconds, std::uint32_t *querySeconds, std::int32_t *status) override
    {
        Guard(status, [&] {
            Required(browseSeconds, u"the browse time-out out-argument");
            Required(querySeconds, u"the query time-out out-argument");
            const Settings settings = Current();
            *browseSeconds = settings.browseTimeout;
            *querySeconds = settings.queryTimeout;
        });
    }

    void GetIndexPath(WString *path, std::int32_t *status) override
    {
        Guard(status, [&] { Required(path, u"the path out-argument") = FromQString(Current().indexPath); });
    }

    std::int32_t IsParseletActive(const WString &name, std::int32_t *status) override
    {
        return Guard(status, [&]() -> std::int32_t {
            const ParseletInfo &parselet = m_context->Catalogue()->Require(ToQString(name), status::NotFound);
            if (const auto imported = Imported())
                return imported->Answers().IsActive(parselet) ? 1 : 0;
            std::lock_guard guard(m_db->Lock());
            return Active(parselet) ? 1 : 0;
        });
    }

    cv::vekex::IStringList *GetExtensionParselets(const WString &extension, std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::vekex::IStringList * {
            const QString key = Key(ToQString(extension));
            if (const auto imported = Imported())
                return Strings(imported->Answers().ExtensionParselets(key));
            const auto catalogue = m_context->Catalogue();
            std::lock_guard guard(m_db->Lock());
            Transaction read(*m_db, Transaction::Kind::Read, status::StoreUnavailable);
            std::vector<QString> explicitOrder;
            Statement select(*m_db, "SELECT parselet FROM extension_priorities WHERE extension = ? ORDER BY rank");
            select.Bind(1, key);
            while (select.Step())
                explicitOrder.push_back(select.Text(0));
            std::vector<WString> names;
            for (const ParseletInfo *parselet : ExtensionParselets(*catalogue, key, explicitOrder,
                                                                   [this](const ParseletInfo &p) { return Active(p); }))
                names.push_back(FromQString(parselet->name));
            return new ref::StringList(std::move(names));
        });
    }

private:
    static QString LookupKey(const WString &path)
    {
        QString text = ToQString(path);
        if (text.size() >= 2 && (text.endsWith(u'\\') || text.endsWith(u'/')))
            text.chop(1);
        return Key(text);
    }

    static cv::vekex::IStringList *Strings(Statement &select)
    {
        std::vector<WString> items;
        while (select.Step())
            items.push_back(FromQString(select.Text(0)));
        return new ref::StringList(std::move(items));
    }

    bool Exists(const WString &path, const char *sql)
    {
        if (path.empty())
            return false;
        std::lock_guard guard(m_db->Lock());
        Statement select(*m_db, sql);
        select.Bind(1, LookupKey(path));
        return select.Step();
    }

    Settings Current()
    {
        if (const auto imported = Imported())
            return imported->Answers().CurrentSettings();
        std::lock_guard guard(m_db->Lock());
        return ReadSettings(*m_db);
    }

    // What an import waiting in an editor of this Sorvik holds.
    struct ImportedState
    {
        std::shared_ptr<const Configuration> configuration;
        std::shared_ptr<const CatalogueInfo> catalogue;
        ConfigAnswers Answers() const { return ConfigAnswers(*configuration, *catalogue); }
    };
    std::optional<ImportedState> Imported()
    {
        std::shared_ptr<const Configuration> configuration = m_context->ImportedConfiguration();
        if (!configuration)
            return std::nullopt;
        return ImportedState{std::move(configuration), m_context->Catalogue()};
    }

    static cv::vekex::IStringList *Strings(const std::vector<QString> &texts)
    {
        std::vector<WString> items;
        for (const QString &text : texts)
            items.push_back(FromQString(text));
        return new ref::StringList(std::move(items));
    }

    // With the connection locked.
    bool Active(const ParseletInfo &parselet)
    {
        Statement select(*m_db, "SELECT active FROM parselets WHERE name_key = ?");
        select.Bind(1, Key(parselet.name));
        return select.Step() ? select.Int(0) != 0 : parselet.ActiveByDefault();
    }

    Editor &OwnEditor(cv::rovo::IConfigurationEditor &editor)
    {
        auto *own = dynamic_cast<Editor *>(&editor);
        if (!own || own->Context()->storeFile != m_context->storeFile)
            Bad(status::InvalidArgument, QStringLiteral("the editor does not belong to this Sorvik"));
        return *own;
    }

    const std::shared_ptr<SorvikContext> m_context;
    const std::unique_ptr<Db> m_db;
};

class Sorvik final : public ref::RefObject<cv::rovo::ISorvik>
{
public:
    Sorvik(std::shared_ptr<SorvikContext> context, std::unique_ptr<Db> db)
        : m_context(std::move(context)), m_db(std::move(db))
    {
    }

    WString GetSorvikName(std::int32_t *) override { return FromQString(m_context->connection.SorvikName()); }

    cv::rovo::IConfigurationView *GetConfigurationView(std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::rovo::IConfigurationView * { return new View(m_context); });
    }

    cv::rovo::IConfigurationEditor *GetConfigurationEditor(std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::rovo::IConfigurationEditor * { return new Editor(m_context); });
    }

    cv::rovo::IIndexManager *GetIndexManager(std::int32_t *status) override
    {
        return Guard(status, [&] { return OpenIndexManager(m_context->connection, m_context->storeFile); });
    }

    void ResetSorvik(std::int32_t mode, std::int32_t flags, std::int32_t *status) override
    {
        Guard(status, [&] {
            if (mode != cv::rovo::kResetIndexAndConfiguration && mode != cv::rovo::kResetIndex)
                Bad(status::InvalidArgument, QStringLiteral("the reset mode %1 is neither 3 nor 4").arg(mode));
            if (flags != 0)
                Bad(status::InvalidArgument, QStringLiteral("ResetSorvik takes the flags 0, not %1").arg(flags));
            std::lock_guard guard(m_db->Lock());
            m_db->SetBusyTimeout(CommitTimeoutMilliseconds());
            Transaction transaction(*m_db, Transaction::Kind::Write, status::UpdateTimedOut);
            if (mode == cv::rovo::kResetIndexAndConfiguration)
                ResetConfiguration(*m_db);
            m_db->Exec("UPDATE meta SET value = CAST(value AS INTEGER) + 1 WHERE name = 'index_generation'");
            AddRequest(*m_db, QStringLiteral("reset-index"), QString::number(mode));
            const std::int64_t generation = AdvanceConfigGeneration(*m_db);
            transaction.Commit();
            AnnounceCommit(m_context->storeFile, generation);
        });
    }

private:
    const std::shared_ptr<SorvikContext> m_context;
    const std::unique_ptr<Db> m_db;
};

class Environment final : public ref::RefObject<cv::rovo::IRovoEnvironment>
{
public:
    explicit Environment(RefPtr<cv::vekex::IEnvironment> dataStore) : m_dataStore(std::move(dataStore)) {}

    cv::rovo::ISorvik *OpenSorvik(const WString &connectionText, std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::rovo::ISorvik * {
            Connection connection = ParseConnection(ToQString(connectionText));
            const QString file = StoreFile(connection.SorvikName());
            StartState &started = Started();
            bool verify = true;
            {
                std::lock_guard guard(started.lock);
                verify = !(started.uses > 0 && started.verified.contains(file));
            }
            std::unique_ptr<Db> db = OpenStore(file, verify);
            {
                std::lock_guard guard(started.lock);
                if (started.uses > 0)
                    started.verified.insert(file);
            }
            auto context = std::make_shared<SorvikContext>(std::move(connection), file, m_dataStore);
            return new Sorvik(std::move(context), std::move(db));
        });
    }

private:
    const RefPtr<cv::vekex::IEnvironment> m_dataStore;
};

} // namespace

cv::rovo::IRovoEnvironment *NewEnvironment(cv::vekex::IEnvironment *dataStore)
{
    if (!dataStore)
        ref::Fail(status::InvalidArgument, u"rovoCreateEnvironment needs a data-store environment");
    return new Environment(RefPtr<cv::vekex::IEnvironment>::Share(dataStore));
}

void TakeUse()
{
    std::lock_guard guard(Started().lock);
    ++Started().uses;
}

void ReleaseUse()
{
    StartState &started = Started();
    std::lock_guard guard(started.lock);
    if (started.uses > 0 && --started.uses == 0)
        started.verified.clear();
}

} // namespace sorvik::rovo
