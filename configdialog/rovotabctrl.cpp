#include "configdialog/rovotabctrl.h"

namespace cv::vek::rovo::configdialog {

CROVOTabCtrl::CROVOTabCtrl(QWidget *parent) : ToTabCtrl(parent) {}

bool CROVOTabCtrl::CanLeavePage(int index)
{
    return !m_leaveCheck || m_leaveCheck(index);
}

} // namespace cv::vek::rovo::configdialog
