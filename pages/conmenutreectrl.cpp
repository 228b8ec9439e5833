#include "pages/conmenutreectrl.h"

#include "resources/resourceids.h"
#include "resources/strings.h"

#include <QContextMenuEvent>
#include <QHelpEvent>
#include <QKeyEvent>
#include <QLineEdit>
#include <QMenu>
#include <QPointer>
#include <QStyledItemDelegate>
#include <QToolTip>

#include <functional>

namespace pages {

using resources::LoadString;
using resources::Str;

namespace {

bool IsEnterOrEscape(const QKeyEvent &event)
{
    return event.key() == Qt::Key_Return || event.key() == Qt::Key_Enter || event.key() == Qt::Key_Escape;
}

// The rename field keeps Enter and Escape: they end the rename, never the
// dialog around the page.
class LabelEdit final : public QLineEdit
{
public:
    using QLineEdit::QLineEdit;

protected:
    void keyPressEvent(QKeyEvent *event) override
    {
        QLineEdit::keyPressEvent(event);
        if (IsEnterOrEscape(*event))
            event->accept();
    }
};

// In-place renames whose end the tree's owner accepts or refuses.
class LabelDelegate final : public QStyledItemDelegate
{
public:
    using EndEdit = std::function<bool(const QModelIndex &, const QString &)>;

    LabelDelegate(QObject *parent, EndEdit endEdit) : QStyledItemDelegate(parent), m_endEdit(std::move(endEdit)) {}

    QWidget *createEditor(QWidget *parent, const QStyleOptionViewItem &, const QModelIndex &) const override
    {
        return new LabelEdit(parent);
    }

    void setModelData(QWidget *editor, QAbstractItemModel *model, const QModelIndex &index) const override
    {
        if (m_endEdit(index, static_cast<QLineEdit *>(editor)->text()))
            QStyledItemDelegate::setModelData(editor, model, index);
    }

