// The controls templates name, with real widgets: spin edits that clamp each
// step but let typed values through, report lists with state images, the
// hidden, placeholder and custom kinds, checked look-up, and toolbars that
// keep their place by a placeholder through resizes.

#include "sharedsource/basedlg.h"
#include "sharedsource/reportlist.h"
#include "sharedsource/spinedit.h"
#include "sharedsource/tabctrl.h"
#include "sharedsource/toolbar.h"
#include "uitest.h"

#include <QLabel>
#include <QLineEdit>
#include <QPainter>
#include <QSignalSpy>
#include <QTest>
#include <QTimeEdit>
#include <QToolButton>

#include <gtest/gtest.h>

namespace {

using namespace sharedsource;

constexpr int kLabel = 100, kSpin = 101, kList = 102, kTime = 103, kTabs = 104, kHint = 105, kHolder = 106, kOwn = 107,
              kAfter = 108;
constexpr int kFirst = 1, kSecond = 2, kThird = 3;

DialogTemplate ControlsTemplate()
{
    DialogTemplate t;
    t.id = 60010;
    t.title = QStringLiteral("Controls");
    t.size = QSize(240, 160);
    t.fontFace = QStringLiteral("DejaVu Sans");
    t.controls = {
        {kLabel, ControlKind::Label, QStringLiteral("&Idle time:"), QRect(5, 5, 50, 8)},
        {kSpin, ControlKind::SpinEdit, {}, QRect(60, 4, 40, 12)},
        {kList,
         ControlKind::ReportList,
         {},
         QRect(5, 20, 150, 60),
         style::kSingleSelection,
         {},
         {QStringLiteral("Name"), QStringLiteral("Extensions")}},
        {kTime, ControlKind::TimePicker, {}, QRect(5, 85, 40, 12)},
        {kTabs, ControlKind::TabControl, {}, QRect(5, 100, 100, 40)},
        {kHint, ControlKind::Text, QStringLiteral("hint"), QRect(110, 100, 60, 20), style::kHidden},
        {kHolder, ControlKind::Placeholder, {}, QRect(180, 5, 50, 12)},
        {kOwn, ControlKind::Custom, {}, QRect(160, 20, 70, 60)},
        {kAfter, ControlKind::Edit, {}, QRect(160, 85, 70, 12)},
    };
    return t;
}

// A control class of the dialog's own, made for its Custom entry.
class OwnControl final : public QLineEdit
{};

class ControlsDialog final : public ToBaseDlg<CNSFlexDialog>
{
public:
    explicit ControlsDialog(bool makesOwn = true) : ToBaseDlg({60010, &ControlsTemplate}, nullptr), m_makesOwn(makesOwn)
    {
        AddConstraint(kHolder, NSFlexMoveRight, NSFlexVerticallyFixed);
    }

    QWidget *CreateCustomControl(const ControlTemplate &control) override
    {
        if (!m_makesOwn || control.id != kOwn)
            return nullptr;
        m_own.setParent(this);
        return &m_own;
    }

    void AddToolBar()
    {
        m_toolBar = new ToToolBar(
            QStringLiteral("none"),
            {{kFirst, QStringLiteral("First")}, {kSecond, QStringLiteral("Second")}, {kThird, QStringLiteral("Third")}},
            this);
        PlaceToolBar(*m_toolBar, kHolder, ToolBarPlacement::RightAligned);
    }

