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

struct FolderRequest
{
    QString title;
    QString root;   // the browser offers nothing outside it; empty: the whole file system
    QString select; // shown selected when the browser opens
};

struct FileRequest
{
    bool save = false; // a save dialog that asks before replacing a file; else the file must exist
    QString caption;
    QString folder;
    QString defaultName;
    QString defaultExtension; // added to a name typed without one, e.g. "skc"
    // "Description|patterns|Description|patterns||", patterns separated by ';'
    QString filter;
};

// Qt's form of a filter ("Description (*.a *.b);;..."); a description that
// already names its patterns in parentheses stays as it is.
QString QtFileFilter(const QString &filter);

class IPrompts
{
public:
    virtual MessageResult ShowMessage(QWidget *owner, const Message &message) = 0;
    // The chosen folder, or nothing when the user cancelled.
    virtual std::optional<QString> BrowseForFolder(QWidget *owner, const FolderRequest &request) = 0;
    // The chosen file's full path, or nothing when the user cancelled.
    virtual std::optional<QString> ChooseFile(QWidget *owner, const FileRequest &request) = 0;

protected:
    ~IPrompts() = default;
};

// Qt's dialogs, modal to owner (or to the application when owner is null).
IPrompts &QtPrompts();

// The message box QtPrompts shows, built but not run (for screenshots).
std::unique_ptr<QMessageBox> MakeMessageBox(QWidget *owner, const Message &message);

} // namespace sharedsource
