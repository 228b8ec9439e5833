// The server API library over its store: what the editor records reaches the
// view only through a whole commit, and import, export and reset keep the
// store whole.

#include "tests/reference/rovofixture.h"

#include <sqlite3.h>

#include <fstream>

namespace {

using namespace reftest;
namespace status = cv::rovo::status;

using Store = RovoTest;

// A second connection to the store file, as another process would have.
class RawStore
{
public:
    explicit RawStore(const std::string &file) { EXPECT_EQ(sqlite3_open(file.c_str(), &m_db), SQLITE_OK); }
    ~RawStore() { sqlite3_close(m_db); }
    void Exec(const char *sql) { EXPECT_EQ(sqlite3_exec(m_db, sql, nullptr, nullptr, nullptr), SQLITE_OK) << sql; }
    // Each row's columns joined by "|".
    std::vector<std::string> Rows(const char *sql)
    {
        std::vector<std::string> rows;
        sqlite3_stmt *query = nullptr;
        EXPECT_EQ(sqlite3_prepare_v2(m_db, sql, -1, &query, nullptr), SQLITE_OK) << sql;
        while (query && sqlite3_step(query) == SQLITE_ROW) {
            std::string row;
            for (int column = 0; column < sqlite3_column_count(query); ++column) {
                const auto *text = reinterpret_cast<const char *>(sqlite3_column_text(query, column));
                row += (column ? "|" : "") + std::string(text ? text : "");
            }
            rows.push_back(row);
        }
        sqlite3_finalize(query);
        return rows;
    }

private:
    sqlite3 *m_db = nullptr;
};

std::uint32_t IdleTime(cv::rovo::IConfigurationView *view)
{
    return Ok([&](std::int32_t *status) { return view->GetIdleTime(status); });
}

TEST_F(Store, ANewStoreHasDefaultsAndNoSearchAreas)
{
    auto view = View();
    EXPECT_TRUE(Areas(view.get()).empty());
    std::uint32_t browse = 1, query = 1;
    OkVoid([&](std::int32_t *status) { view->GetTimeouts(&browse, &query, status); });
    EXPECT_EQ(browse + query, 0u) << "unset time-outs read as 0";
    EXPECT_EQ(Ok([&](std::int32_t *status) { return view->GetFileTimeout(status); }), 60000u);
    WString index;
    OkVoid([&](std::int32_t *status) { view->GetIndexPath(&index, status); });
    EXPECT_EQ(Utf8(index), File("local-index"));
    EXPECT_EQ(Utf8(Ok([&](std::int32_t *status) { return m_sorvik->GetSorvikName(status); })), "");
    EXPECT_EQ(Ok([&](std::int32_t *status) { return m_sorvik->GetIndexManager(status); }), nullptr);
    EXPECT_EQ(Ok([&](std::int32_t *status) { return view->ListExcludedFolders(WString(u"/nowhere"), status); }),
              nullptr);
}

TEST_F(Store, TheViewSeesOnlyWhatIsCommitted)
{
    auto view = View();
    {
        auto editor = Editor();
        AddArea(editor.get(), u"/data/projects/", u"Projects");
        AddExcluded(editor.get(), u"/data/projects/tmp", u"tmp");
        OkVoid([&](std::int32_t *status) { editor->SetIdleTime(300, status); });
        EXPECT_TRUE(Areas(view.get()).empty());
        // Released without a commit: nothing happened.
    }
    EXPECT_TRUE(Areas(view.get()).empty());
    EXPECT_EQ(IdleTime(view.get()), 60u);

    auto editor = Editor();
    AddArea(editor.get(), u"/data/projects/", u"Projects");
    AddExcluded(editor.get(), u"/data/projects/tmp", u"tmp");
    AddArea(editor.get(), u"/data/archive", u"Archive");
    OkVoid([&](std::int32_t *status) { editor->SetIdleTime(300, status); });
    OkVoid([&](std::int32_t *status) {
        editor->SetSchedule(cv::rovo::kScheduleWeekly, {1977, 9, 14, 2, 30, 0}, status);
    });
    Commit(editor.get());
    EXPECT_EQ(Areas(view.get()), (std::vector<std::string>{"/data/projects|/data/projects|Projects",
                                                           "  /data/projects/tmp", "/data/archive|/data/archive|Archive"}));
    EXPECT_EQ(IdleTime(view.get()), 300u);
    std::int32_t kind = 0;
    cv::rovo::CalendarTime when{};
    OkVoid([&](std::int32_t *status) { view->GetSchedule(&kind, &when, status); });
    EXPECT_EQ(kind, cv::rovo::kScheduleWeekly);
    EXPECT_EQ(when.year * 10000 + when.month * 100 + when.day, 19770914);
    EXPECT_EQ(when.hour * 100 + when.minute, 230);
    EXPECT_TRUE(Ok([&](std::int32_t *status) { return view->IsExcludedFolder(WString(u"/DATA/Projects/Tmp/"), status); }))
        << "paths compare without regard to case and a trailing separator";

    // The commit is done once: committing again applies nothing twice.
    Commit(editor.get());
    EXPECT_EQ(Areas(view.get()).size(), 3u);
}

TEST_F(Store, ACommitThatFailsPartWayLeavesTheStoreAsItWas)
{
    auto first = Editor();
    AddArea(first.get(), u"/data/a", u"Alpha");
    Commit(first.get());
    const auto before = Areas();

    auto editor = Editor();
    OkVoid([&](std::int32_t *status) { editor->SetIdleTime(900, status); });
    AddArea(editor.get(), u"/data/b", u"Beta");
    OkVoid([&](std::int32_t *status) { editor->RemoveFolder(WString(u"/data/a"), 1, status); });
    AddArea(editor.get(), u"/data/c", u"beta"); // the alias is taken by the change before it
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { editor->CommitConfiguration(status); }), status::Conflict);
    EXPECT_NE(LastError().find("beta"), std::string::npos) << LastError();

    auto view = View();
    EXPECT_EQ(Areas(view.get()), before);
    EXPECT_EQ(IdleTime(view.get()), 60u);

    // A search area inside another is refused when the commit is complete, not per change.
    auto nested = Editor();
    AddArea(nested.get(), u"/data", u"Everything");
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { nested->CommitConfiguration(status); }), status::Conflict);
    OkVoid([&](std::int32_t *status) { nested->RemoveFolder(WString(u"/data/a"), 1, status); });
    Commit(nested.get());
    EXPECT_EQ(Areas(), (std::vector<std::string>{"/data|/data|Everything"}));
}

