#pragma once

// Small fakes for the dialogs' owners: existing search areas and policy
// (IInputTester) and what the file system says about paths.

#include "pages/pathprobe.h"
#include "sorvik/serverdialogs.h"
#include "sorvik/wstringqt.h"

#include <QMap>
#include <QStringList>

#include <vector>

namespace pagestest {

class FakeTester final : public IInputTester
{
public:
    QStringList aliases;                       // in use, compared ignoring case
    std::int32_t clientPathAnswer = 0;
    QString clientPathOwner;
    std::int32_t allowedAnswer = 0;
    std::vector<QStringList> allowedAsked;     // server path, path, name
    int clientPathTests = 0;

    bool IsAliasInUse(const cv::krn::WString &alias) override
    {
        return aliases.contains(cv::krn::ToQString(alias), Qt::CaseInsensitive);
    }
    std::int32_t TestClientPath(const cv::krn::WString &, cv::krn::WString &alias) override
    {
        ++clientPathTests;
        alias = cv::krn::FromQString(clientPathOwner);
        return clientPathAnswer;
    }
    std::int32_t TestPath(const cv::krn::WString &, cv::krn::WString &) override { return 0; }
    std::int32_t CheckPathAllowed(const cv::krn::WString &serverPath, const cv::krn::WString &path,
                                  const cv::krn::WString &alias) override
    {
        allowedAsked.push_back(
            {cv::krn::ToQString(serverPath), cv::krn::ToQString(path), cv::krn::ToQString(alias)});
        return allowedAnswer;
    }
};

// Paths not listed cannot be read.
class FakeInspector final : public pages::IPathInspector
{
public:
    struct Entry
    {
        bool folder = true;
        QByteArray fileSystem = "ext4";
    };
    QMap<QString, Entry> paths;

    Attributes AttributesOf(const QString &path) override
    {
        const auto found = paths.find(path);
        return found == paths.end() ? Attributes{} : Attributes{true, found->folder};
    }
    std::optional<QByteArray> FileSystemTypeOf(const QString &path) override
    {
        const auto found = paths.find(path);
        if (found == paths.end())
            return std::nullopt;
        return found->fileSystem;
    }
};

} // namespace pagestest
