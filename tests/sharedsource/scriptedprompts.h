#pragma once

// Prompts for unit tests: each message is recorded and answered from a
// script; without a scripted answer a box gives its first button (OK or Yes).

#include "sharedsource/prompts.h"

#include <deque>
#include <optional>
#include <string>
#include <vector>

namespace uitest {

// A line of ScriptedPrompts::Lines: "caption | text | icon | buttons".
std::string BoxLine(const QString &caption, const QString &text, const char *icon, const char *buttons);

class ScriptedPrompts final : public sharedsource::IPrompts
{
public:
    std::deque<sharedsource::MessageResult> answers;
    std::deque<std::optional<QString>> folders; // BrowseForFolder answers; none left: cancelled
    std::deque<std::optional<QString>> files;   // ChooseFile answers; none left: cancelled
    std::vector<sharedsource::Message> shown;
    std::vector<sharedsource::FolderRequest> browsed;
    std::vector<sharedsource::FileRequest> chosen;

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

    std::optional<QString> BrowseForFolder(QWidget *, const sharedsource::FolderRequest &request) override
    {
        browsed.push_back(request);
        return Next(folders);
    }

    std::optional<QString> ChooseFile(QWidget *, const sharedsource::FileRequest &request) override
    {
        chosen.push_back(request);
        return Next(files);
    }

    // "caption | text | icon | buttons" of each box, for compact assertions.
    std::vector<std::string> Lines() const;
    // "title | root | select" of each folder browser.
    std::vector<std::string> BrowseLines() const;

private:
    static std::optional<QString> Next(std::deque<std::optional<QString>> &answers)
    {
        if (answers.empty())
            return std::nullopt;
        std::optional<QString> answer = answers.front();
        answers.pop_front();
        return answer;
    }
};

} // namespace uitest