TEST_F(Store, ASearchAreaAbsorbsTheAreasInsideIt)
{
    auto editor = Editor();
    AddArea(editor.get(), u"D:\\Data\\A", u"A");
    AddExcluded(editor.get(), u"D:\\Data\\A\\tmp", u"tmp");
    AddArea(editor.get(), u"D:\\Data\\B", u"B");
    Commit(editor.get());

    // The order in which the add operations record the merge.
    auto merge = Editor();
    AddArea(merge.get(), u"D:\\Data\\", u"Data");
    OkVoid([&](std::int32_t *status) { merge->RemoveFolder(WString(u"D:\\Data\\A"), 1, status); });
    AddExcluded(merge.get(), u"D:\\Data\\A\\tmp", u"A\\tmp");
    OkVoid([&](std::int32_t *status) { merge->RemoveFolder(WString(u"D:\\Data\\B"), 1, status); });
    Commit(merge.get());
    EXPECT_EQ(Areas(), (std::vector<std::string>{"D:\\Data|D:\\Data|Data", "  D:\\Data\\A\\tmp"}));

    // Moving an area moves its excluded folders one by one.
    auto move = Editor();
    OkVoid([&](std::int32_t *status) {
        move->MoveFolder(WString(u"D:\\Data"), WString(u"E:\\Data"), WString(u"E:\\Data"), status);
    });
    OkVoid([&](std::int32_t *status) {
        move->MoveFolder(WString(u"D:\\Data\\A\\tmp"), WString(), WString(u"E:\\Data\\A\\tmp"), status);
    });
    OkVoid([&](std::int32_t *status) {
        move->UpdateFolder(WString(u"E:\\Data"), WString(u"E:\\Data"), WString(u"Moved"), 1, 0, status);
    });
    Commit(move.get());
    EXPECT_EQ(Areas(), (std::vector<std::string>{"E:\\Data|E:\\Data|Moved", "  E:\\Data\\A\\tmp"}));
}

