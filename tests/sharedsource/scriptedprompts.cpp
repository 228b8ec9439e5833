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

std::vector<std::string> ScriptedPrompts::Lines() const
{
    std::vector<std::string> lines;
    for (const sharedsource::Message &m : shown)
        lines.push_back(m.caption.toStdString() + " | " + m.text.toStdString() + " | " + Name(m.icon) + " | " +
                        Name(m.buttons));
    return lines;
}

} // namespace uitest
