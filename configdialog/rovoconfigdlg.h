#pragma once

// The properties dialog: the whole configuration of one Sorvik on tab pages,
// written to the configuration editor as the user works and committed once
// on OK; configuration import and export; an error panel in place of the
// pages when the configuration cannot be read; and, after a commit, a wait
// window until the server has applied it.

#include "configdialog/propertypagefactory.h"
#include "configdialog/rovotabctrl.h"
#include "serverlibs/searchareas.h"
#include "sharedsource/basedlg.h"
#include "sorvik/wstring.h"

#include <array>
#include <cstdint>
#include <memory>
#include <string>

namespace cv::vek::rovo::configdialog {

class CROVOConfigDlg final : public sharedsource::ToBaseDlg<CNSFlexDialog>
{
    Q_OBJECT

public:
    static constexpr char16_t kErrorHelpTopic[] = u"ROAM_SEARCH_CONFIGURE_ERROR_DIALOG";

    // Opens the Sorvik of connection at once; what cannot be had stays
    // absent and shows as the error panel. Font and help come from
    // SetHostSettings or the window around it.
    CROVOConfigDlg(const krn::WString &connection, std::int32_t waitFlag, QWidget *parent = nullptr,
                   const IPropertyPageFactory &pages = ModulePropertyPages(),
                   serverlibs::SorvikOpener open = serverlibs::ModuleSorvikOpener());
    ~CROVOConfigDlg() override;

    bool OnInitDialog() override;
    std::u16string HelpTopic() const override;
    QWidget *CreateCustomControl(const sharedsource::ControlTemplate &control) override;

    // OK: every page saves, one commit when anything changed or a
    // configuration was imported, then the pages hear of it, the dialog
    // closes and the wait window follows the server.
    void accept() override;

    bool IsErrorMode() const { return m_errorMode; }
    bool HasImported() const { return m_imported; }
    pages::CPropertyPage *Page(PageSlot slot) const;
    CROVOTabCtrl &Tabs() { return m_tabs; }

    static std::u16string HelpTopicOf(PageSlot slot);

private:
    void AddPages();
    void EnterErrorMode();
    void SaveAndCommit();
    void FollowTheServer();
    bool CanLeave(int index);
    PageSlot SlotAt(int index) const;
    QString DisplayName() const;

    void OnImport();
    void OnExport();
    QString DefaultFileName() const;

    const IPropertyPageFactory &m_pageFactory;
    std::int32_t m_waitFlag;
    bool m_errorMode = false;
    bool m_imported = false;
    krn::RefPtr<cv::rovo::ISorvik> m_sorvik;
    krn::RefPtr<cv::rovo::IConfigurationEditor> m_editor;
    krn::RefPtr<cv::rovo::IConfigurationView> m_view;
    CROVOTabCtrl m_tabs; // made before and destroyed after the pages inside it
    std::array<std::unique_ptr<pages::CPropertyPage>, std::size(kPageSlots)> m_pages;
};

} // namespace cv::vek::rovo::configdialog
