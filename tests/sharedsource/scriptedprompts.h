#pragma once

// Prompts for unit tests: each message is recorded and answered from a
// script; without a scripted answer a box gives its first button (OK or Yes).

#include "sharedsource/prompts.h"

#include <deque>
#include <optional>
#include <string>
#include <vector>

namespace uitest {

class ScriptedPrompts final : public sharedsource::IPrompts
{
public:
    std::deque<sharedsource::MessageResult> answers;
    std::deque<std::optional<QString>> folders; // BrowseForFolder answers; none left: cancelled
    std::vector<sharedsource::Message> shown;
    std::vector<QString> browsedFrom;

    sharedsource::MessageResult ShowMessage(QWidget *, const sharedsource::Message &message) override
    {
        shown.push_back(message);
        if (!answers.empty()) {
            const sharedsource::MessageResult answer = answers.front();
            answers.pop_front();
            return answer;
        }
        return message.buttons == sharedsource::MessageButtons::YesNo ||
                       message.buttons == sharedsource::MessageButtons::YesNoCancel
                   ? sharedsource::MessageResult::Yes
                   : sharedsource::MessageResult::Ok;
    }

    std::optional<QString> BrowseForFolder(QWidget *, const QString &title, const QString &start) override
    {
        browsedFrom.push_back(title + u'|' + start);
        if (folders.empty())
            return std::nullopt;
        std::optional<QString> folder = folders.front();
        folders.pop_front();
        return folder;
    }

    std::optional<QString> ChooseFile(QWidget *, const sharedsource::FileRequest &) override { return std::nullopt; }

    // "caption | text | icon | buttons" of each box, for compact assertions.
    std::vector<std::string> Lines() const;
};

} // namespace uitest
