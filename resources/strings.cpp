#include "resources/strings.h"

#include <QCoreApplication>

#include <cstddef>
#include <iterator>

namespace resources {

namespace {

constexpr char kContext[] = "ServerDialogs";

struct Entry
{
    Str id;
    const char *text;
};

// One row per text; the checks below keep the rows in the order of Str.
constexpr Entry kTable[] = {
    {Str::Ok, QT_TRANSLATE_NOOP("ServerDialogs", "OK")},
    {Str::Cancel, QT_TRANSLATE_NOOP("ServerDialogs", "Cancel")},
    {Str::Help, QT_TRANSLATE_NOOP("ServerDialogs", "&Help")},
    {Str::Warning, QT_TRANSLATE_NOOP("ServerDialogs", "Warning")},
    {Str::Information, QT_TRANSLATE_NOOP("ServerDialogs", "Information")},
    {Str::ServerError, QT_TRANSLATE_NOOP("ServerDialogs", "Server Error")},
    {Str::UnknownError, QT_TRANSLATE_NOOP("ServerDialogs", "Unknown error.")},
    {Str::UpdateTimedOut, QT_TRANSLATE_NOOP("ServerDialogs", "Updating the Sorvik configuration has timed out.")},
    {Str::IncorrectParameter, QT_TRANSLATE_NOOP("ServerDialogs", "Incorrect parameter value.")},
    {Str::EnterIntegerBetween, QT_TRANSLATE_NOOP("ServerDialogs", "Enter an integer between %1d and %2d.")},
    {Str::AddSearchAreaTitle, QT_TRANSLATE_NOOP("ServerDialogs", "Add Search Area")},
    {Str::EditSearchAreaTitle, QT_TRANSLATE_NOOP("ServerDialogs", "Edit Search Area")},
    {Str::AliasLabel, QT_TRANSLATE_NOOP("ServerDialogs", "&Alias name:")},
    {Str::PathLabel, QT_TRANSLATE_NOOP("ServerDialogs", "&Path:")},
    {Str::BrowseButton, QT_TRANSLATE_NOOP("ServerDialogs", "...")},
    {Str::ChooseFolder, QT_TRANSLATE_NOOP("ServerDialogs", "Choose a Folder")},
    {Str::SelectRepositoryPath, QT_TRANSLATE_NOOP("ServerDialogs", "Select data repository path:")},
    {Str::EnterValidPath, QT_TRANSLATE_NOOP("ServerDialogs", "Enter a valid search area path.")},
    {Str::PathNotValid,
     QT_TRANSLATE_NOOP("ServerDialogs",
                       "The path to the specified folder is not valid.\nDo you really want to use this path?")},
    {Str::RemoteAreaCaption, QT_TRANSLATE_NOOP("ServerDialogs", "Remote Search Area selected")},
    {Str::RemoteAreaWarning,
     QT_TRANSLATE_NOOP("ServerDialogs",
                       "Indexing a network folder or file share can increase network traffic and file server "
                       "load.\nIf a network folder is indexed by several Sorviks, you should consider instead "
                       "sharing one search index by using the Sorvik Server Edition.\nRefer to the Help pages "
                       "under topic Sorvik Server Edition for more information.")},
    {Str::PathNotAllowed,
     QT_TRANSLATE_NOOP("ServerDialogs",
                       "Creating a search area using the path %1s is not allowed. Contact your system's "
                       "administrator for more information.")},
    {Str::NameExists, QT_TRANSLATE_NOOP("ServerDialogs", "An element with the name %1s already exists.")},
    {Str::FullPathExists, QT_TRANSLATE_NOOP("ServerDialogs", "A search area with the full path %1s already exists.")},
    {Str::FolderInSearchArea, QT_TRANSLATE_NOOP("ServerDialogs", "The specified folder is in the search area %1s.")},
    {Str::PathContainsSearchAreas,
     QT_TRANSLATE_NOOP("ServerDialogs",
                       "The specified path contains search areas. These search areas will automatically be "
                       "removed if you add the specified folder to the search areas. The settings for the "
                       "excluded folders will be replaced by this folder if you turn it into a search area. "
                       "Excluded folders will become part of the new search area. Do you want to add this "
                       "folder to the search areas?")},
    {Str::TriggersTitle, QT_TRANSLATE_NOOP("ServerDialogs", "Automatic Indexing Triggered By")},
    {Str::TriggerNone, QT_TRANSLATE_NOOP("ServerDialogs", "&None")},
    {Str::TriggerFileChanges, QT_TRANSLATE_NOOP("ServerDialogs", "&Data file changes")},
    {Str::TriggerScheduleExplanation,
     QT_TRANSLATE_NOOP("ServerDialogs", "Updates the index at the time specified in the scheduler.")},
    {Str::TriggerImmediateExplanation,
     QT_TRANSLATE_NOOP("ServerDialogs", "Updates the index immediately when files are created or modified.")},
    {Str::ExcludeFolderQuestion,
     QT_TRANSLATE_NOOP("ServerDialogs",
                       "If you exclude a folder from the search areas, you can no longer search for data in this "
                       "folder. Do you really want to exclude the folder: %1s?")},
    {Str::RemoveSearchAreaQuestion,
     QT_TRANSLATE_NOOP("ServerDialogs",
                       "If you remove a search area, you can no longer search for data in this folder. Updating "
                       "the index may take some time and you will not be able to use the Sorvik during that "
                       "time. Do you really want to remove the search area: %1s?")},

    {Str::PropertiesTitle, QT_TRANSLATE_NOOP("ServerDialogs", "Sorvik Properties")},
    {Str::ConfigureTitle, QT_TRANSLATE_NOOP("ServerDialogs", "Configure %1s")},
    {Str::MySorvik, QT_TRANSLATE_NOOP("ServerDialogs", "My Sorvik")},
    {Str::ImportButton, QT_TRANSLATE_NOOP("ServerDialogs", "&Import...")},
    {Str::ExportButton, QT_TRANSLATE_NOOP("ServerDialogs", "&Export...")},
    {Str::ConfigurationReadError,
     QT_TRANSLATE_NOOP("ServerDialogs", "Error while reading the Sorvik configuration. Try to restart the Sorvik.")},
    {Str::SearchAreasTab, QT_TRANSLATE_NOOP("ServerDialogs", "Search Areas")},
    {Str::ParseletsTab, QT_TRANSLATE_NOOP("ServerDialogs", "Parselets")},
    {Str::FileExtensionsTab, QT_TRANSLATE_NOOP("ServerDialogs", "File Extensions")},
    {Str::IndexerTab, QT_TRANSLATE_NOOP("ServerDialogs", "Indexer")},
    {Str::AdvancedTab, QT_TRANSLATE_NOOP("ServerDialogs", "Advanced")},
    {Str::ConfigurationWriteError,
     QT_TRANSLATE_NOOP("ServerDialogs", "An error has occurred while writing the Sorvik configuration.")},
    {Str::ConfiguringSorvik, QT_TRANSLATE_NOOP("ServerDialogs", "Configuring Sorvik...")},

    {Str::ImportQuestion,
     QT_TRANSLATE_NOOP("ServerDialogs", "Importing a Sorvik configuration may take some time and you will not be able "
                                        "to use the Sorvik during that time. Do you want to continue?")},
    {Str::ConfigurationFileFilter, QT_TRANSLATE_NOOP("ServerDialogs", "Sorvik Configuration (*.skc)|*.skc||")},
    {Str::ImportError,
     QT_TRANSLATE_NOOP("ServerDialogs", "An error has occurred while importing the Sorvik configuration.")},
    {Str::ExportError,
     QT_TRANSLATE_NOOP("ServerDialogs", "An error has occurred while exporting the Sorvik configuration.")},

    {Str::AddSearchAreaTool, QT_TRANSLATE_NOOP("ServerDialogs", "Add Search Area")},
    {Str::ExcludeSubfolderTool, QT_TRANSLATE_NOOP("ServerDialogs", "Exclude Subfolder")},
    {Str::RemoveTool, QT_TRANSLATE_NOOP("ServerDialogs", "Remove")},
    {Str::UpTool, QT_TRANSLATE_NOOP("ServerDialogs", "Up")},
    {Str::DownTool, QT_TRANSLATE_NOOP("ServerDialogs", "Down")},
    {Str::AddSearchAreaMenu, QT_TRANSLATE_NOOP("ServerDialogs", "Add Search Area...")},
    {Str::ExcludeSubfolderMenu, QT_TRANSLATE_NOOP("ServerDialogs", "Exclude Subfolder...")},
    {Str::RemoveMenu, QT_TRANSLATE_NOOP("ServerDialogs", "Remove")},
    {Str::UpMenu, QT_TRANSLATE_NOOP("ServerDialogs", "Up")},
    {Str::DownMenu, QT_TRANSLATE_NOOP("ServerDialogs", "Down")},
    {Str::RenameMenu, QT_TRANSLATE_NOOP("ServerDialogs", "Rename")},
    {Str::ExploreMenu, QT_TRANSLATE_NOOP("ServerDialogs", "Explore...")},
    {Str::SelectFolderToExclude, QT_TRANSLATE_NOOP("ServerDialogs", "Select folder to exclude:")},
    {Str::CannotExcludeSearchArea,
     QT_TRANSLATE_NOOP("ServerDialogs", "It is not possible to exclude an entire search area.")},
    {Str::FolderAlreadyExcluded,
     QT_TRANSLATE_NOOP("ServerDialogs", "The folder with the path %1s has already been excluded from the search areas.")},
    {Str::ExploreError, QT_TRANSLATE_NOOP("ServerDialogs", "Opening the folder in Explorer has caused an error.")},
    {Str::FolderOutsideSearchArea,
     QT_TRANSLATE_NOOP("ServerDialogs", "The folder %1s does not lie in the search area %2s.")},
};

static_assert(std::size(kTable) == std::size_t(Str::Count), "every Str has exactly one row");

constexpr bool RowsFollowStr()
{
    for (std::size_t i = 0; i < std::size(kTable); ++i) {
        if (kTable[i].id != Str(i))
            return false;
    }
    return true;
}
static_assert(RowsFollowStr(), "the rows are in the order of Str");

} // namespace

const char *SourceText(Str id)
{
    return kTable[std::size_t(id)].text;
}

QString LoadString(Str id)
{
    return QCoreApplication::translate(kContext, SourceText(id));
}

QString FormatString(Str id, std::initializer_list<QString> arguments)
{
    const QString text = LoadString(id);
    QString result;
    result.reserve(text.size());
    for (qsizetype i = 0; i < text.size(); ++i) {
        const QChar c = text[i];
        const qsizetype number = i + 1 < text.size() ? text[i + 1].digitValue() : -1;
        if (c != u'%' || number < 1 || std::size_t(number) > arguments.size()) {
            result += c;
            continue;
        }
        result += *(arguments.begin() + (number - 1));
        ++i;
        if (i + 1 < text.size() && (text[i + 1] == u's' || text[i + 1] == u'd'))
            ++i;
    }
    return result;
}

QString FormatString(Str id, const QString &argument)
{
    return FormatString(id, {argument});
}

} // namespace resources
