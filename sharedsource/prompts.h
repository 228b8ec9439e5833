#pragma once

// Message boxes, file dialogs and the folder browser, behind one interface
// so dialog logic can be tested with scripted answers. The module's own
// implementation shows Qt's dialogs.

#include <QString>

#include <memory>
#include <optional>

class QMessageBox;
class QWidget;

namespace sharedsource {

enum class MessageIcon
{
    None,
    Error,
    Warning,
    Information,
    Question,
};

enum class MessageButtons
{
    Ok,
    OkCancel,
    YesNo,
    YesNoCancel,
};

// The platform's button results.
enum class MessageResult
{
    Ok = 1,
    Cancel = 2,
    Yes = 6,
    No = 7,
};

struct Message
{
    QString text;
    QString caption;
    MessageIcon icon = MessageIcon::None;
    MessageButtons buttons = MessageButtons::Ok;
};

struct FileRequest
{
    QString caption;
    QString folder;
    QString filter; // Qt's "Description (*.ext)" form
    bool save = false;
};

class IPrompts
{
public:
    virtual MessageResult ShowMessage(QWidget *owner, const Message &message) = 0;
    // The chosen folder, or nothing when the user cancelled.
    virtual std::optional<QString> BrowseForFolder(QWidget *owner, const QString &title,
                                                   const QString &startFolder) = 0;
    virtual std::optional<QString> ChooseFile(QWidget *owner, const FileRequest &request) = 0;

protected:
    ~IPrompts() = default;
};

// Qt's dialogs, modal to owner (or to the application when owner is null).
IPrompts &QtPrompts();

// The message box QtPrompts shows, built but not run (for screenshots).
std::unique_ptr<QMessageBox> MakeMessageBox(QWidget *owner, const Message &message);

} // namespace sharedsource
