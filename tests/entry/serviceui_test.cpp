// The service object's search-area operations with the module's real
// dialogs and questions, answered by modal pollers, against the reference
// libraries.

#include "entry/serverdialogsapp.h"
#include "referencesorvik.h"
#include "resources/resourceids.h"
#include "resources/strings.h"
#include "serverlibs/opensorvik.h"
#include "uitest.h"

#include <QAbstractButton>
#include <QLineEdit>
#include <QMessageBox>
#include <QPushButton>
#include <QTest>

#include <cstdlib>
#include <filesystem>

namespace cv::vek::rovo::testing {
namespace {

using sharedsource::GetControl;

using resources::FormatString;
using resources::LoadString;
using resources::Str;

// Checks a box as the user sees it, then presses one of its buttons.
uitest::ModalPoller::Act Answer(QString caption, QString text, QMessageBox::Icon icon,
                                QMessageBox::StandardButtons buttons, QMessageBox::StandardButton press)
{
    return [=](QWidget &w) {
        auto &box = static_cast<QMessageBox &>(w);
        EXPECT_EQ(box.windowTitle(), caption);
        EXPECT_EQ(box.text(), text);
        EXPECT_EQ(box.icon(), icon);
        EXPECT_EQ(box.standardButtons(), buttons);
        EXPECT_EQ(QApplication::overrideCursor(), nullptr) << "no wait cursor while the user decides";
        box.button(press)->click();
    };
}

class ModuleUi : public ReferenceSorvik
{
protected:
    // The module's own application ends before the process does, as when
    // the module is unloaded; Qt's globals are gone at static destruction.
    static void TearDownTestSuite() { TheApp().ExitInstance(); }

    void SetUp() override
    {
        ReferenceSorvik::SetUp();
        ::setenv("QT_QPA_PLATFORM", "offscreen", 0);
        ASSERT_NE(TheApp().EnsureApplication(), nullptr);
        m_service = new CServerDialogs(krn::WString(), 0, ModuleServiceUi(), [this](const krn::WString &connection) {
            ++m_opened;
            return serverlibs::OpenSorvik(connection).sorvik;
        });
    }
    void TearDown() override
    {
        m_service->Release();
        EXPECT_EQ(QApplication::overrideCursor(), nullptr) << "the wait cursor was left on";
        uitest::ExpectNoWindowsLeft();
        ReferenceSorvik::TearDown();
    }

    std::u16string Folder(const std::string &relative)
    {
        const std::filesystem::path path = m_tree.path() / relative;
        std::filesystem::create_directories(path);
        return path.u16string();
    }

