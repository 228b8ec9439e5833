#pragma once

// The properties dialog's tab control: before the user leaves a page it
// asks the dialog, which asks the page.

#include "sharedsource/tabctrl.h"

#include <functional>

namespace cv::vek::rovo::configdialog {

class CROVOTabCtrl final : public sharedsource::ToTabCtrl
{
    Q_OBJECT

public:
    using LeaveCheck = std::function<bool(int index)>;

    explicit CROVOTabCtrl(QWidget *parent = nullptr);
    void SetLeaveCheck(LeaveCheck check) { m_leaveCheck = std::move(check); }

protected:
    bool CanLeavePage(int index) override;

private:
    LeaveCheck m_leaveCheck;
};

} // namespace cv::vek::rovo::configdialog
