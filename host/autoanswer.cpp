#include "host/autoanswer.h"

#include <QApplication>
#include <QDialog>
#include <QMessageBox>
#include <QPushButton>

#include <cstdio>

namespace host {

namespace {

// Later, from the event loop: the click may open a nested modal window.
void ClickLater(QAbstractButton *button)
{
    QMetaObject::invokeMethod(button, &QAbstractButton::click, Qt::QueuedConnection);
}

void Report(QWidget &window, const QString &answer)
{
    QString text;
    if (auto *box = qobject_cast<QMessageBox *>(&window))
        text = box->text();
    std::printf("modal: %s | %s\nanswer: %s\n", qUtf8Printable(window.windowTitle()),
                qUtf8Printable(QString(text).replace(u'\n', u' ')), qUtf8Printable(answer));
    std::fflush(stdout);
}

} // namespace

bool AutoAnswer::IsAnswer(const QString &word)
{
    return word == u"ok" || word == u"cancel" || word == u"yes" || word == u"no";
}

AutoAnswer::AutoAnswer(QStringList answers) : m_answers(std::move(answers))
{
    connect(&m_timer, &QTimer::timeout, this, &AutoAnswer::Poll);
    m_timer.start(20);
}

void AutoAnswer::Poll()
{
    QWidget *modal = QApplication::activeModalWidget();
    // A window must stay the active modal one for a whole poll: a dialog is
    // that for a moment between a box closing and the dialog itself closing.
    if (modal != m_candidate) {
        m_candidate = modal;
        return;
    }
    if (modal == m_last)
        return;
    m_last = modal;
    if (!modal || !modal->isVisible())
        return;
    const QString answer = m_answers.isEmpty() ? QString() : m_answers.takeFirst();
    if (!answer.isEmpty() && Answer(*modal, answer)) {
        ++m_answered;
        return;
    }
    ++m_unanswered;
    std::fprintf(stderr, "sorvik-config: no fitting answer for \"%s\"; cancelled\n",
                 qUtf8Printable(modal->windowTitle()));
    if (auto *dialog = qobject_cast<QDialog *>(modal))
        QMetaObject::invokeMethod(dialog, &QDialog::reject, Qt::QueuedConnection);
    else
        modal->close();
}

bool AutoAnswer::Answer(QWidget &window, const QString &answer)
{
    if (auto *box = qobject_cast<QMessageBox *>(&window)) {
        const QMessageBox::StandardButton wanted = answer == u"ok"       ? QMessageBox::Ok
                                                   : answer == u"cancel" ? QMessageBox::Cancel
                                                   : answer == u"yes"    ? QMessageBox::Yes
                                                                         : QMessageBox::No;
        QAbstractButton *button = box->button(wanted);
        if (!button)
            return false;
        Report(window, answer);
        ClickLater(button);
        return true;
    }
    auto *dialog = qobject_cast<QDialog *>(&window);
    if (!dialog)
        return false;
    if (answer == u"cancel") {
        Report(window, answer);
        QMetaObject::invokeMethod(dialog, &QDialog::reject, Qt::QueuedConnection);
        return true;
    }
    if (answer != u"ok")
        return false;
    for (QPushButton *button : dialog->findChildren<QPushButton *>()) {
        if (button->isDefault() && button->isEnabled()) {
            Report(window, answer);
            ClickLater(button);
            return true;
        }
    }
    return false;
}

} // namespace host