    OwnControl m_own; // a member: destroyed before the dialog, which forgets it then
    ToToolBar *m_toolBar = nullptr;

private:
    bool m_makesOwn;
};

class Controls : public ::testing::Test
{
protected:
    static void SetUpTestSuite() { uitest::Application(); }
    void TearDown() override { uitest::ExpectNoWindowsLeft(); }
};

TEST_F(Controls, SpinEditClampsEachStepButLetsTypedValuesThrough)
{
    ControlsDialog dialog;
    ASSERT_EQ(dialog.CreateModeless(nullptr), 1);
    auto &spin = GetControl<ToSpinEdit>(&dialog, kSpin);
    spin.SetRange(5, 9999);

    QTest::keyClicks(&spin.Edit(), QStringLiteral("1x0000"));
    EXPECT_EQ(spin.Edit().text(), QStringLiteral("10000")) << "only digits can be typed";
    EXPECT_EQ(spin.Value(), 10000u) << "a typed value out of range reaches the page's own check";
    spin.DownButton().click();
    EXPECT_EQ(spin.Value(), 9999u) << "a step clamps";
    spin.UpButton().click();
    EXPECT_EQ(spin.Value(), 9999u);

    spin.SetValue(6);
    QTest::keyClick(&spin.Edit(), Qt::Key_Down);
    QTest::keyClick(&spin.Edit(), Qt::Key_Down);
    EXPECT_EQ(spin.Value(), 5u) << "the arrow keys step like the buttons";

    spin.Edit().clear();
    EXPECT_EQ(spin.Value(), std::nullopt);
    spin.UpButton().click();
    EXPECT_EQ(spin.Value(), 5u) << "an empty field steps up from the bottom";
    spin.Edit().setText(QStringLiteral("4294967296"));
    EXPECT_EQ(spin.Value(), std::nullopt) << "more than 32 bits is no value";

    auto &label = GetControl<QLabel>(&dialog, kLabel);
    EXPECT_EQ(label.buddy(), &spin) << "the label's mnemonic leads into the field";
    EXPECT_EQ(spin.focusProxy(), &spin.Edit());
}

TEST_F(Controls, ReportListRowsAndStateImages)
{
    ControlsDialog dialog;
    ASSERT_EQ(dialog.CreateModeless(nullptr), 1);
    auto &list = GetControl<ToReportList>(&dialog, kList);
    EXPECT_EQ(list.columnCount(), 2);
    EXPECT_EQ(list.headerItem()->text(1), QStringLiteral("Extensions"));
    EXPECT_EQ(list.selectionMode(), QAbstractItemView::SingleSelection);

    QPixmap off(13, 13), on(13, 13);
    off.fill(Qt::white);
    on.fill(Qt::black);
    list.SetStateImages({QPixmap(), off, on});
    for (const char *name : {"csv", "wave"}) {
        auto *row = new QTreeWidgetItem(&list, {QString::fromLatin1(name), QStringLiteral("*.x")});
        list.SetState(*row, 1);
    }
    list.SetState(*list.topLevelItem(1), 2);
    EXPECT_EQ(ToReportList::State(*list.topLevelItem(1)), 2);

    QSignalSpy clicked(&list, &ToReportList::stateImageClicked);
    QTreeWidgetItem *second = list.topLevelItem(1);
    const QRect box = list.StateImageRect(*second);
    ASSERT_FALSE(box.isEmpty());
    QTest::mouseClick(list.viewport(), Qt::LeftButton, {}, box.center());
    ASSERT_EQ(clicked.count(), 1);
    EXPECT_EQ(clicked.at(0).at(0).value<QTreeWidgetItem *>(), second);
    EXPECT_FALSE(second->isSelected()) << "a click on the box does not select";

    const QRect text = list.visualItemRect(second);
    QTest::mouseClick(list.viewport(), Qt::LeftButton, {}, QPoint(box.right() + 20, text.center().y()));
    EXPECT_EQ(clicked.count(), 1);
    EXPECT_TRUE(second->isSelected()) << "a click beside it selects the whole row";

    const QImage drawn = list.viewport()->grab().toImage();
    EXPECT_EQ(drawn.pixelColor(box.center()), QColor(Qt::black)) << "state 2 draws image 2";
}

TEST_F(Controls, TemplateKindsHiddenPlaceholderAndCustom)
{
    ControlsDialog dialog;
    ASSERT_EQ(dialog.CreateModeless(nullptr), 1);
    EXPECT_EQ(GetControl<QTimeEdit>(&dialog, kTime).displayFormat(), QStringLiteral("HH:mm"));
    EXPECT_NE(dynamic_cast<ToTabCtrl *>(FindControl(&dialog, kTabs)), nullptr);
    EXPECT_FALSE(GetControl<QWidget>(&dialog, kHint).isVisibleTo(&dialog)) << "hidden until shown on demand";
    const QWidget &holder = GetControl<QWidget>(&dialog, kHolder);
    EXPECT_FALSE(holder.isVisibleTo(&dialog));
    EXPECT_EQ(holder.focusPolicy(), Qt::NoFocus);

    OwnControl &own = GetControl<OwnControl>(&dialog, kOwn);
    EXPECT_EQ(&own, &dialog.m_own);
    EXPECT_EQ(own.geometry(), DialogUnitsOf(dialog.font()).ToPixels(QRect(160, 20, 70, 60)))
        << "the template's rectangle";
    EXPECT_EQ(own.property(kControlIdProperty).toInt(), kOwn);
    own.setFocus();
    EXPECT_EQ(own.nextInFocusChain(), &GetControl<QLineEdit>(&dialog, kAfter)) << "the template's tab order";
    dialog.close();

    ControlsDialog withoutOwn(false);
    EXPECT_THROW(withoutOwn.CreateModeless(nullptr), ControlError) << "a Custom entry nobody makes";
    withoutOwn.close();
}

TEST_F(Controls, CheckedLookUpFailsLoudly)
{
    ControlsDialog dialog;
    ASSERT_EQ(dialog.CreateModeless(nullptr), 1);
    EXPECT_THROW(GetControl<QLineEdit>(&dialog, 999), ControlError) << "no such id";
    try {
        GetControl<QLineEdit>(&dialog, kList);
        ADD_FAILURE() << "a report list is no line edit";
    } catch (const ControlError &e) {
        EXPECT_NE(std::string(e.what()).find("control 102"), std::string::npos) << e.what();
    }
    EXPECT_EQ(FindControl(&dialog, 999), nullptr) << "the unchecked look-up stays for optional controls";
    dialog.close();
}

TEST_F(Controls, ToolBarKeepsItsPlaceByThePlaceholderAndGreysDisabledButtons)
{
    ControlsDialog dialog;
    ASSERT_EQ(dialog.CreateModeless(nullptr), 1);
    dialog.AddToolBar();
    ToToolBar &bar = *dialog.m_toolBar;
    const QSize button = bar.ButtonSize();
    for (const QSize growth : {QSize(0, 0), QSize(120, 40), QSize(33, 7), QSize(300, 0), QSize(0, 0)}) {
        dialog.resize(dialog.minimumSize() + growth);
        const QRect holder = GetControl<QWidget>(&dialog, kHolder).geometry();
        const QRect placed = bar.geometry();
        EXPECT_EQ(placed.x() + placed.width(), holder.x() + holder.width() + 4) << growth.width();
        EXPECT_EQ(placed.y() + placed.height(), holder.y() + holder.height());
        EXPECT_EQ(placed.width(), 3 * button.width() + 13);
        EXPECT_EQ(placed.height(), button.height() + 7);
    }

    QSignalSpy commands(&bar, &ToToolBar::commandTriggered);
    bar.Button(kSecond)->click();
    bar.SetButtonEnabled(kThird, false);
    QTest::mouseClick(bar.Button(kThird), Qt::LeftButton);
    EXPECT_EQ(commands.count(), 1) << "a disabled button does not react";
    EXPECT_EQ(commands.at(0).at(0).toInt(), kSecond);
    EXPECT_FALSE(bar.IsButtonEnabled(kThird));
    EXPECT_EQ(bar.Button(kFirst)->toolTip(), QStringLiteral("First"));
    EXPECT_EQ(bar.Button(kFirst)->focusPolicy(), Qt::NoFocus);
    dialog.close();
}

TEST_F(Controls, ToolBarImagesComeFromAStripAndGreyWhenDisabled)
{
    QPixmap strip(32, 16);
    strip.fill(Qt::red);
    QPainter(&strip).fillRect(16, 0, 16, 16, Qt::blue);
    const QList<QPixmap> images = SplitImageStrip(strip, 2);
    ASSERT_EQ(images.size(), 2);
    EXPECT_EQ(images[1].toImage().pixelColor(3, 3), QColor(Qt::blue));

    QToolButton button;
    button.setIcon(images[0]);
    const QColor enabled = button.icon().pixmap(16, QIcon::Normal).toImage().pixelColor(8, 8);
    const QColor greyed = button.icon().pixmap(16, QIcon::Disabled).toImage().pixelColor(8, 8);
    EXPECT_EQ(enabled, QColor(Qt::red));
    EXPECT_EQ(greyed.red(), greyed.green()) << "disabled shows grey";
}

} // namespace
