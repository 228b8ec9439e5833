#include "reference/server/indexplan.h"

#include "reference/rovoapi/configanswers.h"

#include <QFile>

#include <algorithm>

namespace sorvik::server {

std::string ExtensionKey(std::string_view fileName)
{
    const std::size_t dot = fileName.rfind('.');
    if (dot == std::string_view::npos || dot + 1 == fileName.size())
        return {};
    std::string extension(fileName.substr(dot + 1));
    bool ascii = true;
    for (char &c : extension) {
        if (static_cast<unsigned char>(c) >= 0x80)
            ascii = false;
        else if (c >= 'A' && c <= 'Z')
            c = char(c - 'A' + 'a');
    }
    if (ascii)
        return extension;
    return rovo::Key(QFile::decodeName(QByteArray(extension.data(), qsizetype(extension.size())))).toStdString();
}

const std::string *IndexPlan::ParseletFor(std::string_view fileName) const
{
    const auto found = parselets.find(ExtensionKey(fileName));
    return found == parselets.end() ? nullptr : &found->second;
}

bool IndexPlan::IsExcluded(const Area &area, std::string_view folder)
{
    if (area.excludedKeys.empty())
        return false;
    const QString key = rovo::Key(QFile::decodeName(QByteArray(folder.data(), qsizetype(folder.size()))));
    return std::find(area.excludedKeys.begin(), area.excludedKeys.end(), key) != area.excludedKeys.end();
}

std::string IndexPlan::Fingerprint() const
{
    std::string text;
    for (const Area &area : areas) {
        text += "area\t" + area.path + '\n';
        std::vector<QString> excluded = area.excludedKeys;
        std::sort(excluded.begin(), excluded.end());
        for (const QString &key : excluded)
            text += "exclude\t" + key.toStdString() + '\n';
    }
    for (const auto &[extension, parselet] : parselets)
        text += "extension\t" + extension + '\t' + parselet + '\n';
    return text;
}

IndexPlan MakePlan(const rovo::Configuration &configuration, const rovo::CatalogueInfo &catalogue)
{
    IndexPlan plan;
    for (const rovo::SearchArea &area : configuration.areas) {
        IndexPlan::Area planned;
        planned.path = QFile::encodeName(area.path).toStdString();
        for (const rovo::Folder &excluded : area.excluded)
            planned.excludedKeys.push_back(rovo::Key(excluded.path));
        plan.areas.push_back(std::move(planned));
    }
    const rovo::ConfigAnswers answers(configuration, catalogue);
    for (const rovo::ParseletInfo &parselet : catalogue.parselets) {
        for (const QString &extension : parselet.extensions) {
            const std::string key = extension.toStdString();
            if (plan.parselets.count(key))
                continue;
            const std::vector<QString> readers = answers.ExtensionParselets(extension);
            if (!readers.empty())
                plan.parselets.emplace(key, readers.front().toStdString());
        }
    }
    return plan;
}

} // namespace sorvik::server
