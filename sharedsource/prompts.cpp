#include "sharedsource/prompts.h"

#include <QFileDialog>
#include <QFileInfo>
#include <QMessageBox>
#include <QUrl>

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

    std::optional<QString> BrowseForFolder(QWidget *owner, const FolderRequest &request) override
    {
        QFileDialog dialog(owner, request.title);
        dialog.setFileMode(QFileDialog::Directory);
        dialog.setOptions(QFileDialog::ShowDirsOnly | QFileDialog::DontUseNativeDialog);
        const QString root = QDir::cleanPath(QDir::fromNativeSeparators(request.root));
        const QString select = QDir::cleanPath(QDir::fromNativeSeparators(request.select));
        if (!root.isEmpty()) {
            dialog.setDirectory(root);
            dialog.setSidebarUrls({QUrl::fromLocalFile(root)});
            // Qt's browser cannot be rooted; whoever walks out is brought back.
            QObject::connect(&dialog, &QFileDialog::directoryEntered, &dialog, [&dialog, root](const QString &folder) {
                if (!IsInside(QDir::cleanPath(folder), root))
                    dialog.setDirectory(root);
            });
        }
        if (!select.isEmpty() && (root.isEmpty() || IsInside(select, root))) {
            dialog.setDirectory(QFileInfo(select).absolutePath());
            dialog.selectFile(select);
        }
        if (dialog.exec() != QDialog::Accepted || dialog.selectedFiles().isEmpty())
            return std::nullopt;
        return QDir::toNativeSeparators(dialog.selectedFiles().first());
    }

    std::optional<QString> ChooseFile(QWidget *owner, const FileRequest &request) override
    {
        QFileDialog dialog(owner, request.caption, request.folder, QtFileFilter(request.filter));
        dialog.setOption(QFileDialog::DontUseNativeDialog);
        dialog.setAcceptMode(request.save ? QFileDialog::AcceptSave : QFileDialog::AcceptOpen);
        dialog.setFileMode(request.save ? QFileDialog::AnyFile : QFileDialog::ExistingFile);
        dialog.setDefaultSuffix(request.defaultExtension);
        if (!request.defaultName.isEmpty())
            dialog.selectFile(request.defaultName);
        if (dialog.exec() != QDialog::Accepted || dialog.selectedFiles().isEmpty())
            return std::nullopt;
        return dialog.selectedFiles().first();
    }

private:
    static bool IsInside(const QString &folder, const QString &root)
    {
        const QString withSlash = root.endsWith(u'/') ? root : root + u'/';
        return folder == root || folder.startsWith(withSlash);
    }
};

} // namespace

QString QtFileFilter(const QString &filter)
{
    const QStringList parts = filter.split(u'|');
    QStringList filters;
    for (qsizetype i = 0; i + 1 < parts.size(); i += 2) {
        const QString &description = parts[i];
        if (description.isEmpty())
            break;
        QString patterns = parts[i + 1];
        patterns.replace(u';', u' ');
        filters << (description.contains(u'(') ? description : description + QStringLiteral(" (") + patterns + u')');
    }
    return filters.isEmpty() ? filter : filters.join(QStringLiteral(";;"));
}

std::unique_ptr<QMessageBox> MakeMessageBox(QWidget *owner, const Message &message)
{
    auto box =
        std::make_unique<QMessageBox>(ToQt(message.icon), message.caption, message.text, ToQt(message.buttons), owner);
    box->setTextFormat(Qt::PlainText);
    return box;
}

IPrompts &QtPrompts()
{
    static CQtPrompts prompts;
    return prompts;
}

} // namespace sharedsource
