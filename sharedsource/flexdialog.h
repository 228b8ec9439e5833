#pragma once

// The resizable dialog every dialog and page stands on: controls follow
// the window by their declared constraints, the window never gets smaller
// than its template, and OK and Apply go through one confirm path that
// lets the concrete dialog check and store its values first.
//
// It also carries what the host set for the module's windows (font, help)
// and the prompts through which it asks the user; a dialog or page that
// has none of its own takes each from the nearest window around it.

#include "sharedsource/dialogtemplate.h"
#include "sharedsource/flexconstraintlist.h"
#include "sharedsource/hostsettings.h"
#include "sharedsource/prompts.h"
#include "sharedsource/toolbar.h"

#include <QDialog>
#include <QPointer>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

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
    bool HasApplyPending() const { return m_modified; }

    void SetApplyContext(std::uintptr_t context) { m_applyContext = context; }
    std::uintptr_t ApplyContext() const { return m_applyContext; }
    QSize MinimumSize() const { return m_minimumSize; }

    // Once the controls exist: records the minimum size (of a window; a page
    // takes the size its tab control gives) and the layout baseline, wires
    // the standard buttons, disables Apply.
    virtual bool OnInitDialog();

    // Makes size the new minimum and baseline, and the controls' present
    // places their start: for a dialog that rearranges itself (an error
    // panel in place of its pages) before it is resized.
    void RebaseLayout(QSize size);

    void accept() override; // OK: data exchange, apply, then close with OK
    void reject() override; // closes with Cancel

    // The host's settings for this window and those inside it. Settings not
    // given here come from the nearest enclosing dialog that has them.
    void SetHostSettings(const sharedsource::HostSettings &settings);
    void SetHostFont(const LOGFONTW &font);
    void SetHelpTarget(const sharedsource::HelpTarget &help);
    void SetPrompts(sharedsource::IPrompts &prompts);
    std::optional<LOGFONTW> HostFont() const;
    sharedsource::HelpTarget Help() const;
    // The module's Qt prompts when no window around has others.
    sharedsource::IPrompts &Prompts() const;

    // The key passed to the host's help; empty: no help.
    virtual std::u16string HelpTopic() const { return m_helpTopic; }
    void SetHelpTopic(std::u16string_view topic) { m_helpTopic = topic; }

    // A message box owned by this window, through its prompts.
    sharedsource::MessageResult Ask(const sharedsource::Message &message);

    // Makes the control of a Custom template entry as a child of this
    // dialog; null when it has none for that entry.
    virtual QWidget *CreateCustomControl(const sharedsource::ControlTemplate &control);

protected:
    // Moves values between the controls and the dialog's variables; when
    // saving, false means the input was rejected (the dialog stays open).
    virtual bool DataExchange(bool save);
    // Checks and stores the values; false keeps the dialog open.
    virtual bool OnApply(std::uintptr_t applyContext);
    // The help button and F1: the help topic to the host's help, if any.
    virtual void OnHelp();

    void OnApplyNow();

    // Places toolBar by the placeholder control now and after every layout pass.
    void PlaceToolBar(sharedsource::ToToolBar &toolBar, int placeholderId, sharedsource::ToolBarPlacement placement);

    void resizeEvent(QResizeEvent *event) override;
    void keyPressEvent(QKeyEvent *event) override;

private:
    const CNSFlexDialog *NearestWith(bool (*has)(const CNSFlexDialog &)) const;
    void PlaceToolBars();

    struct ToolBarPlace
    {
        QPointer<sharedsource::ToToolBar> toolBar;
        int placeholderId;
        sharedsource::ToolBarPlacement placement;
    };

    CNSFlexConstraintList m_constraints;
    QSize m_minimumSize;
    bool m_modified = false;
    bool m_initialised = false;
    std::uintptr_t m_applyContext;
    std::optional<LOGFONTW> m_hostFont;
    std::optional<sharedsource::HelpTarget> m_help;
    sharedsource::IPrompts *m_prompts = nullptr;
    std::u16string m_helpTopic;
    std::vector<ToolBarPlace> m_toolBars;
};
