#pragma once

// "Automatic Indexing Triggered By": whether the index is updated only by
// the schedule (trigger 0) or as soon as data files change (trigger 1).
// Talks to no server; its owner writes the choice.

#include "sharedsource/basedlg.h"
#include "sorvik/serverdialogs.h"

class QRadioButton;

namespace pages {

class CIndexMonitoringDlg final : public sharedsource::ToBaseDlg<CNSFlexDialog>
{
    Q_OBJECT

public:
    // The host's font and help come from parent, or from SetHostSettings.
    CIndexMonitoringDlg(std::int32_t trigger, QWidget *parent = nullptr);

    std::int32_t Trigger() const { return m_trigger; }
    // After OK: true when the index follows data file changes.
    bool IsChangeTriggered() const { return m_trigger != 0; }

    static constexpr char16_t kHelpTopic[] = u"ROAM_SEARCH_CRAWLER_CONTROL_DIALOG";

    bool OnInitDialog() override;

protected:
    bool DataExchange(bool save) override;

private:
    void ShowExplanation(std::int32_t trigger);
    QRadioButton &Radio(int id) const;

    std::int32_t m_trigger;
};

} // namespace pages