    testsupport::TempDir m_tree;
    CServerDialogs *m_service = nullptr;
};

TEST_F(ModuleUi, AddRunsTheDialogAndMergesTheAreasInside)
{
    const std::u16string data = Folder("data"), a = Folder("data/a"), tmp = Folder("data/a/tmp"), b = Folder("data/b");
    Seed({{a, a, u"a"}, {tmp, u"", u"tmp", true}, {b, b, u"b"}});
    const std::string root = Narrow(data);

    uitest::ModalPoller poller;
    poller.Expect("the dialog", uitest::Is<QDialog>(), [&](QWidget &w) {
        EXPECT_EQ(w.windowTitle(), QStringLiteral("Add Search Area"));
        EXPECT_EQ(GetControl<QLineEdit>(&w, resources::IDC_PATH).text().toStdString(), root);
        EXPECT_EQ(GetControl<QLineEdit>(&w, resources::IDC_ALIAS).text(), QStringLiteral("data"));
        GetControl<QPushButton>(&w, resources::IDOK).click();
    });
    poller.Expect("the contained areas", uitest::Is<QMessageBox>(), [](QWidget &w) {
        auto &box = static_cast<QMessageBox &>(w);
        EXPECT_EQ(box.windowTitle(), LoadString(Str::Information));
        EXPECT_EQ(box.text(), LoadString(Str::PathContainsSearchAreas));
        box.button(QMessageBox::Ok)->click();
    });
    krn::WString path(data);
    EXPECT_EQ(m_service->AddSearchAreaEx(path, 0), 1);
    EXPECT_TRUE(poller.Done());
    EXPECT_EQ(Snapshot(), (Lines{root + " | " + root + " | data", "  " + Narrow(tmp) + " | a/tmp"}));

    poller.Expect("the dialog to cancel", uitest::Is<QDialog>(), [](QWidget &w) { QTest::keyClick(&w, Qt::Key_Escape); });
    path = Folder("other");
    EXPECT_EQ(m_service->AddSearchArea(path, 0), kModalCancel);
    EXPECT_EQ(Snapshot().size(), 2u) << "nothing changes on Cancel";
}

TEST_F(ModuleUi, EditShowsTheAreaInEditMode)
{
    const std::u16string a = Folder("a");
    Seed({{a, a, u"Alpha"}});
    uitest::ModalPoller poller;
    poller.Expect("the edit dialog", uitest::Is<QDialog>(), [](QWidget &w) {
        EXPECT_EQ(w.windowTitle(), QStringLiteral("Edit Search Area"));
        EXPECT_EQ(GetControl<QLineEdit>(&w, resources::IDC_ALIAS).text(), QStringLiteral("Alpha"));
        GetControl<QLineEdit>(&w, resources::IDC_ALIAS).setText(QStringLiteral("Renamed"));
        GetControl<QPushButton>(&w, resources::IDOK).click();
    });
    krn::WString path(a);
    EXPECT_EQ(m_service->EditSearchArea(path, 0), 1);
    EXPECT_EQ(Snapshot(), Lines{Narrow(a) + " | " + Narrow(a) + " | Renamed"});
}

TEST_F(ModuleUi, ExcludeAndRemoveAskFirst)
{
    const std::u16string data = Folder("data");
    Seed({{data, data, u"Data"}});
    const QString cache = QString::fromStdU16String(data) + QStringLiteral("/cache");
    uitest::ModalPoller poller;
    poller.Expect("exclude, cancelled", uitest::Is<QMessageBox>(),
                  Answer(LoadString(Str::Warning), FormatString(Str::ExcludeFolderQuestion, cache), QMessageBox::Warning,
                         QMessageBox::Ok | QMessageBox::Cancel, QMessageBox::Cancel));
    krn::WString path(cache.toStdU16String());
    EXPECT_EQ(m_service->ExcludeFolder(path), CServerDialogs::kDeclined);
    EXPECT_EQ(m_opened, 0) << "declining contacts no server";

    poller.Expect("exclude, confirmed", uitest::Is<QMessageBox>(),
                  Answer(LoadString(Str::Warning), FormatString(Str::ExcludeFolderQuestion, cache), QMessageBox::Warning,
                         QMessageBox::Ok | QMessageBox::Cancel, QMessageBox::Ok));
    EXPECT_EQ(m_service->ExcludeFolder(path), CServerDialogs::kDone);
    EXPECT_EQ(m_service->RemoveSearchArea(path), CServerDialogs::kDone) << "an excluded folder goes unasked";

    poller.Expect("remove", uitest::Is<QMessageBox>(),
                  Answer(LoadString(Str::Warning), FormatString(Str::RemoveSearchAreaQuestion, QString::fromStdU16String(data)),
                         QMessageBox::Warning, QMessageBox::Ok | QMessageBox::Cancel, QMessageBox::Ok));
    path = data;
    EXPECT_EQ(m_service->RemoveSearchArea(path), CServerDialogs::kDone);
    EXPECT_TRUE(poller.Done());
    EXPECT_TRUE(Snapshot().empty());
}

TEST_F(ModuleUi, ThePropertiesDialogRunsModallyAndAnswersItsResult)
{
    uitest::ModalPoller poller;
    const auto press = [](int button) {
        return [button](QWidget &w) { GetControl<QAbstractButton>(&w, button).click(); };
    };
    const auto isProperties = [](QWidget &w) {
        return w.windowTitle() == FormatString(Str::ConfigureTitle, LoadString(Str::MySorvik));
    };
    poller.Expect("the properties dialog", isProperties, press(resources::IDCANCEL));
    EXPECT_EQ(m_service->ShowConfigurationDialog(), kModalCancel);
    poller.Expect("the properties dialog again", isProperties, press(resources::IDOK));
    EXPECT_EQ(m_service->ShowConfigurationDialog(), kModalOk);
    EXPECT_TRUE(poller.Done());
}

TEST_F(ModuleUi, DialogsOfLaterIssuesAreNotCreatedYet)
{
    EXPECT_EQ(m_service->ShowOptimizeDialog(), kDialogNotCreated);
}

} // namespace
} // namespace cv::vek::rovo::testing
