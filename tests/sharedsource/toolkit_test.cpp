// Help calls, wait cursor, images by resolution and the real message box.

#include "sharedsource/flexdialog.h"
#include "sharedsource/help.h"
#include "sharedsource/imageset.h"
#include "sharedsource/prompts.h"
#include "sharedsource/waitcursor.h"
#include "uitest.h"

#include <QAbstractButton>
#include <QMessageBox>
#include <QTest>

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

using namespace sharedsource;

std::vector<std::u16string> g_topics;

void RecordHelp(BSTR topic, std::uintptr_t context)
{
    EXPECT_EQ(context, 42u);
    EXPECT_EQ(SysStringLen(topic) * 2, SysStringByteLen(topic));
    g_topics.emplace_back(topic, SysStringLen(topic));
}

class HelpDialog final : public CNSFlexDialog
{
public:
    HelpDialog()
    {
        SetHelpTarget({&RecordHelp, 42});
        SetHelpTopic(u"TOPIC_KEY");
    }
};

TEST(Help, TopicGoesAsANewCountedStringAndF1IsHandled)
{
    uitest::Application();
    g_topics.clear();
    EXPECT_TRUE(ShowHelp({&RecordHelp, 42}, u"ROAM_X"));
    EXPECT_FALSE(ShowHelp({nullptr, 42}, u"ROAM_X")) << "no callback, no help";

    {
        HelpDialog dialog;
        dialog.show();
        QKeyEvent f1(QEvent::KeyPress, Qt::Key_F1, Qt::NoModifier);
        QApplication::sendEvent(&dialog, &f1);
        EXPECT_TRUE(f1.isAccepted());
    }
    EXPECT_EQ(g_topics, (std::vector<std::u16string>{u"ROAM_X", u"TOPIC_KEY"}));
    uitest::ExpectNoWindowsLeft();
}

TEST(Images, ThreeSetsByDotsPerInch)
{
    EXPECT_EQ(ImageSetForDpi(96), ImageSet::Normal);
    EXPECT_EQ(ImageSetForDpi(131), ImageSet::Normal);
    EXPECT_EQ(ImageSetForDpi(132), ImageSet::Large);
    EXPECT_EQ(ImageSetForDpi(167), ImageSet::Large);
    EXPECT_EQ(ImageSetForDpi(168), ImageSet::Huge);
    EXPECT_EQ(ImagePath(QStringLiteral("browse"), ImageSet::Large), QStringLiteral(":/sorvik/images/browse_144.png"));
}

TEST(WaitCursor, NestsAndRestoresEarly)
{
    uitest::Application();
    {
        CWaitCursor outer;
        {
            CWaitCursor inner;
            inner.Restore();
            ASSERT_NE(QApplication::overrideCursor(), nullptr);
        }
        EXPECT_EQ(QApplication::overrideCursor()->shape(), Qt::WaitCursor);
    }
    EXPECT_EQ(QApplication::overrideCursor(), nullptr);
}

TEST(QtPrompts, ShowsTheBoxAsDescribedAndReturnsTheButton)
{
    uitest::Application();
    const Message message{QStringLiteral("Line one.\nLine two?"), QStringLiteral("Warning"), MessageIcon::Warning,
                          MessageButtons::YesNo};
    uitest::ModalPoller poller;
    poller.Expect("the question", uitest::Is<QMessageBox>(), [](QWidget &w) {
        auto &box = static_cast<QMessageBox &>(w);
        EXPECT_EQ(box.windowTitle(), QStringLiteral("Warning"));
        EXPECT_EQ(box.text(), QStringLiteral("Line one.\nLine two?"));
        EXPECT_EQ(box.icon(), QMessageBox::Warning);
        EXPECT_EQ(box.standardButtons(), QMessageBox::Yes | QMessageBox::No);
        box.button(QMessageBox::No)->click();
    });
    EXPECT_EQ(QtPrompts().ShowMessage(nullptr, message), MessageResult::No);
    poller.Expect("closed without a button", uitest::Is<QMessageBox>(), [](QWidget &w) { w.close(); });
    EXPECT_EQ(QtPrompts().ShowMessage(nullptr, {QStringLiteral("?"), QStringLiteral("Warning"), MessageIcon::Warning,
                                                MessageButtons::OkCancel}),
              MessageResult::Cancel);
    EXPECT_TRUE(poller.Done());
    uitest::ExpectNoWindowsLeft();
}

} // namespace