TEST_F(Store, OrderAndRecordTimeChecks)
{
    auto editor = Editor();
    AddArea(editor.get(), u"/a", u"A");
    AddArea(editor.get(), u"/b", u"B");
    AddArea(editor.get(), u"/c", u"C");
    auto order = Container({u"/c", u"/a"});
    OkVoid([&](std::int32_t *status) { editor->SetSearchAreaOrder(order.get(), status); });
    Commit(editor.get());
    EXPECT_EQ(Areas(), (std::vector<std::string>{"/c|/c|C", "/a|/a|A", "/b|/b|B"}));

    // Wrong arguments fail at once and are not recorded.
    WString result;
    EXPECT_EQ(StatusOf([&](std::int32_t *status) {
                  editor->AddFolder(&result, WString(u"/d"), WString(), WString(u"D"), 1, 1, WString(), status);
              }),
              status::InvalidArgument);
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { editor->SetFileTimeout(4999, status); }), status::InvalidArgument);
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { editor->SetIdleTime(10000, status); }), status::InvalidArgument);
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { editor->SetSchedule(2, {2005, 2, 30, 0, 0, 0}, status); }),
              status::InvalidArgument);
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { editor->SetBrowseTimeout(2, status); }), status::InvalidArgument);
    Commit(editor.get());
    EXPECT_EQ(Areas().size(), 3u);

    // Changes that contradict the store fail at the commit.
    auto unknown = Editor();
    OkVoid([&](std::int32_t *status) { unknown->RemoveFolder(WString(u"/nowhere"), 1, status); });
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { unknown->CommitConfiguration(status); }), status::NotFound);
}

TEST_F(Store, NestingIsFoundAmongManyAreasAndExclusionsGoToTheInnermostArea)
{
    auto editor = Editor();
    for (int i = 0; i < 300; ++i)
        AddArea(editor.get(), (u"/many/" + std::u16string(1, char16_t(u'a' + i % 26)) + U16(std::to_string(i))).c_str(),
                (u"M" + U16(std::to_string(i))).c_str());
    AddArea(editor.get(), u"/x/a", u"A");
    AddArea(editor.get(), u"/x/ab", u"AB"); // a sibling whose name starts like /x/a
    AddArea(editor.get(), u"D:\\Data", u"Data");
    Commit(editor.get());

    for (const char16_t *nested : {u"/x/a/b", u"D:\\DATA\\sub", u"/many/c2/deep"}) {
        auto more = Editor();
        AddArea(more.get(), nested, u"Nested");
        EXPECT_EQ(StatusOf([&](std::int32_t *status) { more->CommitConfiguration(status); }), status::Conflict)
            << Utf8(WString(nested));
    }

    // While a merge is recorded, an exclusion belongs to the innermost area.
    auto merge = Editor();
    AddArea(merge.get(), u"/x", u"X");
    AddExcluded(merge.get(), u"/x/a/tmp", u"tmp");
    OkVoid([&](std::int32_t *status) { merge->RemoveFolder(WString(u"/x/a"), 1, status); });
    OkVoid([&](std::int32_t *status) { merge->RemoveFolder(WString(u"/x/ab"), 1, status); });
    Commit(merge.get());
    EXPECT_EQ(Areas().back(), "/x|/x|X") << "the exclusion went with /x/a";
    AddExcluded(merge.get(), u"/x/keep", u"keep");
    Commit(merge.get());
    EXPECT_EQ(Areas().back(), "  /x/keep");
}

