#pragma once

// "Automatic Indexing Triggered By": whether the index is updated only by
// the schedule (trigger 0) or as soon as data files change (trigger 1).
// Talks to no server; its owner writes the choice.

#include "sharedsource/basedlg.h"
#include "sorvik/serverdialogs.h"

#include <optional>

namespace pages {

class CIndexMonitoringDlg final : public sharedsource::ToBaseDlg<CNSFlexDialog>
{
    Q_OBJECT

public:
    CIndexMonitoringDlg(std::int32_t trigger, SorvikHelpCallback helpCallback, std::uintptr_t helpContext,
                        const LOGFONTW *hostFont);

    std::int32_t Trigger() const { return m_trigger; }
    // After OK: true when the index follows data file changes.
    bool IsChangeTriggered() const { return m_trigger != 0; }

    static constexpr char16_t kHelpTopic[] = u"ROAM_SEARCH_CRAWLER_CONTROL_DIALOG";

    bool GetDialogFont(LOGFONTW &font) const override;
    bool OnInitDialog() override;

protected:
    bool DataExchange(bool save) override;
    void OnHelp() override;

private:
    void ShowExplanation(std::int32_t trigger);

    std::int32_t m_trigger;
    sharedsource::HelpTarget m_help;
    std::optional<LOGFONTW> m_font;
};

} // namespace pages
