#include "entry/serviceui.h"

#include <QCursor>
#include <QGuiApplication>

namespace cv::vek::rovo {

namespace {

class WindowlessServiceUi final : public IServiceUi
{
public:
    std::int32_t RunConfigurationDialog(const krn::WString &, const HostSettings &) override
    {
        return kDialogNotCreated;
    }
    std::int32_t RunOptimizeDialog(const krn::WString &, const HostSettings &) override { return kDialogNotCreated; }
    std::int32_t RunResetDialog(cv::rovo::ISorvik &, const HostSettings &) override { return kDialogNotCreated; }
    std::int32_t RunSearchAreaDialog(SearchAreaDialogData &, IInputTester &, const HostSettings &) override
    {
        return kDialogNotCreated;
    }
    bool ConfirmExcludeFolder(std::u16string_view) override { return false; }
    bool ConfirmRemoveSearchArea(std::u16string_view) override { return false; }
    void ReportUnknownError() override {}

    void BeginWaitCursor() override
    {
        if (qobject_cast<QGuiApplication *>(QCoreApplication::instance()))
            QGuiApplication::setOverrideCursor(QCursor(Qt::WaitCursor));
    }
    void EndWaitCursor() override
    {
        if (qobject_cast<QGuiApplication *>(QCoreApplication::instance()))
            QGuiApplication::restoreOverrideCursor();
    }
};

} // namespace

IServiceUi &ModuleServiceUi()
{
    static WindowlessServiceUi ui;
    return ui;
}

} // namespace cv::vek::rovo
