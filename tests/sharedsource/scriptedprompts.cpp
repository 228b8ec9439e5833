#include "scriptedprompts.h"

namespace uitest {

namespace {

const char *Name(sharedsource::MessageIcon icon)
{
    switch (icon) {
    case sharedsource::MessageIcon::Error:
        return "error";
    case sharedsource::MessageIcon::Warning:
        return "warning";
    case sharedsource::MessageIcon::Information:
        return "information";
    case sharedsource::MessageIcon::Question:
        return "question";
    case sharedsource::MessageIcon::None:
        break;
    }
    return "none";
}

const char *Name(sharedsource::MessageButtons buttons)
{
    switch (buttons) {
    case sharedsource::MessageButtons::OkCancel:
        return "ok-cancel";
    case sharedsource::MessageButtons::YesNo:
        return "yes-no";
    case sharedsource::MessageButtons::YesNoCancel:
        return "yes-no-cancel";
    case sharedsource::MessageButtons::Ok:
        break;
    }
    return "ok";
}

} // namespace

std::string BoxLine(const QString &caption, const QString &text, const char *icon, const char *buttons)
{
    return caption.toStdString() + " | " + text.toStdString() + " | " + icon + " | " + buttons;
}

std::vector<std::string> ScriptedPrompts::Lines() const
{
    std::vector<std::string> lines;
    for (const sharedsource::Message &m : shown)
        lines.push_back(BoxLine(m.caption, m.text, Name(m.icon), Name(m.buttons)));
    return lines;
}

std::vector<std::string> ScriptedPrompts::BrowseLines() const
{
    std::vector<std::string> lines;
    for (const sharedsource::FolderRequest &r : browsed)
        lines.push_back(r.title.toStdString() + " | " + r.root.toStdString() + " | " + r.select.toStdString());
    return lines;
}

} // namespace uitest
