#include "uitest.h"

#include "sharedsource/dialogtemplate.h"

#include <QDialog>

#include <gtest/gtest.h>

#include <cstdlib>

// Fontconfig keeps its configuration until FcFini, which Qt never calls; a
// sanitizer build would report it as a leak of every test that draws text.
extern "C" __attribute__((visibility("default"), used)) const char *__lsan_default_suppressions()
{
    return "leak:libfontconfig.so\n";
}

namespace uitest {

QApplication &Application()
{
    if (auto *app = qobject_cast<QApplication *>(QCoreApplication::instance()))
        return *app;
    ::setenv("QT_QPA_PLATFORM", "offscreen", 0);
    static int argc = 1;
    static char name[] = "uitest";
    static char *argv[] = {name, nullptr};
    static QApplication *app = new QApplication(argc, argv); // lives as long as the process
    return *app;
}

void ExpectNoWindowsLeft()
{
    if (!QCoreApplication::instance())
        return;
    QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
    for (QWidget *window : QApplication::topLevelWidgets()) {
        if (!window->isVisible() && !qobject_cast<QDialog *>(window))
            continue;
        ADD_FAILURE() << "a window was left behind: " << window->metaObject()->className() << " \""
                      << window->windowTitle().toStdString() << "\"";
        window->close();
    }
    QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
}

namespace {
HelpRecorder *g_recorder = nullptr;
} // namespace

HelpRecorder::HelpRecorder()
{
    g_recorder = this;
}

HelpRecorder::~HelpRecorder()
{
    g_recorder = nullptr;
}

void HelpRecorder::Record(BSTR topic, std::uintptr_t context)
{
    EXPECT_EQ(SysStringByteLen(topic), SysStringLen(topic) * 2) << "a counted string";
    ASSERT_NE(g_recorder, nullptr) << "help called after its recorder ended";
    g_recorder->calls.push_back(QString::fromUtf16(topic, SysStringLen(topic)).toStdString() + "@" +
                                std::to_string(context));
}

void ExpectLayout(QWidget &dialog, QSize growth, std::initializer_list<EdgeMoves> rows)
{
    std::vector<QRect> before;
    for (const EdgeMoves &row : rows)
        before.push_back(sharedsource::GetControl<QWidget>(&dialog, row.id).geometry());
    dialog.resize(dialog.size() + growth);
    std::size_t i = 0;
    for (const EdgeMoves &row : rows) {
        const QRect expected = before[i++].adjusted(row.left, row.top, row.right, row.bottom);
        const QRect actual = sharedsource::GetControl<QWidget>(&dialog, row.id).geometry();
        EXPECT_EQ(actual, expected) << "control " << row.id << " grown by " << growth.width() << "x" << growth.height();
    }
}

QLineEdit *LabelEditor(const QAbstractItemView &view)
{
    for (QLineEdit *editor : view.viewport()->findChildren<QLineEdit *>()) {
        if (editor->isVisibleTo(view.viewport()))
            return editor;
    }
    return nullptr;
}

ModalPoller::ModalPoller(std::chrono::milliseconds watchdog) : m_watchdog(watchdog)
{
    connect(&m_timer, &QTimer::timeout, this, &ModalPoller::Poll);
    m_timer.start(10);
    m_stepStart = std::chrono::steady_clock::now();
}

ModalPoller::~ModalPoller()
{
    for (const Step &step : m_steps)
        ADD_FAILURE() << "no modal window for: " << step.what;
}

void ModalPoller::Expect(std::string what, Match match, Act act)
{
    if (m_steps.empty())
        m_stepStart = std::chrono::steady_clock::now();
    m_steps.push_back(Step{std::move(what), std::move(match), std::move(act)});
}

void ModalPoller::Poll()
{
    if (m_steps.empty())
        return;
    QWidget *modal = QApplication::activeModalWidget();
    if (modal && modal != m_lastActed && modal->isVisible() && m_steps.front().match(*modal)) {
        Step step = std::move(m_steps.front());
        m_steps.pop_front();
        m_lastActed = modal;
        ++m_acted;
        m_stepStart = std::chrono::steady_clock::now();
        QPointer<QWidget> target(modal);
        QMetaObject::invokeMethod(
            this,
            [target, act = std::move(step.act)] {
                if (target)
                    act(*target);
            },
            Qt::QueuedConnection);
        return;
    }
    if (std::chrono::steady_clock::now() - m_stepStart > m_watchdog)
        GiveUp();
}

void ModalPoller::GiveUp()
{
    ADD_FAILURE() << "watchdog: no modal window for: " << m_steps.front().what;
    m_steps.clear();
    // Innermost first, so every modal loop ends.
    while (QWidget *modal = QApplication::activeModalWidget()) {
        if (auto *dialog = qobject_cast<QDialog *>(modal))
            dialog->done(QDialog::Rejected);
        else
            modal->close();
        if (QApplication::activeModalWidget() == modal)
            break;
    }
}

} // namespace uitest
