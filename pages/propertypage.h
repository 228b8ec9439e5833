#pragma once

// The pages of the properties dialog and what the dialog calls on them.
// The dialog reaches its pages through this contract only.

#include "sharedsource/basedlg.h"
#include "sharedsource/tabpagewnd.h"
#include "sorvik/rovoapi.h"

#include <QString>
#include <QStringList>

#include <cstdint>

namespace pages {

// Reload's answer when the page could not read the configuration.
constexpr std::int32_t kLoadFailed = std::int32_t(0x8000FFFF);

// The File Extensions page as the Parselets page keeps it current.
class IFileExtensionsPage
{
public:
    virtual void ParseletDeactivated(const QString &name, const QStringList &extensions) = 0;
    virtual void ParseletActivated(const QString &name, const QStringList &extensions) = 0;

protected:
    ~IFileExtensionsPage() = default;
};

class CPropertyPage : public sharedsource::ToBaseDlg<sharedsource::ToTabPageWnd<CNSFlexDialog>>
{
    Q_OBJECT

public:
    CPropertyPage(sharedsource::TemplateRef pageTemplate, QWidget *parent);

    // Writes what the page keeps until the dialog is confirmed; true when it
    // recorded changes in the editor. May throw cv::vek::com::cErrCode 21
    // after telling the user what is wrong, which keeps the dialog open.
    virtual bool SavePage();
    // True when the page wrote changes to the editor since its last load.
    virtual bool IsModified() const;
    // Loads the page from the configuration again, dropping what it kept;
    // 0, or kLoadFailed.
    virtual std::int32_t Reload();
    // Asked before the user leaves the page; false keeps it.
    virtual bool CanLeavePage();
    // After the dialog committed (or had nothing to commit) on OK.
    virtual void AfterCommit(cv::rovo::ISorvik *sorvik);
    virtual void SetFileExtensionsPage(IFileExtensionsPage *page);

    // Loads the page when its window is made.
    bool OnInitDialog() override;
    // What the load at initialisation answered.
    bool LoadFailed() const { return m_loadResult < 0; }

private:
    std::int32_t m_loadResult = 0;
};

} // namespace pages
