#pragma once

// The modal dialog that adds a search area or edits one: a display name and
// a folder, checked against the file system, the existing search areas and
// the server's policy (through the owner's IInputTester) before it closes
// with OK.

#include "sharedsource/basedlg.h"
#include "sharedsource/prompts.h"
#include "sorvik/serverdialogs.h"

#include <QString>

class QLineEdit;

namespace pages {

class IPathInspector;

class CAddSearchAreaDlg final : public sharedsource::ToBaseDlg<CNSFlexDialog>
{
    Q_OBJECT

public:
    // The host's font and help come from the window around it, or from SetHostSettings.
    CAddSearchAreaDlg(const QString &name, const QString &serverPath, const QString &path, IInputTester &tester,
                      bool editMode, QWidget *parent = nullptr);

    void SetPathInspector(IPathInspector &inspector) { m_inspector = &inspector; }

    // After OK: the entered name, or the default name of the path when empty.
    QString Name();
    // After OK, each without one trailing separator (a lone separator stays).
    QString ServerPath() const;
    QString Path() const;
    bool IsEditMode() const { return m_editMode; }

    static constexpr char16_t kAddHelpTopic[] = u"ROAM_SEARCH_ADD_SEARCHAREA_DIALOG";
    static constexpr char16_t kEditHelpTopic[] = u"ROAM_SEARCH_EDIT_SEARCHAREA_DIALOG";

    std::u16string HelpTopic() const override;
    bool OnInitDialog() override;

protected:
    bool DataExchange(bool save) override;
    bool OnApply(std::uintptr_t applyContext) override;

private:
    void OnBrowse();
    bool ConfirmLocation();
    bool ConfirmAgainstSearchAreas();
    void ShowInputError(const QString &text);
    sharedsource::MessageResult Ask(const QString &text, const QString &caption, sharedsource::MessageIcon icon,
                                    sharedsource::MessageButtons buttons);
    QLineEdit &NameEdit() const;
    QLineEdit &PathEdit() const;

    QString m_name;
    QString m_initialName;
    QString m_path;
    QString m_serverPath;
    bool m_editMode;
    IInputTester &m_tester;
    IPathInspector *m_inspector;
};

} // namespace pages
