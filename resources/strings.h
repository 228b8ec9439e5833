#pragma once

// The module's string table: every text a user sees, translated through
// Qt's translation machinery (context "ServerDialogs"). Placeholders are
// numbered: %1s or %1d (the letter says what goes there, for translators),
// %2s, %2d and so on.

#include <QString>

#include <initializer_list>

namespace resources {

enum class Str
{
    Ok,
    Cancel,
    Help,
    Warning,
    Information,
    ServerError,
    UnknownError,
    UpdateTimedOut,
    IncorrectParameter,
    EnterIntegerBetween,

    AddSearchAreaTitle,
    EditSearchAreaTitle,
    AliasLabel,
    PathLabel,
    BrowseButton,
    ChooseFolder,
    SelectRepositoryPath,
    EnterValidPath,
    PathNotValid,
    RemoteAreaCaption,
    RemoteAreaWarning,
    PathNotAllowed,
    NameExists,
    FullPathExists,
    FolderInSearchArea,
    PathContainsSearchAreas,

    TriggersTitle,
    TriggerNone,
    TriggerFileChanges,
    TriggerScheduleExplanation,
    TriggerImmediateExplanation,

    ExcludeFolderQuestion,
    RemoveSearchAreaQuestion,

    PropertiesTitle,
    ConfigureTitle,
    MySorvik,
    ImportButton,
    ExportButton,
    ConfigurationReadError,
    SearchAreasTab,
    ParseletsTab,
    FileExtensionsTab,
    IndexerTab,
    AdvancedTab,
    ConfigurationWriteError,
    ConfiguringSorvik,

    ImportQuestion,
    ConfigurationFileFilter,
    ImportError,
    ExportError,

    AddSearchAreaTool,
    ExcludeSubfolderTool,
    RemoveTool,
    UpTool,
    DownTool,
    AddSearchAreaMenu,
    ExcludeSubfolderMenu,
    RemoveMenu,
    UpMenu,
    DownMenu,
    RenameMenu,
    ExploreMenu,
    SelectFolderToExclude,
    CannotExcludeSearchArea,
    FolderAlreadyExcluded,
    ExploreError,
    FolderOutsideSearchArea,

    Count
};

QString LoadString(Str id);
// LoadString(id) with its placeholders %1, %2, ... (each optionally followed
// by its type letter s or d) replaced by the arguments in order. Arguments
// are taken literally: a path holding "%1" stays as it is.
QString FormatString(Str id, std::initializer_list<QString> arguments);
QString FormatString(Str id, const QString &argument);

// The untranslated source text of an entry.
const char *SourceText(Str id);

} // namespace resources