TEST_F(Store, ParseletsDefaultFromTheCatalogueUntilSet)
{
    auto view = View();
    auto active = [&](const char16_t *name) {
        return Ok([&](std::int32_t *status) { return view->IsParseletActive(WString(name), status); });
    };
    auto readers = [&](const char16_t *extension) {
        auto list = RefPtr<cv::vekex::IStringList>::Adopt(
            Ok([&](std::int32_t *status) { return view->GetExtensionParselets(WString(extension), status); }));
        std::vector<std::string> names;
        for (std::uint32_t i = 0; i < list->GetCount(); ++i)
            names.push_back(Utf8(list->GetElements()[i]));
        return names;
    };
    EXPECT_EQ(active(u"CSV"), 1);
    EXPECT_EQ(active(u"MatrixStore"), 0) << "without import support";
    EXPECT_EQ(active(u"IndexJournal"), 0) << "a system store type";
    EXPECT_EQ(readers(u"txt"), (std::vector<std::string>{"CSV", "TextTable"}));
    EXPECT_TRUE(readers(u"mat").empty());
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { return view->IsParseletActive(WString(u"Nope"), status); }),
              status::NotFound);

    auto editor = Editor();
    auto order = Container({u"texttable", u"CSV"});
    OkVoid([&](std::int32_t *status) { editor->SetExtensionParselets(WString(u"TXT"), order.get(), status); });
    OkVoid([&](std::int32_t *status) { editor->SetParseletActive(WString(u"MatrixStore"), 1, status); });
    auto names = Container({u"qdm"});
    OkVoid([&](std::int32_t *status) { editor->ReindexParselets(names.get(), status); });
    auto wrong = Container({u"WaveAudio"});
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { editor->SetExtensionParselets(WString(u"txt"), wrong.get(), status); }),
              status::InvalidArgument);
    Commit(editor.get());
    EXPECT_EQ(readers(u"txt"), (std::vector<std::string>{"TextTable", "CSV"}));
    EXPECT_EQ(readers(u"mat"), (std::vector<std::string>{"MatrixStore"}));

    auto off = Editor();
    OkVoid([&](std::int32_t *status) { off->SetParseletActive(WString(u"TextTable"), 0, status); });
    Commit(off.get());
    EXPECT_EQ(readers(u"txt"), (std::vector<std::string>{"CSV"}));
}

TEST_F(Store, ThePolicyInTheStoreForbidsSearchAreas)
{
    RawStore(StoreFile()).Exec("INSERT INTO area_policy(prefix) VALUES ('/etc'), ('C:\\Windows')");
    auto editor = Editor();
    auto allowed = [&](const char16_t *path, std::int32_t isArea) {
        return Ok([&](std::int32_t *status) {
            return editor->CheckAreaAllowed(WString(path), WString(path), WString(u"x"), isArea, 1 - isArea, status);
        });
    };
    EXPECT_EQ(allowed(u"/etc/ssl", 1), cv::rovo::kAreaNotAllowed);
    EXPECT_EQ(allowed(u"c:\\windows\\temp", 1), cv::rovo::kAreaNotAllowed);
    EXPECT_EQ(allowed(u"/etcetera", 1), cv::rovo::kAreaAllowed);
    EXPECT_EQ(allowed(u"/etc/ssl", 0), cv::rovo::kAreaAllowed) << "excluding is always allowed";

    // The commit holds to the policy too.
    AddArea(editor.get(), u"/etc", u"Config");
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { editor->CommitConfiguration(status); }), status::NotAllowed);
    EXPECT_TRUE(Areas().empty());
}

TEST_F(Store, ACommitWaitsForAnotherWriterThenTimesOut)
{
    testsupport::ScopedEnv timeout("CORVANE_SORVIK_COMMIT_TIMEOUT_MS", "50");
    auto editor = Editor();
    AddArea(editor.get(), u"/data", u"Data");
    {
        RawStore other(StoreFile());
        other.Exec("BEGIN IMMEDIATE");
        EXPECT_EQ(StatusOf([&](std::int32_t *status) { editor->CommitConfiguration(status); }), status::UpdateTimedOut);
        other.Exec("ROLLBACK");
    }
    // The recorded change survived the time-out and goes through now.
    Commit(editor.get());
    EXPECT_EQ(Areas().size(), 1u);
}

