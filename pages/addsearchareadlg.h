#pragma once

// The modal dialog that adds a search area or edits one: a display name and
// a folder, checked against the file system, the existing search areas and
// the server's policy (through the owner's IInputTester) before it closes
// with OK.

#include "sharedsource/basedlg.h"
#include "sharedsource/prompts.h"
#include "sorvik/serverdialogs.h"

#include <QString>

#include <optional>

namespace pages {

class IPathInspector;

class CAddSearchAreaDlg final : public sharedsource::ToBaseDlg<CNSFlexDialog>
{
    Q_OBJECT

public:
    // hostFont null: the template's font size in the fallback face.
    CAddSearchAreaDlg(const QString &name, const QString &serverPath, const QString &path, IInputTester &tester,
                      bool editMode, SorvikHelpCallback helpCallback, std::uintptr_t helpContext,
                      const LOGFONTW *hostFont, QWidget *parent = nullptr);

    void SetPrompts(sharedsource::IPrompts &prompts) { m_prompts = &prompts; }
    void SetPathInspector(IPathInspector &inspector) { m_inspector = &inspector; }

    // After OK: the entered name, or the default name of the path when empty.
    QString Name();
    // After OK, each without one trailing separator (a lone separator stays).
    QString ServerPath() const;
    QString Path() const;
    bool IsEditMode() const { return m_editMode; }

    static constexpr char16_t kAddHelpTopic[] = u"ROAM_SEARCH_ADD_SEARCHAREA_DIALOG";
    static constexpr char16_t kEditHelpTopic[] = u"ROAM_SEARCH_EDIT_SEARCHAREA_DIALOG";

    bool GetDialogFont(LOGFONTW &font) const override;
    bool OnInitDialog() override;

protected:
    bool DataExchange(bool save) override;
    bool OnApply(std::uintptr_t applyContext) override;
    void OnHelp() override;

private:
    void OnBrowse();
    bool ConfirmLocation();
    bool ConfirmAgainstSearchAreas();
    void ShowInputError(const QString &text);
    sharedsource::MessageResult Ask(const QString &text, const QString &caption, sharedsource::MessageIcon icon,
                                    sharedsource::MessageButtons buttons);

    QString m_name;
    QString m_initialName;
    QString m_path;
    QString m_serverPath;
    bool m_editMode;
    IInputTester &m_tester;
    sharedsource::HelpTarget m_help;
    std::optional<LOGFONTW> m_font;
    sharedsource::IPrompts *m_prompts;
    IPathInspector *m_inspector;
};

} // namespace pages
