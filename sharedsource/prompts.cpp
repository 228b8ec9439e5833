#include "sharedsource/prompts.h"

#include <QFileDialog>
#include <QMessageBox>

namespace sharedsource {

namespace {

QMessageBox::Icon ToQt(MessageIcon icon)
{
    switch (icon) {
    case MessageIcon::Error:
        return QMessageBox::Critical;
    case MessageIcon::Warning:
        return QMessageBox::Warning;
    case MessageIcon::Information:
        return QMessageBox::Information;
    case MessageIcon::Question:
        return QMessageBox::Question;
    case MessageIcon::None:
        break;
    }
    return QMessageBox::NoIcon;
}

QMessageBox::StandardButtons ToQt(MessageButtons buttons)
{
    switch (buttons) {
    case MessageButtons::OkCancel:
        return QMessageBox::Ok | QMessageBox::Cancel;
    case MessageButtons::YesNo:
        return QMessageBox::Yes | QMessageBox::No;
    case MessageButtons::YesNoCancel:
        return QMessageBox::Yes | QMessageBox::No | QMessageBox::Cancel;
    case MessageButtons::Ok:
        break;
    }
    return QMessageBox::Ok;
}

MessageResult FromQt(int button, MessageButtons buttons)
{
    switch (button) {
    case QMessageBox::Ok:
        return MessageResult::Ok;
    case QMessageBox::Yes:
        return MessageResult::Yes;
    case QMessageBox::No:
        return MessageResult::No;
    default:
        break;
    }
    // Closing the box is its cancel; a box without one closes as its only answer.
    if (buttons == MessageButtons::YesNo)
        return MessageResult::No;
    return buttons == MessageButtons::Ok ? MessageResult::Ok : MessageResult::Cancel;
}

class CQtPrompts final : public IPrompts
{
public:
    MessageResult ShowMessage(QWidget *owner, const Message &message) override
    {
        const std::unique_ptr<QMessageBox> box = MakeMessageBox(owner, message);
        return FromQt(box->exec(), message.buttons);
    }

    std::optional<QString> BrowseForFolder(QWidget *owner, const QString &title, const QString &startFolder) override
    {
        QFileDialog dialog(owner, title, startFolder);
        dialog.setFileMode(QFileDialog::Directory);
        dialog.setOptions(QFileDialog::ShowDirsOnly | QFileDialog::DontUseNativeDialog);
        if (!startFolder.isEmpty())
            dialog.selectFile(startFolder);
        if (dialog.exec() != QDialog::Accepted || dialog.selectedFiles().isEmpty())
            return std::nullopt;
        return QDir::toNativeSeparators(dialog.selectedFiles().first());
    }

    std::optional<QString> ChooseFile(QWidget *owner, const FileRequest &request) override
    {
        const QString file =
            request.save ? QFileDialog::getSaveFileName(owner, request.caption, request.folder, request.filter)
                         : QFileDialog::getOpenFileName(owner, request.caption, request.folder, request.filter);
        if (file.isEmpty())
            return std::nullopt;
        return file;
    }
};

} // namespace

std::unique_ptr<QMessageBox> MakeMessageBox(QWidget *owner, const Message &message)
{
    auto box = std::make_unique<QMessageBox>(ToQt(message.icon), message.caption, message.text,
                                             ToQt(message.buttons), owner);
    box->setTextFormat(Qt::PlainText);
    return box;
}

IPrompts &QtPrompts()
{
    static CQtPrompts prompts;
    return prompts;
}

} // namespace sharedsource