TEST_F(Store, ExportThenImportReproducesTheConfiguration)
{
    auto editor = Editor();
    AddArea(editor.get(), u"/data/one", u"One & <Two>");
    AddExcluded(editor.get(), u"/data/one/cache", u"cache");
    AddArea(editor.get(), u"/data/three", u"Three");
    OkVoid([&](std::int32_t *status) { editor->SetFileTimeout(120000, status); });
    OkVoid([&](std::int32_t *status) { editor->SetSearchQueryTimeout(45, status); });
    OkVoid([&](std::int32_t *status) { editor->SetIndexPath(WString(u"/var/index/"), status); });
    OkVoid([&](std::int32_t *status) { editor->SetParseletActive(WString(u"HDF5"), 0, status); });
    auto order = Container({u"TextTable", u"CSV"});
    OkVoid([&](std::int32_t *status) { editor->SetExtensionParselets(WString(u"txt"), order.get(), status); });
    Commit(editor.get());

    const std::string exported = File("exported.skc");
    auto view = View();
    OkVoid([&](std::int32_t *status) { view->ExportConfiguration(WString(U16(exported)), editor.get(), status); });

    // Into another Sorvik: its store has nothing before the commit.
    const char16_t *lab = u"<Name>Lab Server</Name><SorvikType>valdorn</SorvikType>";
    auto other = Open(lab);
    EXPECT_EQ(Utf8(Ok([&](std::int32_t *status) { return other->GetSorvikName(status); })), "Lab Server");
    auto otherView = View(other.get());
    auto otherEditor = Editor(other.get());
    OkVoid([&](std::int32_t *status) {
        otherView->ImportConfiguration(WString(U16(exported)), otherEditor.get(), status);
    });
    auto elsewhere = Open(lab);
    EXPECT_TRUE(Areas(View(elsewhere.get()).get()).empty());
    Commit(otherEditor.get());
    EXPECT_EQ(Areas(otherView.get()), Areas(view.get()));
    EXPECT_EQ(Areas(View(elsewhere.get()).get()), Areas(view.get()));

    const std::string again = File("again.skc");
    OkVoid([&](std::int32_t *status) { otherView->ExportConfiguration(WString(U16(again)), nullptr, status); });
    EXPECT_EQ(Slurp(again), Slurp(exported));
}

TEST_F(Store, ViewsOfTheImportingSorvikShowTheImportUntilItIsCommittedOrDropped)
{
    auto editor = Editor();
    AddArea(editor.get(), u"/data/old", u"Old");
    Commit(editor.get());
    AddArea(editor.get(), u"/data/new", u"New");
    AddExcluded(editor.get(), u"/data/new/tmp", u"tmp");
    OkVoid([&](std::int32_t *status) { editor->SetIdleTime(77, status); });
    const std::string file = File("new.skc");
    auto view = View();
    OkVoid([&](std::int32_t *status) { view->ExportConfiguration(WString(U16(file)), editor.get(), status); });
    editor.Reset();

    // A properties dialog reloads its pages from the view after an import.
    auto importing = Editor();
    EXPECT_EQ(Areas(view.get()), std::vector<std::string>{"/data/old|/data/old|Old"}) << "before the import: the store";
    OkVoid([&](std::int32_t *status) { view->ImportConfiguration(WString(U16(file)), importing.get(), status); });
    auto otherView = View();
    for (auto *shown : {view.get(), otherView.get()}) {
        EXPECT_EQ(Areas(shown), (std::vector<std::string>{"/data/old|/data/old|Old", "/data/new|/data/new|New", "  /data/new/tmp"}));
        EXPECT_EQ(Ok([&](std::int32_t *status) { return shown->GetIdleTime(status); }), 77u);
        EXPECT_TRUE(Ok([&](std::int32_t *status) { return shown->IsExcludedFolder(WString(u"/data/new/tmp/"), status); }));
    }
    AddArea(importing.get(), u"/data/later", u"Later");
    EXPECT_EQ(Areas(view.get()).back(), "/data/later|/data/later|Later") << "with what is recorded after the import";
    auto elsewhere = Open();
    EXPECT_EQ(Areas(View(elsewhere.get()).get()).size(), 1u) << "another Sorvik object sees only the store";

    importing.Reset();
    EXPECT_EQ(Areas(view.get()).size(), 1u) << "an import dropped with its editor is gone";

    importing = Editor();
    OkVoid([&](std::int32_t *status) { view->ImportConfiguration(WString(U16(file)), importing.get(), status); });
    Commit(importing.get());
    EXPECT_EQ(Areas(View(elsewhere.get()).get()).size(), 3u);
    EXPECT_EQ(Areas(view.get()).size(), 3u) << "committed: the store again";
}

