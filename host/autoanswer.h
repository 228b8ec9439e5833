#pragma once

// Answers for automation (--answers): each time a modal window appears, or
// becomes the active modal window again, the next answer is given to it.
// "ok", "cancel", "yes" and "no" press those buttons of a message box; on a
// dialog "ok" presses its default button (so the dialog's own checks run)
// and "cancel" cancels it. A window that finds no answer left, or none that
// fits, is cancelled and counted as unanswered. Every window answered is
// reported on stdout as "modal: <title> | <message text>" and "answer: <word>".

#include <QObject>
#include <QPointer>
#include <QStringList>
#include <QTimer>

class QWidget;

namespace host {

class AutoAnswer final : public QObject
{
    Q_OBJECT

public:
    // False for a word that is not an answer.
    static bool IsAnswer(const QString &word);

    explicit AutoAnswer(QStringList answers);
    int Unanswered() const { return m_unanswered; }
    int Answered() const { return m_answered; }

private:
    void Poll();
    bool Answer(QWidget &window, const QString &answer);

    QStringList m_answers;
    QTimer m_timer;
    QPointer<QWidget> m_candidate;
    QPointer<QWidget> m_last;
    int m_unanswered = 0;
    int m_answered = 0;
};

} // namespace host
