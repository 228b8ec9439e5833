#include "optimize/optimizecustompropswaitdlg.h"

#include "resources/templates.h"
#include "sharedsource/animation.h"

#include <QCloseEvent>
#include <QGuiApplication>
#include <QScreen>

namespace cv::vek::rovo::optimize {

COptimizeCustomPropsWaitDlg::COptimizeCustomPropsWaitDlg(krn::RefPtr<cv::rovo::IIndexManager> indexManager,
                                                         const QString &title)
    : ToBaseDlg(resources::kWaitTemplate, nullptr),
      m_indexManager(std::move(indexManager)),
      m_title(title),
      m_entry(*this)
{
    m_poll.setInterval(kPollPeriod);
    connect(&m_poll, &QTimer::timeout, this, &COptimizeCustomPropsWaitDlg::OnPoll);
}

COptimizeCustomPropsWaitDlg::~COptimizeCustomPropsWaitDlg()
{
    m_poll.stop();
    if (m_thread) {
        m_thread->ForgetWindow();
        m_thread->SignalStop();
    }
    m_thread.reset(); // waits for the worker
}

bool COptimizeCustomPropsWaitDlg::Open(krn::RefPtr<cv::rovo::IIndexManager> indexManager, const QString &title,
                                       const sharedsource::HostSettings &host)
{
    auto *window = new COptimizeCustomPropsWaitDlg(std::move(indexManager), title);
    window->SetHostSettings(host);
    if (window->CreateModeless(nullptr) != 1) {
        delete window;
        return false;
    }
    return true;
}

bool COptimizeCustomPropsWaitDlg::OnInitDialog()
{
    ToBaseDlg::OnInitDialog();
    setWindowTitle(m_title);
    setWindowFlags(Qt::Dialog | Qt::WindowTitleHint | Qt::WindowSystemMenuHint | Qt::WindowCloseButtonHint);
    m_thread = std::make_unique<CWaitForOptimizationThread>(m_indexManager, &m_done, static_cast<IWaitWindow *>(this));
    m_thread->Start();
    m_poll.start();
    return true;
}

bool COptimizeCustomPropsWaitDlg::IsShown() const
{
    const std::lock_guard<std::mutex> guard(m_lock);
    return m_shown;
}

void COptimizeCustomPropsWaitDlg::PostShowRequest()
{
    // On the worker thread: only a queued call, never a wait for this thread.
    QMetaObject::invokeMethod(this, &COptimizeCustomPropsWaitDlg::OnShowRequest, Qt::QueuedConnection);
}

void COptimizeCustomPropsWaitDlg::OnShowRequest()
{
    const std::lock_guard<std::mutex> guard(m_lock);
    if (m_shown || m_closing)
        return;
    m_shown = true;
    const QRect area =
        parentWidget() ? parentWidget()->window()->geometry() : QGuiApplication::primaryScreen()->availableGeometry();
    move(area.center() - rect().center());
    auto &animation = sharedsource::GetControl<sharedsource::ToAnimation>(this, resources::IDC_WAIT_ANIMATION);
    if (!animation.Open(QString::fromLatin1(kAnimation)) || !animation.Play()) {
        done(sharedsource::kResultCancel);
        return;
    }
    show();
}

void COptimizeCustomPropsWaitDlg::OnPoll()
{
    if (m_done.load() != 0)
        Close();
}

void COptimizeCustomPropsWaitDlg::Close()
{
    if (m_closing)
        return;
    m_closing = true;
    m_poll.stop();
    if (m_thread) {
        m_thread->ForgetWindow();
        m_thread->SignalStop();
        m_thread->Join(); // the call in progress runs to its end
    }
    {
        const std::lock_guard<std::mutex> guard(m_lock);
        if (m_shown)
            sharedsource::GetControl<sharedsource::ToAnimation>(this, resources::IDC_WAIT_ANIMATION).Stop();
    }
    done(sharedsource::kResultOk);
    deleteLater();
}

void COptimizeCustomPropsWaitDlg::reject()
{
    Close();
}

void COptimizeCustomPropsWaitDlg::closeEvent(QCloseEvent *event)
{
    event->ignore(); // Close hides and deletes the window itself
    Close();
}

} // namespace cv::vek::rovo::optimize