TEST_F(Store, AnImportReplacesTheWholeConfigurationButKeepsPolicyAndPendingRequests)
{
    // What the file brings, written from another Sorvik.
    auto lab = Open(u"<Name>Lab</Name>");
    auto labEditor = Editor(lab.get());
    AddArea(labEditor.get(), u"/new/data", u"New");
    OkVoid([&](std::int32_t *status) { labEditor->SetIdleTime(45, status); });
    Commit(labEditor.get());
    const std::string file = File("lab.skc");
    OkVoid([&](std::int32_t *status) { View(lab.get())->ExportConfiguration(WString(U16(file)), nullptr, status); });

    // A store that already holds areas, settings, Parselet choices, a policy
    // and a request the server has not taken yet.
    auto editor = Editor();
    AddArea(editor.get(), u"/old/one", u"One");
    AddExcluded(editor.get(), u"/old/one/tmp", u"tmp");
    AddArea(editor.get(), u"/old/two", u"Two");
    OkVoid([&](std::int32_t *status) { editor->SetIdleTime(300, status); });
    OkVoid([&](std::int32_t *status) { editor->SetSearchQueryTimeout(45, status); });
    OkVoid([&](std::int32_t *status) { editor->SetParseletActive(WString(u"CSV"), 0, status); });
    auto order = Container({u"CSV", u"TextTable"});
    OkVoid([&](std::int32_t *status) { editor->SetExtensionParselets(WString(u"txt"), order.get(), status); });
    OkVoid([&](std::int32_t *status) { editor->StartIndexingNow(0, status); });
    Commit(editor.get());
    RawStore raw(StoreFile());
    raw.Exec("INSERT INTO area_policy(prefix) VALUES ('/etc')");

    auto view = View();
    OkVoid([&](std::int32_t *status) { view->ImportConfiguration(WString(U16(file)), editor.get(), status); });
    Commit(editor.get());

    EXPECT_EQ(Areas(view.get()), (std::vector<std::string>{"/new/data|/new/data|New"}));
    EXPECT_EQ(IdleTime(view.get()), 45u);
    std::uint32_t browse = 1, query = 1;
    OkVoid([&](std::int32_t *status) { view->GetTimeouts(&browse, &query, status); });
    EXPECT_EQ(query, 0u);
    EXPECT_TRUE(raw.Rows("SELECT * FROM parselets").empty()) << "the file chose no Parselets";
    EXPECT_TRUE(raw.Rows("SELECT * FROM extension_priorities").empty());
    EXPECT_EQ(raw.Rows("SELECT prefix FROM area_policy"), std::vector<std::string>{"/etc"});
    EXPECT_EQ(raw.Rows("SELECT kind, argument FROM requests"), std::vector<std::string>{"start-indexing|0"});
}

