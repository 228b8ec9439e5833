// The Search Areas page loading and filling its tree (Reload) with 1,000
// and 10,000 search areas of 10 excluded folders each, beside filling a
// bare QTreeWidget with the same items (text, icon, item data) from memory.
//
// The page reads from two views: an in-memory one, which shows what the
// page itself costs, and the reference library's over its SQLite store
// (seeded once), with a row that reads the store alone as the page's load
// does. The last row opens the whole properties dialog on that store, as
// ShowConfigurationDialog does, and closes it again.

#include "configdialog/rovoconfigdlg.h"
#include "pages/configuredlg.h"
#include "serverlibs/rovoapilibrary.h"
#include "serverlibs/searchareas.h"
#include "serverlibs/vekexlibrary.h"
#include "sharedsource/imageset.h"
#include "sorvik/wstringqt.h"

#include <QApplication>
#include <QTreeWidget>

#include <benchmark/benchmark.h>

#include <cstdlib>
#include <filesystem>
#include <map>
#include <memory>
#include <vector>

namespace {

namespace serverlibs = cv::vek::rovo::serverlibs;
using cv::krn::RefPtr;
using cv::krn::WString;

constexpr int kExcludedPerArea = 10;

struct Area
{
    WString path, clientPath, alias;
    std::vector<WString> excluded;
};

std::vector<Area> MakeAreas(int count)
{
    std::vector<Area> areas(std::size_t(count), Area{});
    for (int i = 0; i < count; ++i) {
        Area &area = areas[std::size_t(i)];
        const QString path = QStringLiteral("/srv/data/area%1").arg(i, 5, 10, QLatin1Char('0'));
        area.path = cv::krn::FromQString(path);
        area.clientPath = cv::krn::FromQString(QStringLiteral("/mnt/share/area%1").arg(i, 5, 10, QLatin1Char('0')));
        area.alias = cv::krn::FromQString(QStringLiteral("Area %1").arg(i));
        for (int j = kExcludedPerArea; j > 0; --j)
            area.excluded.push_back(cv::krn::FromQString(path + QStringLiteral("/Excluded %1/").arg(j)));
    }
    return areas;
}

RefPtr<cv::vekex::IContainer> Strings(const std::vector<WString> &texts)
{
    RefPtr<cv::vekex::IContainer> list = serverlibs::Vekex().CreateContainer();
    std::int32_t status = 0;
    list->AssignFromArray(texts.data(), std::uint32_t(texts.size()), &status);
    return list;
}

template <typename Interface>
class RefCounted : public Interface
{
public:
    std::uint32_t AddRef() override { return ++m_refs; }
    std::uint32_t Release() override
    {
        const std::uint32_t left = --m_refs;
        if (left == 0)
            delete this;
        return left;
    }

protected:
    virtual ~RefCounted() = default;

private:
    std::uint32_t m_refs = 1;
};

// A view that answers the page's three reads from memory.
class MemoryView final : public RefCounted<cv::rovo::IConfigurationView>
{
public:
    explicit MemoryView(const std::vector<Area> &areas)
    {
        std::vector<WString> paths;
        for (const Area &area : areas) {
            paths.push_back(area.path);
            m_byPath.emplace(area.path.view(), &area);
            m_excluded.emplace(area.path.view(), Strings(area.excluded));
        }
        m_paths = Strings(paths);
    }

    cv::vekex::IStringList *ListSearchAreas(std::int32_t *) override { return Shared(m_paths.get()); }
    cv::vekex::IStringList *ListExcludedFolders(const WString &areaPath, std::int32_t *) override
    {
        const auto found = m_excluded.find(areaPath.view());
        return found == m_excluded.end() ? nullptr : Shared(found->second.get());
    }
    void GetSearchArea(const WString &path, WString *clientPath, WString *alias, std::int32_t,
                       std::int32_t *status) override
    {
        const auto found = m_byPath.find(path.view());
        if (found == m_byPath.end()) {
            *status = cv::rovo::status::NotFound;
            return;
        }
        *clientPath = found->second->clientPath;
        *alias = found->second->alias;
    }
    bool IsSearchArea(const WString &, std::int32_t *) override { return false; }
    bool IsExcludedFolder(const WString &, std::int32_t *) override { return false; }
    void ImportConfiguration(const WString &, cv::rovo::IConfigurationEditor *, std::int32_t *) override {}
    void ExportConfiguration(const WString &, cv::rovo::IConfigurationEditor *, std::int32_t *) override {}
    std::int32_t GetChangeTrigger(std::int32_t *) override { return 0; }
    std::uint32_t GetFileTimeout(std::int32_t *) override { return 0; }
    std::uint32_t GetIdleTime(std::int32_t *) override { return 0; }
    void GetSchedule(std::int32_t *, cv::rovo::CalendarTime *, std::int32_t *) override {}
    void GetTimeouts(std::uint32_t *, std::uint32_t *, std::int32_t *) override {}
    void GetIndexPath(WString *, std::int32_t *) override {}
    std::int32_t IsParseletActive(const WString &, std::int32_t *) override { return 0; }
    cv::vekex::IStringList *GetExtensionParselets(const WString &, std::int32_t *) override { return nullptr; }

private:
    static cv::vekex::IStringList *Shared(cv::vekex::IStringList *list)
    {
        list->AddRef();
        return list;
    }

