#pragma once

// The wait window after a commit: hidden while the server applies the
// changes quickly, shown with a looping animation once the first wait for
// the server timed out, closed when the server has finished or failed, by
// the user, or by the module's last Cleanup. It deletes itself when closed.

#include "optimize/waitforoptimizationthread.h"
#include "sharedsource/basedlg.h"
#include "sharedsource/opendialoglist.h"
#include "sorvik/serverdialogs.h"

#include <QString>
#include <QTimer>

#include <atomic>
#include <memory>
#include <mutex>

namespace cv::vek::rovo::optimize {

class COptimizeCustomPropsWaitDlg final : public sharedsource::ToBaseDlg<CNSFlexDialog>,
                                          public INonModalDialog,
                                          private IWaitWindow
{
    Q_OBJECT

public:
    static constexpr int kPollTimerId = 2510;
    static constexpr std::chrono::milliseconds kPollPeriod{250};
    static constexpr char kAnimation[] = "wait.gif";

    COptimizeCustomPropsWaitDlg(krn::RefPtr<cv::rovo::IIndexManager> indexManager, const QString &title);
    ~COptimizeCustomPropsWaitDlg() override;

    // Makes the window without a parent; it stays hidden until the server
    // is slow and goes by itself. False when it could not be made (it is
    // deleted then).
    static bool Open(krn::RefPtr<cv::rovo::IIndexManager> indexManager, const QString &title,
                     const sharedsource::HostSettings &host);

    bool OnInitDialog() override;
    // Closes the window now; a wait in progress runs to its end first.
    void Close() override;

    // The server is slow: shows the window with its animation, once.
    void OnShowRequest();
    bool IsShown() const;
    int WaitCalls() const { return m_thread ? m_thread->Calls() : 0; }

protected:
    void reject() override; // the window's close command
    void closeEvent(QCloseEvent *event) override;

private:
    void PostShowRequest() override;
    void OnPoll();

    krn::RefPtr<cv::rovo::IIndexManager> m_indexManager;
    QString m_title;
    mutable std::mutex m_lock; // guards m_shown and the animation
    bool m_shown = false;
    bool m_closing = false;
    std::atomic<std::int32_t> m_done{0};
    QTimer m_poll;
    sharedsource::OpenDialogEntry m_entry;
    std::unique_ptr<CWaitForOptimizationThread> m_thread;
};

} // namespace cv::vek::rovo::optimize