TEST_F(Store, ACommitLeavesWorkOrdersForTheServerAndAFailedOneLeavesNone)
{
    RawStore raw(StoreFile());
    auto requests = [&] { return raw.Rows("SELECT kind, argument FROM requests ORDER BY id"); };
    auto editor = Editor();
    OkVoid([&](std::int32_t *status) { editor->StartIndexingNow(0, status); });
    OkVoid([&](std::int32_t *status) { editor->SetIndexPath(WString(u"/var/index/"), status); });
    auto names = Container({u"CSV", u"hdf5"});
    OkVoid([&](std::int32_t *status) { editor->ReindexParselets(names.get(), status); });
    EXPECT_TRUE(requests().empty()) << "nothing before the commit";
    Commit(editor.get());
    EXPECT_EQ(requests(), (std::vector<std::string>{"start-indexing|0", "move-index|/var/index", "reindex-parselet|CSV",
                                                    "reindex-parselet|HDF5"}));

    // The same index folder again moves nothing.
    OkVoid([&](std::int32_t *status) { editor->SetIndexPath(WString(u"/VAR/index"), status); });
    Commit(editor.get());
    EXPECT_EQ(requests().size(), 4u);

    // A commit that fails leaves none of its orders.
    AddArea(editor.get(), u"/a", u"Same");
    AddArea(editor.get(), u"/b", u"same");
    OkVoid([&](std::int32_t *status) { editor->StartIndexingNow(0, status); });
    OkVoid([&](std::int32_t *status) { editor->SetIndexPath(WString(u"/elsewhere"), status); });
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { editor->CommitConfiguration(status); }), status::Conflict);
    EXPECT_EQ(requests().size(), 4u);

    OkVoid([&](std::int32_t *status) { m_sorvik->ResetSorvik(cv::rovo::kResetIndex, 0, status); });
    EXPECT_EQ(requests().back(), "reset-index|4");
}

TEST_F(Store, AnExportCarriesUncommittedEditsWithoutCommittingThem)
{
    auto editor = Editor();
    AddArea(editor.get(), u"/pending", u"Pending");
    const std::string file = File("pending.skc");
    auto view = View();
    OkVoid([&](std::int32_t *status) { view->ExportConfiguration(WString(U16(file)), editor.get(), status); });
    EXPECT_NE(Slurp(file).find("alias=\"Pending\""), std::string::npos);
    EXPECT_TRUE(Areas(view.get()).empty());
    Commit(editor.get());
    EXPECT_EQ(Areas(view.get()).size(), 1u);
}

TEST_F(Store, BrokenConfigurationFilesAreRefusedAndChangeNothing)
{
    auto editor = Editor();
    AddArea(editor.get(), u"/kept", u"Kept");
    Commit(editor.get());
    const std::string good = File("good.skc");
    auto view = View();
    OkVoid([&](std::int32_t *status) { view->ExportConfiguration(WString(U16(good)), nullptr, status); });
    const std::string content = Slurp(good);

    const std::pair<const char *, std::string> broken[] = {
        {"truncated", content.substr(0, content.size() / 2)},
        {"empty", ""},
        {"not xml", "garbage"},
        {"nested areas", "<sorvikconfiguration format=\"1\"><searchareas>"
                         "<searcharea path=\"/a\" alias=\"A\"/><searcharea path=\"/a/b\" alias=\"B\"/></searchareas>"
                         "<indexer idletime=\"1\" filetimeout=\"60000\" changetrigger=\"1\" triggerscope=\"0\" "
                         "triggerevents=\"15\" schedulekind=\"2\" scheduletime=\"2005-06-27T02:00:00Z\"/>"
                         "<advanced browsetimeout=\"0\" querytimeout=\"0\" indexpath=\"/i\"/></sorvikconfiguration>"},
        {"bad value", std::string(content).replace(content.find("idletime=\"60\""), 13, "idletime=\"-1\"")},
        {"unknown parselet", std::string(content).replace(content.find("<parselets/>"), 12,
                                                          "<parselets><parselet name=\"Gone\" active=\"1\"/></parselets>")},
    };
    for (const auto &[name, text] : broken) {
        const std::string file = File("broken.skc");
        std::ofstream(file, std::ios::trunc | std::ios::binary) << text;
        EXPECT_EQ(StatusOf([&](std::int32_t *status) {
                      view->ImportConfiguration(WString(U16(file)), editor.get(), status);
                  }),
                  status::FileMalformed)
            << name;
    }
    EXPECT_EQ(StatusOf([&](std::int32_t *status) {
                  view->ImportConfiguration(WString(U16(File("missing.skc"))), editor.get(), status);
              }),
              status::FileUnreadable);
    // Nothing was recorded by the refused imports.
    Commit(editor.get());
    EXPECT_EQ(Areas(view.get()), (std::vector<std::string>{"/kept|/kept|Kept"}));
    // An unwritable target is reported.
    EXPECT_EQ(StatusOf([&](std::int32_t *status) {
                  view->ExportConfiguration(WString(U16(File("no/such/folder/x.skc"))), nullptr, status);
              }),
              status::FileWriteFailed);
}

