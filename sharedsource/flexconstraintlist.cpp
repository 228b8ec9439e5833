#include "sharedsource/flexconstraintlist.h"

#include "sharedsource/dialogtemplate.h"

#include <QComboBox>
#include <QWidget>

#include <algorithm>

void CNSFlexConstraintList::Add(int controlId, const CNSFlexHorizontalConstraint &horizontal,
                                const CNSFlexVerticalConstraint &vertical, bool immediate)
{
    m_entries.push_back(Entry{controlId, QRect(), {horizontal.Clone(), {}}, {vertical.Clone(), {}}, immediate});
}

bool CNSFlexConstraintList::Capture()
{
    for (Entry &entry : m_entries) {
        QWidget *control = sharedsource::FindControl(m_dialog, entry.id);
        if (!control)
            return false; // tried again at the next resize
        QRect rect = control->geometry();
        // A combo box takes part in the layout with its list dropped down,
        // so a stretched combo keeps the height of its open list.
        if (qobject_cast<QComboBox *>(control))
            rect.setHeight(sharedsource::DroppedHeight(*control));
        entry.start = rect;
        entry.horizontal->OnCapture(m_dialog, m_baseline.width());
        entry.vertical->OnCapture(m_dialog, m_baseline.height());
    }
    m_captured = true;
    return true;
}

void CNSFlexConstraintList::Place(const Entry &entry, int dx, int dy) const
{
    QWidget *control = sharedsource::FindControl(m_dialog, entry.id);
    if (!control)
        return;
    // QRect's right and bottom are inclusive; the rule works on exclusive edges.
    const int left = entry.horizontal->LeadingEdge(entry.start.left(), dx);
    const int right = entry.horizontal->TrailingEdge(entry.start.left() + entry.start.width(), dx);
    const int top = entry.vertical->LeadingEdge(entry.start.top(), dy);
    const int bottom = entry.vertical->TrailingEdge(entry.start.top() + entry.start.height(), dy);
    if (qobject_cast<QComboBox *>(control)) {
        control->setProperty(sharedsource::kDroppedHeightProperty, bottom - top);
        control->setGeometry(left, top, right - left, control->height());
        return;
    }
    control->setGeometry(left, top, right - left, bottom - top);
}

void CNSFlexConstraintList::Resize(QSize clientSize)
{
    if (m_entries.empty())
        return;
    if (!m_captured && !Capture())
        return;
    const int dx = std::max(0, clientSize.width() - m_baseline.width());
    const int dy = std::max(0, clientSize.height() - m_baseline.height());

    // Qt has no deferred multi-window move: the deferred entries are placed
    // together after the immediate ones, with painting held until all moved.
    const bool updates = m_dialog->updatesEnabled();
    m_dialog->setUpdatesEnabled(false);
    for (const Entry &entry : m_entries) {
        if (entry.immediate)
            Place(entry, dx, dy);
    }
    for (const Entry &entry : m_entries) {
        if (!entry.immediate)
            Place(entry, dx, dy);
    }
    m_dialog->setUpdatesEnabled(updates);
}