    RefPtr<cv::vekex::IContainer> m_paths;
    std::map<std::u16string_view, const Area *> m_byPath;
    std::map<std::u16string_view, RefPtr<cv::vekex::IContainer>> m_excluded;
};

// The reference libraries over a store folder of this run; one named Sorvik
// per size, seeded once.
struct Setting
{
    Setting()
    {
        char pattern[] = "/tmp/sorvik-bench-XXXXXX";
        const char *made = ::mkdtemp(pattern);
        if (!made)
            std::abort();
        scratch = made;
        ::setenv("CORVANE_REGISTRY", SORVIK_REFERENCE_REGISTRY, 1);
        ::setenv("CORVANE_SORVIK_STORE", (scratch / "store").c_str(), 1);
        serverlibs::Vekex().TakeUse();
        serverlibs::RovoApi().TakeUse();
    }
    ~Setting()
    {
        sizes.clear();
        serverlibs::RovoApi().ReleaseUse();
        serverlibs::Vekex().ReleaseUse();
        std::filesystem::remove_all(scratch);
    }

    struct Size
    {
        std::vector<Area> areas;
        serverlibs::SorvikConfiguration store;
    };

    Size &For(int count)
    {
        std::unique_ptr<Size> &size = sizes[count];
        if (!size) {
            size = std::make_unique<Size>();
            size->areas = MakeAreas(count);
        }
        return *size;
    }

    // The store of that size, seeded at the first call.
    cv::rovo::IConfigurationView &StoreView(int count)
    {
        Size &size = For(count);
        if (size.store.view)
            return *size.store.view;
        const WString connection(cv::krn::FromQString(QStringLiteral("<Name>bench%1</Name>").arg(count)));
        size.store = serverlibs::OpenConfiguration(serverlibs::ModuleSorvikOpener(), connection);
        for (const Area &area : size.areas) {
            WString kept;
            std::int32_t status = 0;
            size.store.editor->AddFolder(&kept, area.path, area.clientPath, area.alias, 1, 0, WString(), &status);
            for (const WString &folder : area.excluded)
                size.store.editor->AddFolder(&kept, folder, WString(), WString(u"x"), 0, 1, WString(), &status);
            if (status != 0)
                std::abort();
        }
        serverlibs::Commit(*size.store.editor);
        return *size.store.view;
    }