TEST_F(Store, ResetThrowsAwayTheIndexAndOptionallyTheConfiguration)
{
    auto editor = Editor();
    AddArea(editor.get(), u"/data", u"Data");
    OkVoid([&](std::int32_t *status) { editor->SetIdleTime(5, status); });
    Commit(editor.get());

    OkVoid([&](std::int32_t *status) { m_sorvik->ResetSorvik(cv::rovo::kResetIndex, 0, status); });
    EXPECT_EQ(Areas().size(), 1u);
    OkVoid([&](std::int32_t *status) { m_sorvik->ResetSorvik(cv::rovo::kResetIndexAndConfiguration, 0, status); });
    auto view = View();
    EXPECT_TRUE(Areas(view.get()).empty());
    EXPECT_EQ(IdleTime(view.get()), 60u);
    EXPECT_EQ(StatusOf([&](std::int32_t *status) { m_sorvik->ResetSorvik(5, 0, status); }), status::InvalidArgument);
}

TEST_F(Store, ConnectionTextsNameSeparateStores)
{
    auto named = Open(u"<SorvikType>other</SorvikType>\n<PortName>Lab&amp;Test</PortName>");
    EXPECT_EQ(Utf8(Ok([&](std::int32_t *status) { return named->GetSorvikName(status); })), "Lab&Test");
    auto editor = Editor(named.get());
    AddArea(editor.get(), u"/lab", u"Lab");
    Commit(editor.get());
    EXPECT_TRUE(Areas().empty()) << "the local Sorvik keeps its own store";
    EXPECT_TRUE(std::filesystem::exists(StoreFile("sorvik-lab%26test.sorvikdb")));

    for (const char16_t *text : {u"<Name>unterminated", u"stray text", u"<Name>x</Other>"}) {
        EXPECT_EQ(StatusOf([&](std::int32_t *status) { return m_environment->OpenSorvik(WString(text), status); }),
                  status::InvalidConnection)
            << Utf8(WString(text));
    }
}

TEST_F(Store, ABrokenStoreIsRefusedAndLeftAsItIs)
{
    const std::string file = StoreFile("sorvik-broken.sorvikdb");
    const std::string garbage = "SQLite format 3" + std::string(200, '\x7f');
    std::ofstream(file, std::ios::binary) << garbage;
    EXPECT_EQ(StatusOf([&](std::int32_t *status) {
                  return m_environment->OpenSorvik(WString(u"<Name>broken</Name>"), status);
              }),
              status::StoreCorrupt);
    EXPECT_EQ(Slurp(file), garbage);

    // Another program's database is not taken over.
    const std::string foreign = StoreFile("sorvik-foreign.sorvikdb");
    RawStore(foreign).Exec("CREATE TABLE notes(text TEXT)");
    EXPECT_EQ(StatusOf([&](std::int32_t *status) {
                  return m_environment->OpenSorvik(WString(u"<Name>foreign</Name>"), status);
              }),
              status::StoreCorrupt);
    EXPECT_NE(LastError().find("not a Sorvik store"), std::string::npos) << LastError();
}

} // namespace
