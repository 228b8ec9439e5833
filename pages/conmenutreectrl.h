#pragma once

// The tree of the Search Areas page: search areas as top-level items (item
// data = their position), their excluded folders as children. It keeps no
// data of its own; its context menu, Delete, F2, in-place renames and info
// tips go to the window it sits in, which must implement
// ISearchAreaTreeOwner (without one they do nothing).

#include <QTreeWidget>

#include <memory>

class QMenu;

namespace pages {

class ISearchAreaTreeOwner
{
public:
    // A command of the context menu or of the keys (resources ID_*).
    virtual void OnTreeCommand(int command) = 0;
    // The end of an in-place rename of item; true accepts text as its label.
    virtual bool OnEndLabelEdit(QTreeWidgetItem &item, const QString &text) = 0;
    // The text shown while the mouse rests on item.
    virtual QString InfoTip(const QTreeWidgetItem &item) const = 0;

protected:
    ~ISearchAreaTreeOwner() = default;
};

class CConMenuCTreeCtrl final : public QTreeWidget
{
    Q_OBJECT

public:
    explicit CConMenuCTreeCtrl(QWidget *parent);

    // Items without a tree yet; only search areas can be renamed.
    static QTreeWidgetItem *NewSearchAreaItem(const QString &text, const QIcon &icon, int position);
    static QTreeWidgetItem *NewExcludedFolderItem(const QString &text, const QIcon &icon);

    static bool IsSearchArea(const QTreeWidgetItem &item) { return item.parent() == nullptr; }
    // A search-area item's position in the page's list.
    static int Position(const QTreeWidgetItem &item);
    static void SetPosition(QTreeWidgetItem &item, int position);

    // The one selected item, or null.
    QTreeWidgetItem *SelectedItem() const;
    // Makes item the selected and current one; null clears the selection.
    void Select(QTreeWidgetItem *item);

    // Starts the in-place rename of item; false for anything but a search area.
    bool EditLabel(QTreeWidgetItem *item);
    bool IsEditingLabel() const { return state() == EditingState; }

    // The context menu for the present selection: entries with their
    // commands (action data) and states.
    std::unique_ptr<QMenu> MakeContextMenu();
    // Where the menu opens without a mouse position: below the selected
    // item's text, else at the tree's upper left corner (global coordinates).
    QPoint KeyboardMenuPosition() const;
    // The info tip for the item at a point of the viewport; empty when none.
    QString InfoTipAt(const QPoint &viewportPosition) const;

protected:
    void contextMenuEvent(QContextMenuEvent *event) override;
    void keyPressEvent(QKeyEvent *event) override;
    bool viewportEvent(QEvent *event) override;

private:
    ISearchAreaTreeOwner *Owner() const;
    void ShowContextMenu(const QPoint &globalPosition);
    void Forward(int command);
};

} // namespace pages