    QRect TextRect(const QStyleOptionViewItem &view, const QModelIndex &index, const QWidget *widget) const
    {
        QStyleOptionViewItem option = view;
        initStyleOption(&option, index);
        return widget->style()->subElementRect(QStyle::SE_ItemViewItemText, &option, widget);
    }

private:
    EndEdit m_endEdit;
};

} // namespace

CConMenuCTreeCtrl::CConMenuCTreeCtrl(QWidget *parent) : QTreeWidget(parent)
{
    setHeaderHidden(true);
    setColumnCount(1);
    setSelectionMode(SingleSelection);
    setUniformRowHeights(true);
    setEditTriggers(SelectedClicked);
    setItemDelegate(new LabelDelegate(this, [this](const QModelIndex &index, const QString &text) {
        QTreeWidgetItem *item = itemFromIndex(index);
        ISearchAreaTreeOwner *owner = Owner();
        return item && owner && owner->OnEndLabelEdit(*item, text);
    }));
}

QTreeWidgetItem *CConMenuCTreeCtrl::NewSearchAreaItem(const QString &text, const QIcon &icon, int position)
{
    auto *item = new QTreeWidgetItem(QStringList{text});
    item->setIcon(0, icon);
    item->setFlags(item->flags() | Qt::ItemIsEditable);
    SetPosition(*item, position);
    return item;
}

QTreeWidgetItem *CConMenuCTreeCtrl::NewExcludedFolderItem(const QString &text, const QIcon &icon)
{
    auto *item = new QTreeWidgetItem(QStringList{text});
    item->setIcon(0, icon);
    return item;
}

int CConMenuCTreeCtrl::Position(const QTreeWidgetItem &item)
{
    return item.data(0, Qt::UserRole).toInt();
}

void CConMenuCTreeCtrl::SetPosition(QTreeWidgetItem &item, int position)
{
    item.setData(0, Qt::UserRole, position);
}

QTreeWidgetItem *CConMenuCTreeCtrl::SelectedItem() const
{
    const QList<QTreeWidgetItem *> selected = selectedItems();
    return selected.isEmpty() ? nullptr : selected.front();
}

void CConMenuCTreeCtrl::Select(QTreeWidgetItem *item)
{
    if (!item)
        clearSelection();
    setCurrentItem(item);
}

bool CConMenuCTreeCtrl::EditLabel(QTreeWidgetItem *item)
{
    if (!item || !IsSearchArea(*item))
        return false;
    setFocus(Qt::OtherFocusReason);
    editItem(item);
    return IsEditingLabel();
}

std::unique_ptr<QMenu> CConMenuCTreeCtrl::MakeContextMenu()
{
    auto menu = std::make_unique<QMenu>();
    menu->setFont(font());
    const auto add = [&menu](Str text, int command, bool enabled) {
        QAction *action = menu->addAction(LoadString(text));
        action->setData(command);
        action->setEnabled(enabled);
    };
    const QTreeWidgetItem *selected = SelectedItem();
    const bool area = selected && IsSearchArea(*selected);
    const int position = area ? Position(*selected) : 0;

    using namespace resources;
    add(Str::AddSearchAreaMenu, ID_ADD_SEARCH_AREA, true);
    add(Str::ExcludeSubfolderMenu, ID_EXCLUDE_SUBFOLDER, selected);
    add(Str::RemoveMenu, ID_REMOVE_SEARCH_AREA, selected);
    add(Str::UpMenu, ID_SEARCH_AREA_UP, area && position != 0);
    add(Str::DownMenu, ID_SEARCH_AREA_DOWN, area && position != topLevelItemCount() - 1);
    menu->addSeparator();
    add(Str::RenameMenu, ID_RENAME_SEARCH_AREA, area);
    menu->addSeparator();
    add(Str::ExploreMenu, ID_EXPLORE_FOLDER, selected);
    return menu;
}

QPoint CConMenuCTreeCtrl::KeyboardMenuPosition() const
{
    const QTreeWidgetItem *selected = SelectedItem();
    if (!selected)
        return mapToGlobal(QPoint(0, 0));
    const QModelIndex index = indexFromItem(selected);
    QStyleOptionViewItem option;
    initViewItemOption(&option);
    option.rect = visualRect(index);
    const QRect text = static_cast<const LabelDelegate *>(itemDelegate())->TextRect(option, index, this);
    // The rectangle's bottom() is its last row; the corner lies below it.
    return viewport()->mapToGlobal(QPoint(text.left(), text.top() + text.height()));
}

QString CConMenuCTreeCtrl::InfoTipAt(const QPoint &viewportPosition) const
{
    const QTreeWidgetItem *item = itemAt(viewportPosition);
    const ISearchAreaTreeOwner *owner = Owner();
    return item && owner ? owner->InfoTip(*item) : QString();
}

void CConMenuCTreeCtrl::contextMenuEvent(QContextMenuEvent *event)
{
    event->accept();
    if (event->reason() != QContextMenuEvent::Mouse) {
        ShowContextMenu(KeyboardMenuPosition());
        return;
    }
    Select(itemAt(event->pos()));
    ShowContextMenu(event->globalPos());
}

void CConMenuCTreeCtrl::keyPressEvent(QKeyEvent *event)
{
    const bool menuKey = event->key() == Qt::Key_Menu && event->modifiers() == Qt::NoModifier;
    const bool shiftF10 = event->key() == Qt::Key_F10 && event->modifiers() == Qt::ShiftModifier;
    if (menuKey || shiftF10) {
        event->accept();
        ShowContextMenu(KeyboardMenuPosition());
        return;
    }
    if (!IsEditingLabel() && event->modifiers() == Qt::NoModifier &&
        (event->key() == Qt::Key_Delete || event->key() == Qt::Key_F2)) {
        event->accept();
        Forward(event->key() == Qt::Key_Delete ? resources::ID_REMOVE_SEARCH_AREA : resources::ID_RENAME_SEARCH_AREA);
        return;
    }
    QTreeWidget::keyPressEvent(event);
}

bool CConMenuCTreeCtrl::viewportEvent(QEvent *event)
{
    if (event->type() != QEvent::ToolTip)
        return QTreeWidget::viewportEvent(event);
    const auto *help = static_cast<QHelpEvent *>(event);
    const QString tip = InfoTipAt(help->pos());
    if (tip.isEmpty())
        QToolTip::hideText();
    else
        QToolTip::showText(help->globalPos(), tip, viewport(), visualItemRect(itemAt(help->pos())));
    return true;
}

ISearchAreaTreeOwner *CConMenuCTreeCtrl::Owner() const
{
    return dynamic_cast<ISearchAreaTreeOwner *>(parentWidget());
}

void CConMenuCTreeCtrl::ShowContextMenu(const QPoint &globalPosition)
{
    // The menu has no parent: the tree may go while the menu is open.
    const std::unique_ptr<QMenu> menu = MakeContextMenu();
    const QPointer<CConMenuCTreeCtrl> alive(this);
    const QAction *chosen = menu->exec(globalPosition);
    if (chosen && alive)
        Forward(chosen->data().toInt());
}

void CConMenuCTreeCtrl::Forward(int command)
{
    if (ISearchAreaTreeOwner *owner = Owner())
        owner->OnTreeCommand(command);
}

} // namespace pages
