#pragma once

// The module's string table: every text a user sees, translated through
// Qt's translation machinery (context "ServerDialogs"). Texts with a
// placeholder take it as %1.

#include <QString>

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

    Count
};

QString LoadString(Str id);
// LoadString(id) with %1 replaced by argument (taken literally).
QString FormatString(Str id, const QString &argument);

// The untranslated source text of an entry.
const char *SourceText(Str id);

} // namespace resources
