#pragma once

// The resizable dialog every dialog and page stands on: controls follow
// the window by their declared constraints, the window never gets smaller
// than its template, and OK and Apply go through one confirm path that
// lets the concrete dialog check and store its values first.

#include "sharedsource/flexconstraintlist.h"
#include "sharedsource/help.h"

#include <QDialog>

#include <cstdint>

namespace sharedsource {

// Modal results as hosts know them.
constexpr int kResultOk = 1;
constexpr int kResultCancel = 2;

} // namespace sharedsource

class CNSFlexDialog : public QDialog
{
    Q_OBJECT

public:
    explicit CNSFlexDialog(QWidget *parent = nullptr, std::uintptr_t applyContext = 0);
    ~CNSFlexDialog() override;

    // Declared by concrete dialogs in their constructors, before any control exists.
    void AddConstraint(int controlId, const CNSFlexHorizontalConstraint &horizontal,
                       const CNSFlexVerticalConstraint &vertical, bool immediate = false);
    const CNSFlexConstraintList &Constraints() const { return m_constraints; }

    // Mirrors the enabled state of the Apply button, if the dialog has one.
    void SetModified(bool modified);
    bool IsModified() const { return m_modified; }

    void SetApplyContext(std::uintptr_t context) { m_applyContext = context; }
    std::uintptr_t ApplyContext() const { return m_applyContext; }
    QSize MinimumSize() const { return m_minimumSize; }

    // Once the controls exist: records the minimum size and the layout
    // baseline, wires the standard buttons, disables Apply.
    virtual bool OnInitDialog();

    void accept() override; // OK: data exchange, apply, then close with OK
    void reject() override; // closes with Cancel

protected:
    // Moves values between the controls and the dialog's variables; when
    // saving, false means the input was rejected (the dialog stays open).
    virtual bool DataExchange(bool save);
    // Checks and stores the values; false keeps the dialog open.
    virtual bool OnApply(std::uintptr_t applyContext);
    // The help button and F1; the base offers no help.
    virtual void OnHelp() {}

    void OnApplyNow();

    void resizeEvent(QResizeEvent *event) override;
    void keyPressEvent(QKeyEvent *event) override;

private:
    CNSFlexConstraintList m_constraints;
    QSize m_minimumSize;
    bool m_modified = false;
    bool m_initialised = false;
    std::uintptr_t m_applyContext;
};
