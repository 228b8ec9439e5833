#pragma once

// A list in report view: rows of columns, whole rows selected, and an
// optional state image in front of each row (a check box drawn from the
// dialog's own images, numbered by state; state 0 shows none).

#include <QList>
#include <QPixmap>
#include <QTreeWidget>

namespace sharedsource {

class ToReportList final : public QTreeWidget
{
    Q_OBJECT

public:
    explicit ToReportList(QWidget *parent = nullptr);

    void SetColumns(const QStringList &titles);
    // Image i stands for state i; state 0 never shows an image.
    void SetStateImages(const QList<QPixmap> &images);
    void SetState(QTreeWidgetItem &item, int state);
    static int State(const QTreeWidgetItem &item);
    // Where the state image of a row is drawn, in viewport coordinates.
    QRect StateImageRect(const QTreeWidgetItem &item) const;

    // Every column as wide as its title and its widest text.
    void FitColumns();
    QList<QTreeWidgetItem *> Rows() const;
    int RowOf(const QTreeWidgetItem *item) const { return indexOfTopLevelItem(const_cast<QTreeWidgetItem *>(item)); }
    void SelectRow(int row);

signals:
    // The user clicked the state image of item.
    void stateImageClicked(QTreeWidgetItem *item);

protected:
    void mousePressEvent(QMouseEvent *event) override;

private:
    int StateImageWidth() const;

    QList<QPixmap> m_stateImages;
};

// Splits a horizontal strip of count equally wide images.
QList<QPixmap> SplitImageStrip(const QPixmap &strip, int count);

} // namespace sharedsource
