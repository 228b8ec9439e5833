#pragma once

// Helpers for tests that drive real widgets: the application (offscreen),
// a poller that acts on modal windows as they appear, and the check that
// a test leaves no window behind.

#include "sharedsource/help.h"

#include <QAbstractItemView>
#include <QApplication>
#include <QLineEdit>
#include <QPointer>
#include <QTimer>
#include <QWidget>

#include <chrono>
#include <deque>
#include <functional>
#include <initializer_list>
#include <string>
#include <vector>

namespace uitest {

// The test process's widget application, created on first use.
QApplication &Application();

// Fails the current test for every visible top-level window or dialog
// still alive, and closes them.
void ExpectNoWindowsLeft();

// Steps run one after another: each waits until the active modal window
// matches (and is not the window the previous step acted on), then acts on
// it from the event loop, so an action may open a nested modal window. A
// step that does not match within its time fails the test and closes every
// modal window, so a wrong expectation fails instead of hanging.
class ModalPoller final : public QObject
{
public:
    using Match = std::function<bool(QWidget &)>;
    using Act = std::function<void(QWidget &)>;

    explicit ModalPoller(std::chrono::milliseconds watchdog = std::chrono::seconds(5));
    ~ModalPoller() override;

    void Expect(std::string what, Match match, Act act);
    // True when every step has acted.
    bool Done() const { return m_steps.empty(); }
    int Acted() const { return m_acted; }

private:
    struct Step
    {
        std::string what;
        Match match;
        Act act;
    };
    void Poll();
    void GiveUp();

    std::chrono::milliseconds m_watchdog;
    std::deque<Step> m_steps;
    QTimer m_timer;
    std::chrono::steady_clock::time_point m_stepStart;
    QPointer<QWidget> m_lastActed;
    int m_acted = 0;
};

// Records what reaches the host's help while it exists: "TOPIC@context"
// per call, after checking that the topic came as a counted string.
class HelpRecorder final
{
public:
    HelpRecorder();
    HelpRecorder(const HelpRecorder &) = delete;
    HelpRecorder &operator=(const HelpRecorder &) = delete;
    ~HelpRecorder();

    sharedsource::HelpTarget Target(std::uintptr_t context = 7) const { return {&Record, context}; }
    std::vector<std::string> calls;

private:
    static void Record(BSTR topic, std::uintptr_t context);
};

// One row of a layout check: how far each edge of a control moved.
struct EdgeMoves
{
    int id;
    int left = 0, top = 0, right = 0, bottom = 0;
};
// Grows dialog by growth and checks every row against the control's rectangle before.
void ExpectLayout(QWidget &dialog, QSize growth, std::initializer_list<EdgeMoves> rows);

// The in-place editor an item view shows now (an earlier one may linger
// hidden until it is deleted), or null.
QLineEdit *LabelEditor(const QAbstractItemView &view);

// Matchers and actions used by most tests.
template <typename Widget>
ModalPoller::Match Is()
{
    return [](QWidget &w) { return qobject_cast<Widget *>(&w) != nullptr; };
}

} // namespace uitest
