#pragma once

// The layout rules a resizable dialog declared for its controls, and the
// rule that applies them: controls keep their start rectangle plus the
// share of the dialog's growth that their constraints give each edge.

#include "sharedsource/flexconstraint.h"

#include <QRect>
#include <QSize>

#include <memory>
#include <vector>

class QWidget;

class CNSFlexConstraintList final
{
public:
    explicit CNSFlexConstraintList(QWidget *dialog) : m_dialog(dialog) {}
    CNSFlexConstraintList(const CNSFlexConstraintList &) = delete;
    CNSFlexConstraintList &operator=(const CNSFlexConstraintList &) = delete;

    // Keeps copies of both constraints; nothing is measured yet.
    void Add(int controlId, const CNSFlexHorizontalConstraint &horizontal, const CNSFlexVerticalConstraint &vertical,
             bool immediate);
    void SetBaseline(QSize clientSize) { m_baseline = clientSize; }
    QSize Baseline() const { return m_baseline; }
    bool IsCaptured() const { return m_captured; }
    // The next resize measures the start rectangles again.
    void Uncapture() { m_captured = false; }
    std::size_t Count() const { return m_entries.size(); }

    // Lays the controls out for the new client size, measuring their start
    // rectangles first if that has not happened yet.
    void Resize(QSize clientSize);

private:
    struct AxisDeleter
    {
        void operator()(CNSFlexAxisConstraint *c) const { c->Destroy(); }
    };
    struct Entry
    {
        int id;
        QRect start;
        std::unique_ptr<CNSFlexAxisConstraint, AxisDeleter> horizontal;
        std::unique_ptr<CNSFlexAxisConstraint, AxisDeleter> vertical;
        bool immediate;
    };

    bool Capture();
    void Place(const Entry &entry, int dx, int dy) const;

    QWidget *m_dialog;
    QSize m_baseline;
    std::vector<Entry> m_entries;
    bool m_captured = false;
};
