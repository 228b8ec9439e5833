// Resizing, minimum size, the confirm path and font substitution, with real
// widgets built from a template.

#include "sharedsource/basedlg.h"
#include "uitest.h"

#include <QComboBox>
#include <QPushButton>

#include <gtest/gtest.h>

#include <cstring>

namespace {

using namespace sharedsource;

constexpr std::uint16_t kTestTemplate = 60001;
constexpr int kEdit = 100, kBrowse = 101, kHalf = 102, kCombo = 103;

DialogTemplate TestTemplate()
{
    DialogTemplate t;
    t.id = kTestTemplate;
    t.title = QStringLiteral("Layout");
    t.size = QSize(200, 100);
    t.fontFace = QStringLiteral("DejaVu Sans Mono");
    t.pointSize = 12;
    t.controls = {
        {kEdit, ControlKind::Edit, {}, QRect(10, 10, 150, 12)},
        {kBrowse, ControlKind::Button, QStringLiteral("..."), QRect(165, 10, 20, 12)},
        {kHalf, ControlKind::Button, QStringLiteral("half"), QRect(10, 30, 40, 12)},
        {kCombo,
         ControlKind::ComboBox,
         {},
         QRect(60, 30, 100, 60),
         0,
         {},
         {QStringLiteral("one"), QStringLiteral("two")}},
        {IDOK, ControlKind::DefaultButton, QStringLiteral("OK"), QRect(90, 80, 50, 14)},
        {ID_APPLY_NOW, ControlKind::Button, QStringLiteral("Apply"), QRect(145, 80, 50, 14)},
    };
    return t;
}

const CNSFlexHorizontalConstraint kHalfWay(0.5f, 0.5f);

class TestDialog final : public ToBaseDlg<CNSFlexDialog>
{
public:
    explicit TestDialog(const LOGFONTW *font = nullptr, TemplateRef dialogTemplate = {kTestTemplate, &TestTemplate})
        : ToBaseDlg(dialogTemplate, nullptr)
    {
        if (font)
            SetHostFont(*font);
        AddConstraint(kEdit, NSFlexExpandRight, NSFlexVerticallyFixed);
        AddConstraint(kBrowse, NSFlexMoveRight, NSFlexVerticallyFixed, true);
        AddConstraint(kHalf, kHalfWay, NSFlexVerticallyFixed);
        AddConstraint(kCombo, NSFlexHorizontallyFixed, NSFlexExpandDown);
        AddConstraint(IDOK, NSFlexHorizontallyFixed, NSFlexMoveDown);
    }
    bool applyAnswer = true;
    int applied = 0;

protected:
    bool OnApply(std::uintptr_t context) override
    {
        EXPECT_EQ(context, ApplyContext());
        ++applied;
        return applyAnswer;
    }
};

class FlexDialog : public ::testing::Test
{
protected:
    static void SetUpTestSuite() { uitest::Application(); }
    void TearDown() override { uitest::ExpectNoWindowsLeft(); }