    std::filesystem::path scratch;
    std::map<int, std::unique_ptr<Size>> sizes;
};

Setting &Shared()
{
    static Setting setting;
    return setting;
}

// A shown page of the size a properties dialog gives it.
std::unique_ptr<pages::CConfigureDlg> ShownPage(RefPtr<cv::rovo::IConfigurationView> view)
{
    auto page = std::make_unique<pages::CConfigureDlg>(std::move(view), nullptr);
    if (page->CreateModeless(nullptr) != 1)
        std::abort();
    page->resize(640, 400);
    QApplication::processEvents();
    return page;
}

void RunReloads(benchmark::State &state, pages::CConfigureDlg &page, int count)
{
    for (auto _ : state) {
        if (page.Reload() != 0 || page.Tree().topLevelItemCount() != count)
            state.SkipWithError("the page did not load every search area");
        QApplication::processEvents();
    }
    state.SetItemsProcessed(state.iterations() * count * (1 + kExcludedPerArea));
}

void PageReload_ReferenceStore(benchmark::State &state)
{
    const int count = int(state.range(0));
    const auto page = ShownPage(RefPtr<cv::rovo::IConfigurationView>::Share(&Shared().StoreView(count)));
    RunReloads(state, *page, count);
}

void PageReload_MemoryView(benchmark::State &state)
{
    const int count = int(state.range(0));
    Setting::Size &size = Shared().For(count);
    const auto page = ShownPage(RefPtr<cv::rovo::IConfigurationView>::Adopt(new MemoryView(size.areas)));
    RunReloads(state, *page, count);
}

// The properties dialog with the module's pages on the reference store:
// made, built from its template with every page loaded and shown, then gone.
void PropertiesDialogOpen_ReferenceStore(benchmark::State &state)
{
    const int count = int(state.range(0));
    Shared().StoreView(count);
    const WString connection(cv::krn::FromQString(QStringLiteral("<Name>bench%1</Name>").arg(count)));
    for (auto _ : state) {
        cv::vek::rovo::configdialog::CROVOConfigDlg dialog(connection, 0);
        if (dialog.CreateModeless(nullptr) != 1 || dialog.IsErrorMode())
            state.SkipWithError("the dialog did not open on the store");
        QApplication::processEvents();
        dialog.close();
    }
    state.SetItemsProcessed(state.iterations() * count * (1 + kExcludedPerArea));
}

// What the page's load reads from the reference store, without any widget.
void StoreReadsOnly_ReferenceStore(benchmark::State &state)
{
    const int count = int(state.range(0));
    cv::rovo::IConfigurationView &view = Shared().StoreView(count);
    for (auto _ : state) {
        const auto paths = serverlibs::ListSearchAreas(view);
        for (const WString &path : serverlibs::Texts(paths.get())) {
            benchmark::DoNotOptimize(serverlibs::GetSearchArea(view, path));
            benchmark::DoNotOptimize(serverlibs::ListExcludedFolders(view, path));
        }
    }
    state.SetItemsProcessed(state.iterations() * count * (1 + kExcludedPerArea));
}

// The page's load into its list from the in-memory view, without any widget.
void ListLoadOnly_MemoryView(benchmark::State &state)
{
    const int count = int(state.range(0));
    MemoryView *view = new MemoryView(Shared().For(count).areas);
    const auto held = RefPtr<cv::rovo::IConfigurationView>::Adopt(view);
    pages::SearchAreaList areas;
    for (auto _ : state) {
        if (pages::LoadSearchAreas(*view, areas) != 0)
            state.SkipWithError("the load failed");
    }
    state.SetItemsProcessed(state.iterations() * count * (1 + kExcludedPerArea));
}

// The baseline: the same items into a bare tree, straight from memory.
void BareTreeFill(benchmark::State &state)
{
    const int count = int(state.range(0));
    const std::vector<Area> &areas = Shared().For(count).areas;
    struct Texts
    {
        QString alias;
        QStringList excluded;
    };
    std::vector<Texts> texts;
    for (const Area &area : areas) {
        Texts t{cv::krn::ToQString(area.alias), {}};
        for (int j = 1; j <= kExcludedPerArea; ++j)
            t.excluded << QStringLiteral("Excluded %1").arg(j);
        texts.push_back(std::move(t));
    }
    const QIcon areaIcon(sharedsource::LoadImage(QStringLiteral("searcharea"), 96));
    const QIcon folderIcon(sharedsource::LoadImage(QStringLiteral("excludedfolder"), 96));
    QTreeWidget tree;
    tree.setHeaderHidden(true);
    tree.setUniformRowHeights(true);
    tree.resize(640, 400);
    tree.show();
    QApplication::processEvents();
    for (auto _ : state) {
        tree.clear();
        QList<QTreeWidgetItem *> items;
        items.reserve(qsizetype(texts.size()));
        for (std::size_t i = 0; i < texts.size(); ++i) {
            auto *item = new QTreeWidgetItem(QStringList{texts[i].alias});
            item->setIcon(0, areaIcon);
            item->setData(0, Qt::UserRole, int(i));
            for (const QString &folder : texts[i].excluded) {
                auto *child = new QTreeWidgetItem(QStringList{folder});
                child->setIcon(0, folderIcon);
                item->addChild(child);
            }
            items.push_back(item);
        }
        tree.addTopLevelItems(items);
        QApplication::processEvents();
    }
    state.SetItemsProcessed(state.iterations() * count * (1 + kExcludedPerArea));
}

BENCHMARK(BareTreeFill)->Arg(1000)->Arg(10000)->Unit(benchmark::kMillisecond);
BENCHMARK(PageReload_MemoryView)->Arg(1000)->Arg(10000)->Unit(benchmark::kMillisecond);
BENCHMARK(ListLoadOnly_MemoryView)->Arg(1000)->Arg(10000)->Unit(benchmark::kMillisecond);
BENCHMARK(PageReload_ReferenceStore)->Arg(1000)->Arg(10000)->Unit(benchmark::kMillisecond);
BENCHMARK(StoreReadsOnly_ReferenceStore)->Arg(1000)->Arg(10000)->Unit(benchmark::kMillisecond);
BENCHMARK(PropertiesDialogOpen_ReferenceStore)->Arg(1000)->Arg(10000)->Unit(benchmark::kMillisecond);

} // namespace

int main(int argc, char **argv)
{
    qputenv("QT_QPA_PLATFORM", "offscreen");
    QApplication application(argc, argv);
    benchmark::Initialize(&argc, argv);
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    return 0;
}
