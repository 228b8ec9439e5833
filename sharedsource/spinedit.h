#pragma once

// An edit field for a whole number with up and down buttons beside it.
// The buttons and the arrow keys step by one and clamp the result to the
// range; typing is not clamped (only digits can be typed), so that a value
// out of range reaches the page's own check and its message.

#include <QWidget>

#include <cstdint>
#include <optional>

class QLineEdit;
class QToolButton;

namespace sharedsource {

class ToSpinEdit final : public QWidget
{
    Q_OBJECT

public:
    explicit ToSpinEdit(QWidget *parent = nullptr);

    void SetRange(std::uint32_t minimum, std::uint32_t maximum);
    std::uint32_t Minimum() const { return m_minimum; }
    std::uint32_t Maximum() const { return m_maximum; }

    // Nothing when the field is empty or holds more than 32 bits.
    std::optional<std::uint32_t> Value() const;
    void SetValue(std::uint32_t value);

    // Each step changes the value by one and clamps it into the range; an
    // empty field steps from the range's nearer end.
    void StepBy(int steps);

    QLineEdit &Edit() const { return *m_edit; }
    QToolButton &UpButton() const { return *m_up; }
    QToolButton &DownButton() const { return *m_down; }

signals:
    void valueEdited();

protected:
    void resizeEvent(QResizeEvent *event) override;
    bool eventFilter(QObject *watched, QEvent *event) override;

private:
    QLineEdit *m_edit;
    QToolButton *m_up;
    QToolButton *m_down;
    std::uint32_t m_minimum = 0;
    std::uint32_t m_maximum = 9999;
};

} // namespace sharedsource
