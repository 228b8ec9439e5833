#include "searchareasfixture.h"

#include "resources/resourceids.h"
#include "serverlibs/searchareas.h"
#include "sharedsource/basedlg.h"
#include "sharedsource/tabctrl.h"
#include "sharedsource/toolbar.h"

#include <QAction>
#include <QApplication>
#include <QMenu>
#include <QTest>
#include <QTimer>

#include <chrono>

namespace pagestest {

MenuSeen WithMenu(const std::function<void()> &open, const QString &choose)
{
    MenuSeen seen;
    bool found = false;
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(5);
    QTimer poll;
    QObject::connect(&poll, &QTimer::timeout, [&] {
        auto *menu = qobject_cast<QMenu *>(QApplication::activePopupWidget());
        if (!menu) {
            if (std::chrono::steady_clock::now() > deadline)
                poll.stop();
            return;
        }
        poll.stop();
        found = true;
        seen.position = menu->pos();
        QAction *chosen = nullptr;
        for (QAction *action : menu->actions()) {
            if (action->isSeparator()) {
                seen.entries.push_back("-");
                continue;
            }
            seen.entries.push_back(action->text().toStdString() + (action->isEnabled() ? "" : " (off)"));
            if (!choose.isEmpty() && action->text() == choose)
                chosen = action;
        }
        if (!chosen) {
            menu->close();
            return;
        }
        menu->setActiveAction(chosen);
        QTest::keyClick(menu, Qt::Key_Return);
    });
    poll.start(10);
    open();
    EXPECT_TRUE(found) << "no context menu opened";
    return seen;
}

void SearchAreasPage::SetUp()
{
    ReferenceStore::SetUp();
    uitest::Application();
}

void SearchAreasPage::TearDown()
{
    m_host.reset();
    m_config = {};
    uitest::ExpectNoWindowsLeft();
    ReferenceStore::TearDown();
}

pages::CConfigureDlg &SearchAreasPage::Open(const std::vector<Folder> &folders, bool scripted)
{
    if (!folders.empty())
        Seed(folders);
    m_config = ReferenceStore::Open();
    m_host = std::make_unique<CNSFlexDialog>();
    if (scripted)
        m_host->SetPrompts(m_prompts);
    m_host->setGeometry(40, 40, 640, 460);
    m_tabs = new sharedsource::ToTabCtrl(m_host.get());
    m_tabs->setGeometry(8, 8, 624, 400);
    m_ok = new QPushButton(QStringLiteral("OK"), m_host.get());
    m_ok->setGeometry(8, 420, 80, 28);
    m_ok->setDefault(true);
    QObject::connect(m_ok, &QPushButton::clicked, m_host.get(), &QDialog::accept);

    m_page = new pages::CConfigureDlg(testsupport::SpyOn(m_config.view, m_log),
                                      testsupport::SpyOn(m_config.editor, m_log), m_tabs);
    EXPECT_EQ(sharedsource::AddTabPage(*m_tabs, *m_page, QStringLiteral("Search Areas")), 0);
    m_host->show();
    QApplication::setActiveWindow(m_host.get());
    EXPECT_TRUE(QTest::qWaitForWindowActive(m_host.get()));
    m_log->Clear();
    return *m_page;
}

void SearchAreasPage::Commit()
{
    cv::vek::rovo::serverlibs::Commit(*m_config.editor);
}

QTreeWidgetItem *SearchAreasPage::Area(int index) const
{
    return Tree().topLevelItem(index);
}

QTreeWidgetItem *SearchAreasPage::Child(int area, int index) const
{
    return Area(area)->child(index);
}

void SearchAreasPage::Select(QTreeWidgetItem *item)
{
    Tree().setFocus(Qt::OtherFocusReason);
    Tree().Select(item);
}

Lines SearchAreasPage::TreeLines() const
{
    Lines lines;
    for (int i = 0; i < Tree().topLevelItemCount(); ++i) {
        const QTreeWidgetItem *area = Tree().topLevelItem(i);
        lines.push_back(area->text(0).toStdString());
        for (int j = 0; j < area->childCount(); ++j)
            lines.push_back("  " + area->child(j)->text(0).toStdString());
    }
    return lines;
}

std::string SearchAreasPage::Buttons() const
{
    using namespace resources;
    std::string states;
    for (int command :
         {ID_ADD_SEARCH_AREA, ID_EXCLUDE_SUBFOLDER, ID_REMOVE_SEARCH_AREA, ID_SEARCH_AREA_UP, ID_SEARCH_AREA_DOWN})
        states += m_page->ToolBar()->IsButtonEnabled(command) ? '1' : '0';
    return states;
}

Lines SearchAreasPage::EditorCalls() const
{
    return m_log->Only({"AddFolder", "RemoveFolder", "UpdateFolder", "SetSearchAreaOrder"});
}

} // namespace pagestest
