#include "resources/strings.h"

#include <QCoreApplication>

#include <array>
#include <cstddef>

namespace resources {

namespace {

constexpr char kContext[] = "ServerDialogs";

constexpr std::array<const char *, std::size_t(Str::Count)> kTable = {
    QT_TRANSLATE_NOOP("ServerDialogs", "OK"),
    QT_TRANSLATE_NOOP("ServerDialogs", "Cancel"),
    QT_TRANSLATE_NOOP("ServerDialogs", "&Help"),
    QT_TRANSLATE_NOOP("ServerDialogs", "Warning"),
    QT_TRANSLATE_NOOP("ServerDialogs", "Information"),
    QT_TRANSLATE_NOOP("ServerDialogs", "Server Error"),
    QT_TRANSLATE_NOOP("ServerDialogs", "Unknown error."),
    QT_TRANSLATE_NOOP("ServerDialogs", "Updating the Sorvik configuration has timed out."),
    QT_TRANSLATE_NOOP("ServerDialogs", "Incorrect parameter value."),

    QT_TRANSLATE_NOOP("ServerDialogs", "Add Search Area"),
    QT_TRANSLATE_NOOP("ServerDialogs", "Edit Search Area"),
    QT_TRANSLATE_NOOP("ServerDialogs", "&Alias name:"),
    QT_TRANSLATE_NOOP("ServerDialogs", "&Path:"),
    QT_TRANSLATE_NOOP("ServerDialogs", "..."),
    QT_TRANSLATE_NOOP("ServerDialogs", "Choose a Folder"),
    QT_TRANSLATE_NOOP("ServerDialogs", "Select data repository path:"),
    QT_TRANSLATE_NOOP("ServerDialogs", "Enter a valid search area path."),
    QT_TRANSLATE_NOOP("ServerDialogs",
                      "The path to the specified folder is not valid.\nDo you really want to use this path?"),
    QT_TRANSLATE_NOOP("ServerDialogs", "Remote Search Area selected"),
    QT_TRANSLATE_NOOP("ServerDialogs",
                      "Indexing a network folder or file share can increase network traffic and file server "
                      "load.\nIf a network folder is indexed by several Sorviks, you should consider instead "
                      "sharing one search index by using the Sorvik Server Edition.\nRefer to the Help pages "
                      "under topic Sorvik Server Edition for more information."),
    QT_TRANSLATE_NOOP("ServerDialogs",
                      "Creating a search area using the path %1 is not allowed. Contact your system's "
                      "administrator for more information."),
    QT_TRANSLATE_NOOP("ServerDialogs", "An element with the name %1 already exists."),
    QT_TRANSLATE_NOOP("ServerDialogs", "A search area with the full path %1 already exists."),
    QT_TRANSLATE_NOOP("ServerDialogs", "The specified folder is in the search area %1."),
    QT_TRANSLATE_NOOP("ServerDialogs",
                      "The specified path contains search areas. These search areas will automatically be "
                      "removed if you add the specified folder to the search areas. The settings for the "
                      "excluded folders will be replaced by this folder if you turn it into a search area. "
                      "Excluded folders will become part of the new search area. Do you want to add this "
                      "folder to the search areas?"),

    QT_TRANSLATE_NOOP("ServerDialogs", "Automatic Indexing Triggered By"),
    QT_TRANSLATE_NOOP("ServerDialogs", "&None"),
    QT_TRANSLATE_NOOP("ServerDialogs", "&Data file changes"),
    QT_TRANSLATE_NOOP("ServerDialogs", "Updates the index at the time specified in the scheduler."),
    QT_TRANSLATE_NOOP("ServerDialogs", "Updates the index immediately when files are created or modified."),

    QT_TRANSLATE_NOOP("ServerDialogs",
                      "If you exclude a folder from the search areas, you can no longer search for data in this "
                      "folder. Do you really want to exclude the folder: %1?"),
    QT_TRANSLATE_NOOP("ServerDialogs",
                      "If you remove a search area, you can no longer search for data in this folder. Updating "
                      "the index may take some time and you will not be able to use the Sorvik during that "
                      "time. Do you really want to remove the search area: %1?"),
};

} // namespace

const char *SourceText(Str id)
{
    return kTable[std::size_t(id)];
}

QString LoadString(Str id)
{
    return QCoreApplication::translate(kContext, SourceText(id));
}

QString FormatString(Str id, const QString &argument)
{
    // Not QString::arg: a path holding "%1" must stay as it is.
    QString text = LoadString(id);
    const qsizetype at = text.indexOf(QStringLiteral("%1"));
    if (at >= 0)
        text.replace(at, 2, argument);
    return text;
}

} // namespace resources