    static QRect Rect(const QWidget &dialog, int id) { return FindControl(&dialog, id)->geometry(); }
};

TEST_F(FlexDialog, GrowingMovesAndStretchesAsDeclaredAndShrinkingIsImpossible)
{
    TestDialog dialog;
    ASSERT_EQ(dialog.CreateModeless(nullptr), 1);
    const QSize start = dialog.size();
    EXPECT_EQ(dialog.minimumSize(), start) << "never smaller than the template";
    const QRect edit = Rect(dialog, kEdit), browse = Rect(dialog, kBrowse), ok = Rect(dialog, IDOK);

    dialog.resize(start + QSize(100, 50));
    EXPECT_EQ(Rect(dialog, kEdit), edit.adjusted(0, 0, 100, 0)) << "stretched";
    EXPECT_EQ(Rect(dialog, kBrowse), browse.translated(100, 0)) << "moved right";
    EXPECT_EQ(Rect(dialog, IDOK), ok.translated(0, 50)) << "moved down";

    dialog.resize(start - QSize(40, 30));
    EXPECT_EQ(dialog.size(), start);
    EXPECT_EQ(Rect(dialog, kEdit), edit);
    EXPECT_EQ(Rect(dialog, kBrowse), browse);
    EXPECT_EQ(Rect(dialog, IDOK), ok);

    // Below the baseline (had the window manager allowed it) nothing moves left or up.
    CNSFlexConstraintList list(&dialog);
    list.Add(kBrowse, NSFlexMoveRight, NSFlexMoveDown, false);
    list.SetBaseline(start + QSize(50, 50));
    list.Resize(start);
    EXPECT_TRUE(list.IsCaptured());
    EXPECT_EQ(Rect(dialog, kBrowse), browse);
    dialog.close();
}

TEST_F(FlexDialog, FractionalProductsAreTruncatedAndCombosKeepTheirListHeight)
{
    EXPECT_EQ(kHalfWay.LeadingEdge(10, 3), 11);
    EXPECT_EQ(CNSFlexHorizontalConstraint(0.9f, 0.9f).TrailingEdge(0, 1), 0);

    TestDialog dialog;
    ASSERT_EQ(dialog.CreateModeless(nullptr), 1);
    auto *combo = &GetControl<QComboBox>(&dialog, kCombo);
    EXPECT_EQ(combo->count(), 2) << "the template's list";
    const int dropped = DroppedHeight(*combo);
    const int shown = combo->height();
    EXPECT_GT(dropped, shown);
    const QRect half = Rect(dialog, kHalf);
    dialog.resize(dialog.size() + QSize(3, 20));
    EXPECT_EQ(Rect(dialog, kHalf), half.translated(1, 0)) << "3 x 0.5 moves by 1";
    EXPECT_EQ(DroppedHeight(*combo), dropped + 20) << "the list grows, not the visible box";
    EXPECT_EQ(combo->height(), shown);
    dialog.close();
}

TEST_F(FlexDialog, ConfirmGoesThroughApplyAndApplyKeepsTheDialogOpen)
{
    TestDialog dialog;
    dialog.SetApplyContext(77);
    ASSERT_EQ(dialog.CreateModeless(nullptr), 1);
    auto *apply = &GetControl<QPushButton>(&dialog, ID_APPLY_NOW);
    EXPECT_FALSE(apply->isEnabled()) << "nothing changed yet";
    dialog.SetModified(true);
    EXPECT_TRUE(apply->isEnabled());

    dialog.applyAnswer = false;
    apply->click();
    EXPECT_TRUE(dialog.HasApplyPending() && apply->isEnabled()) << "a refused apply changes nothing";
    GetControl<QPushButton>(&dialog, IDOK).click();
    EXPECT_TRUE(dialog.isVisible()) << "a refused apply keeps the dialog open";

    dialog.applyAnswer = true;
    apply->click();
    EXPECT_FALSE(dialog.HasApplyPending() || apply->isEnabled());
    GetControl<QPushButton>(&dialog, IDOK).click();
    EXPECT_FALSE(dialog.isVisible());
    EXPECT_EQ(dialog.result(), kResultOk);
    EXPECT_EQ(dialog.applied, 4);
}

TEST_F(FlexDialog, HostFontReplacesTheTemplateFont)
{
    EXPECT_EQ(PointSizeOf(-11, 96), 8);
    EXPECT_EQ(PointSizeOf(-13, 96), 10) << "9.75 rounds up";
    EXPECT_EQ(PointSizeOf(-22, 192), 8);

    LOGFONTW font;
    std::memset(&font, 0, sizeof font);
    font.lfHeight = -11;
    std::memcpy(font.lfFaceName, u"DejaVu Serif", sizeof(u"DejaVu Serif"));
    TestDialog hosted(&font);
    ASSERT_EQ(hosted.logicalDpiY(), 96);
    ASSERT_EQ(hosted.CreateModeless(nullptr), 1);
    EXPECT_EQ(hosted.font().family(), QStringLiteral("DejaVu Serif"));
    EXPECT_EQ(hosted.font().pointSize(), 8);
    EXPECT_EQ(FindControl(&hosted, kEdit)->font().family(), QStringLiteral("DejaVu Serif"));
    hosted.close();

    TestDialog plain;
    ASSERT_EQ(plain.CreateModeless(nullptr), 1);
    EXPECT_EQ(plain.font().family(), QString::fromUtf16(kFallbackFace));
    EXPECT_EQ(plain.font().pointSize(), 12) << "the template's size";
    EXPECT_GT(plain.width(), hosted.width()) << "dialog units follow the font";
    plain.close();
}

TEST_F(FlexDialog, MissingTemplatesAreReported)
{
    TestDialog unknown(nullptr, {60999, nullptr});
    EXPECT_EQ(unknown.DoModal(), kModalNotCreated);
    EXPECT_EQ(unknown.CreateModeless(nullptr), kTemplateNotLoaded);
    TestDialog nameless(nullptr, {0, &TestTemplate});
    EXPECT_EQ(nameless.CreateModeless(nullptr), kNoTemplateName);
}

} // namespace
