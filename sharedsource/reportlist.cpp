#include "sharedsource/reportlist.h"

#include <QHeaderView>
#include <QMouseEvent>
#include <QPainter>
#include <QStyledItemDelegate>

#include <algorithm>

namespace sharedsource {

namespace {

constexpr int kStateRole = Qt::UserRole + 0x5e1;
constexpr int kStateMargin = 2;

// Draws the state image in front of the first column's own content.
class StateImageDelegate final : public QStyledItemDelegate
{
public:
    StateImageDelegate(const QList<QPixmap> &images, QObject *parent) : QStyledItemDelegate(parent), m_images(images) {}

    static int Width(const QList<QPixmap> &images)
    {
        int width = 0;
        for (const QPixmap &image : images)
            width = std::max(width, int(image.width() / image.devicePixelRatio()));
        return width ? width + 2 * kStateMargin : 0;
    }

    void paint(QPainter *painter, const QStyleOptionViewItem &option, const QModelIndex &index) const override
    {
        const int width = index.column() == 0 ? Width(m_images) : 0;
        if (width == 0) {
            QStyledItemDelegate::paint(painter, option, index);
            return;
        }
        QStyleOptionViewItem rest = option;
        rest.rect.setLeft(option.rect.left() + width);
        QStyledItemDelegate::paint(painter, rest, index);
        const int state = index.data(kStateRole).toInt();
        if (state <= 0 || state >= m_images.size())
            return;
        const QPixmap &image = m_images[state];
        const QSize size = image.size() / image.devicePixelRatio();
        const QPoint at(option.rect.left() + kStateMargin,
                        option.rect.top() + (option.rect.height() - size.height()) / 2);
        painter->drawPixmap(QRect(at, size), image);
    }

    QSize sizeHint(const QStyleOptionViewItem &option, const QModelIndex &index) const override
    {
        QSize size = QStyledItemDelegate::sizeHint(option, index);
        if (index.column() == 0 && !m_images.isEmpty()) {
            size.rwidth() += Width(m_images);
            size.setHeight(
                std::max(size.height(), int(m_images.front().height() / m_images.front().devicePixelRatio())));
        }
        return size;
    }

private:
    QList<QPixmap> m_images;
};

} // namespace

ToReportList::ToReportList(QWidget *parent) : QTreeWidget(parent)
{
    setRootIsDecorated(false);
    setItemsExpandable(false);
    setUniformRowHeights(true);
    setAllColumnsShowFocus(true);
    setSelectionBehavior(QAbstractItemView::SelectRows);
    setSelectionMode(QAbstractItemView::ExtendedSelection);
    header()->setStretchLastSection(false);
    header()->setSectionsMovable(false);
}

void ToReportList::SetColumns(const QStringList &titles)
{
    setColumnCount(int(titles.size()));
    setHeaderLabels(titles);
}

void ToReportList::SetStateImages(const QList<QPixmap> &images)
{
    m_stateImages = images;
    QAbstractItemDelegate *previous = itemDelegateForColumn(0);
    setItemDelegateForColumn(0, new StateImageDelegate(images, this));
    delete previous;
    viewport()->update();
}

void ToReportList::SetState(QTreeWidgetItem &item, int state)
{
    item.setData(0, kStateRole, state);
}

int ToReportList::State(const QTreeWidgetItem &item)
{
    return item.data(0, kStateRole).toInt();
}

int ToReportList::StateImageWidth() const
{
    return StateImageDelegate::Width(m_stateImages);
}

QRect ToReportList::StateImageRect(const QTreeWidgetItem &item) const
{
    const QRect row = visualItemRect(&item);
    const int width = StateImageWidth();
    if (width == 0 || row.isNull())
        return {};
    const int left = header()->sectionViewportPosition(0);
    return QRect(left, row.top(), width, row.height());
}

void ToReportList::FitColumns()
{
    for (int column = 0; column < columnCount(); ++column)
        resizeColumnToContents(column);
}

QList<QTreeWidgetItem *> ToReportList::Rows() const
{
    QList<QTreeWidgetItem *> rows;
    for (int i = 0; i < topLevelItemCount(); ++i)
        rows << topLevelItem(i);
    return rows;
}

void ToReportList::SelectRow(int row)
{
    if (QTreeWidgetItem *item = topLevelItem(row)) {
        setCurrentItem(item);
        clearSelection();
        item->setSelected(true);
        scrollToItem(item);
    }
}

void ToReportList::mousePressEvent(QMouseEvent *event)
{
    if (event->button() == Qt::LeftButton) {
        QTreeWidgetItem *item = itemAt(event->position().toPoint());
        if (item && StateImageRect(*item).contains(event->position().toPoint())) {
            emit stateImageClicked(item);
            event->accept();
            return;
        }
    }
    QTreeWidget::mousePressEvent(event);
}

QList<QPixmap> SplitImageStrip(const QPixmap &strip, int count)
{
    QList<QPixmap> images;
    if (count <= 0 || strip.isNull())
        return images;
    const int width = strip.width() / count;
    for (int i = 0; i < count; ++i) {
        QPixmap image = strip.copy(i * width, 0, width, strip.height());
        image.setDevicePixelRatio(strip.devicePixelRatio());
        images << image;
    }
    return images;
}

} // namespace sharedsource
