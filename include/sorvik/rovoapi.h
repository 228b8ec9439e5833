#pragma once

// The server API library (librovoApi.so): the server environment, the Sorvik
// object for a connection text, its configuration view (what the server has
// committed) and configuration editor (changes recorded and applied in one
// commit), and the objects of a running server reached through its index
// manager.
//
// Conventions as in vekex.h: reference-counted objects, one reference per
// returned object for the caller, `std::int32_t *status` last in every
// operation that can fail (negative code on failure, untouched on success).

#include "sorvik/com.h"
#include "sorvik/refcounted.h"
#include "sorvik/vekex.h"
#include "sorvik/wstring.h"

#include <cstddef>
#include <cstdint>

namespace cv::rovo {

using krn::IRefCounted;
using krn::WString;
using vekex::IContainer;
using vekex::IStringList;

namespace status {
constexpr std::int32_t UpdateTimedOut = -1008;         // the server did not apply the changes in time
constexpr std::int32_t OutOfMemory = -21001;
constexpr std::int32_t InvalidArgument = -21002;       // null pointer, empty path, value out of range, bad flags
constexpr std::int32_t NotFound = -21003;              // no such folder, Parselet or extension
constexpr std::int32_t Conflict = -21004;              // the change contradicts the configuration (duplicate path or alias, nesting)
constexpr std::int32_t InvalidConnection = -21005;     // a connection text that does not parse
constexpr std::int32_t StoreUnavailable = -21006;      // the configuration store cannot be opened or written
constexpr std::int32_t StoreCorrupt = -21007;          // the store exists but is not a Sorvik store of this version
constexpr std::int32_t FileUnreadable = -21008;        // a configuration file cannot be read
constexpr std::int32_t FileMalformed = -21009;         // a configuration file is not well-formed or not valid
constexpr std::int32_t FileWriteFailed = -21010;       // a configuration file cannot be written
constexpr std::int32_t CatalogueFailed = -21011;       // the data-store library could not supply the catalogue
constexpr std::int32_t NotAllowed = -21012;            // the store's policy forbids the change
constexpr std::int32_t Internal = -21013;              // a failure the library did not foresee
constexpr std::int32_t ServerNotRunning = -21014;      // the server instance is not running (any more)
constexpr std::int32_t ServerNotResponding = -21015;   // the server instance did not answer in time
constexpr std::int32_t Unsupported = -21016;           // the running server does not offer the operation
} // namespace status

// Result of CheckAreaAllowed.
constexpr std::int32_t kAreaAllowed = 0;
constexpr std::int32_t kAreaNotAllowed = 4;

// Modes of ResetSorvik.
constexpr std::int32_t kResetIndexAndConfiguration = 3;
constexpr std::int32_t kResetIndex = 4;

// Schedule kinds of GetSchedule and SetSchedule.
constexpr std::int32_t kScheduleNever = 0;
constexpr std::int32_t kScheduleHourly = 1;
constexpr std::int32_t kScheduleDaily = 2;
constexpr std::int32_t kScheduleWeekly = 3;
constexpr std::int32_t kScheduleWeeklyLegacy = 5; // older weekly form, read as weekly

// Kinds of IIndexManager::SetServiceTimeout.
constexpr std::int32_t kBrowseTimeout = 1;
constexpr std::int32_t kQueryTimeout = 2;

// Optimization states of custom properties.
constexpr std::uint32_t kNotOptimized = 101;
constexpr std::uint32_t kOptimizedDefault = 0;

// A date and time in UTC by its calendar fields; month and day count from 1.
// The weekday of a weekly schedule is the weekday of this date.
struct CalendarTime
{
    std::int32_t year;
    std::int32_t month;
    std::int32_t day;
    std::int32_t hour;
    std::int32_t minute;
    std::int32_t second;
};

// The time value of IIndexStatus::GetIndexingProgress: four 32-bit words,
// lowest first. The caller sets them to 0, 0, 0, 0x80000000 ("unknown"); the
// server replaces them with the time of its last progress as milliseconds
// since 1970 UTC in words 0 and 1 (low first) and zeros in words 2 and 3,
// or leaves them when it knows no time.
struct ProgressTime
{
    std::uint32_t words[4];
};
static_assert(sizeof(ProgressTime) == 16);

// One custom property as the optimization grid holds it; the optimization
// editor reads the name and the states.
struct PropertyRecord
{
    WString name;
    std::uint32_t occurrences;
    std::uint32_t state;
    std::uint32_t savedState;
    std::uint32_t loadPosition;
};
static_assert(offsetof(PropertyRecord, occurrences) == sizeof(WString));

struct IConfigurationEditor;

// The read side: every operation answers from what has been committed.
struct SORVIK_EXPORT IConfigurationView : IRefCounted
{
    // Search-area paths in their configured order (an empty list when there are none).
    virtual IStringList *ListSearchAreas(std::int32_t *status) = 0;
    // Absolute paths of the excluded folders of the search area areaPath, in
    // the order they were added; an empty list when it has none; null
    // (without error) when areaPath is not a search area.
    virtual IStringList *ListExcludedFolders(const WString &areaPath, std::int32_t *status) = 0;
    // Client path and alias of the search area or excluded folder path;
    // flags must be 0. Unknown path: NotFound.
    virtual void GetSearchArea(const WString &path, WString *clientPath, WString *alias, std::int32_t flags,
                               std::int32_t *status) = 0;
    virtual bool IsSearchArea(const WString &path, std::int32_t *status) = 0;
    virtual bool IsExcludedFolder(const WString &path, std::int32_t *status) = 0;

    // Reads a configuration file (the .skc format) and records it in editor
    // as a replacement of the whole configuration; nothing is committed. A
    // file that cannot be read or is not valid changes neither the editor nor
    // the store (FileUnreadable, FileMalformed).
    virtual void ImportConfiguration(const WString &file, IConfigurationEditor *editor, std::int32_t *status) = 0;
    // Writes the editor's configuration (what is committed plus what the
    // editor recorded) to file, replacing it as a whole or not at all.
    virtual void ExportConfiguration(const WString &file, IConfigurationEditor *editor, std::int32_t *status) = 0;

    // 1 when data file changes trigger indexing, 0 when only the schedule does.
    virtual std::int32_t GetChangeTrigger(std::int32_t *status) = 0;
    virtual std::uint32_t GetFileTimeout(std::int32_t *status) = 0; // milliseconds
    virtual std::uint32_t GetIdleTime(std::int32_t *status) = 0;    // seconds
    virtual void GetSchedule(std::int32_t *kind, CalendarTime *when, std::int32_t *status) = 0;
    // Seconds; 0 means not set (the caller shows its default).
    virtual void GetTimeouts(std::uint32_t *browseSeconds, std::uint32_t *querySeconds, std::int32_t *status) = 0;
    virtual void GetIndexPath(WString *path, std::int32_t *status) = 0;

    // Non-zero when the server uses the Parselet (name compared without regard to case).
    virtual std::int32_t IsParseletActive(const WString &name, std::int32_t *status) = 0;
    // Active Parselets reading extension (lower case, without "*."), highest
    // priority first; an empty list when none does.
    virtual IStringList *GetExtensionParselets(const WString &extension, std::int32_t *status) = 0;
};

// The write side: operations record changes; CommitConfiguration applies all
// of them in one step, or none. Releasing an editor without a commit
// discards what it recorded. Arguments that are wrong in themselves fail at
// once; changes that contradict the configuration fail at the commit.
struct SORVIK_EXPORT IConfigurationEditor : IRefCounted
{
    // Adds a search area (isArea 1, isExcluded 0) or an excluded folder
    // (0, 1) below the search area that contains it. One trailing separator
    // of path and clientPath is dropped. tag is kept with the folder. result
    // receives the path under which the folder will be kept.
    virtual void AddFolder(WString *result, const WString &path, const WString &clientPath, const WString &alias,
                           std::int32_t isArea, std::int32_t isExcluded, const WString &tag,
                           std::int32_t *status) = 0;
    // flags 1: the folder and everything recorded below it (the only value in use).
    virtual void RemoveFolder(const WString &path, std::int32_t flags, std::int32_t *status) = 0;
    // New client path and alias of the search area (1, 0) or excluded folder (0, 1) path.
    virtual void UpdateFolder(const WString &path, const WString &clientPath, const WString &alias,
                              std::int32_t isArea, std::int32_t isExcluded, std::int32_t *status) = 0;
    // Gives the folder oldPath the path newPath; a non-empty clientPath
    // replaces its client path. Excluded folders of a moved search area are
    // not moved with it: each is moved by its own call.
    virtual void MoveFolder(const WString &oldPath, const WString &clientPath, const WString &newPath,
                            std::int32_t *status) = 0;
    // kAreaNotAllowed (4) when the store's policy forbids a search area at
    // path or clientPath, else kAreaAllowed; excluded folders are always allowed.
    virtual std::int32_t CheckAreaAllowed(const WString &path, const WString &clientPath, const WString &alias,
                                          std::int32_t isArea, std::int32_t isExcluded, std::int32_t *status) = 0;
    // The search areas named in paths (its texts) come first, in that order.
    virtual void SetSearchAreaOrder(IContainer *paths, std::int32_t *status) = 0;

    // Applies everything recorded in one transaction and forgets it; on
    // failure nothing is applied and the recorded changes are kept. Fails
    // with UpdateTimedOut (-1008) when the store stays locked by another
    // writer longer than the commit time-out.
    virtual void CommitConfiguration(std::int32_t *status) = 0;

    virtual void SetFileTimeout(std::uint32_t milliseconds, std::int32_t *status) = 0; // 5000 to 9999000
    virtual void SetIdleTime(std::uint32_t seconds, std::int32_t *status) = 0;         // 0 to 9999
    // Starts a change of the automatic trigger: mode 0 resets the trigger
    // options to their defaults before the next two calls set them.
    virtual void PrepareTriggerChange(std::int32_t mode, std::int32_t *status) = 0;
    // scope 0 = every search area; events: bits 1 create, 2 modify, 4 delete, 8 rename.
    virtual void SetTriggerOptions(std::int32_t scope, std::int32_t events, std::int32_t *status) = 0;
    virtual void SetChangeTrigger(std::int32_t trigger, std::int32_t *status) = 0; // 0 or 1
    virtual void SetSchedule(std::int32_t kind, const CalendarTime &when, std::int32_t *status) = 0;
    // mode 0: the server starts indexing once the commit is through.
    virtual void StartIndexingNow(std::int32_t mode, std::int32_t *status) = 0;

    virtual void SetBrowseTimeout(std::uint32_t seconds, std::int32_t *status) = 0;     // 0 (unset) or 3 to 9999
    virtual void SetSearchQueryTimeout(std::uint32_t seconds, std::int32_t *status) = 0; // 0 (unset) or 3 to 9999
    virtual void SetIndexPath(const WString &path, std::int32_t *status) = 0;

    // Unknown Parselet names: NotFound.
    virtual void SetParseletActive(const WString &name, std::int32_t active, std::int32_t *status) = 0;
    // Whatever the Parselets named in names (its texts) read is indexed again after the commit.
    virtual void ReindexParselets(IContainer *names, std::int32_t *status) = 0;
    // The priority order of the Parselets (names, its texts) for extension;
    // each must read that extension.
    virtual void SetExtensionParselets(const WString &extension, IContainer *names, std::int32_t *status) = 0;
};

struct ILevelDescription;

// Display names of property levels in one language.
struct SORVIK_EXPORT ITranslator : IRefCounted
{
    virtual WString GetDisplayName(ILevelDescription *level, std::int32_t *status) = 0;
};

// A property level ("file", "qdm_channelgroup", "qdm_channel").
struct SORVIK_EXPORT ILevelDescription : IRefCounted
{
    virtual WString GetName(std::int32_t *status) = 0;
};

struct SORVIK_EXPORT IPropertyModel : IRefCounted
{
    virtual ITranslator *GetTranslator(const WString &language, std::int32_t *status) = 0; // e.g. "eng"
    virtual ILevelDescription *GetLevel(const WString &name, std::int32_t *status) = 0;      // null when unknown
};

// The running server instance behind an index manager.
struct SORVIK_EXPORT IServerContext : IRefCounted
{
    virtual void GetPortName(WString *portName, std::int32_t *status) = 0;
    virtual IPropertyModel *GetPropertyModel(std::int32_t *status) = 0;
};

// The custom properties of one level in the index.
struct SORVIK_EXPORT ILevelPropertyList : IRefCounted
{
    virtual void Fetch(std::int32_t *status) = 0; // makes the list current
    virtual std::uint32_t GetCount(std::int32_t *status) = 0;
    virtual void GetProperty(std::uint32_t index, WString *name, std::uint32_t *occurrences,
                             std::int32_t *status) = 0;
    virtual void StartOccurrenceCount(std::int32_t *status) = 0;
    virtual bool IsCountingOccurrences(std::int32_t *status) = 0;
};

struct SORVIK_EXPORT IIndexStatus : IRefCounted
{
    // Indexing has completed when done equals total.
    virtual void GetIndexingProgress(std::uint32_t *done, std::uint32_t *total, ProgressTime *time,
                                     std::int32_t *status) = 0;
    virtual void GetOptimizationState(const WString &level, const WString &property, std::uint32_t *state,
                                      std::int32_t *status) = 0;
    // Names of the level's optimized properties; states receives their states
    // as 16-bit values (one per name, same order).
    virtual IStringList *ListOptimizedProperties(const WString &level, IContainer *states, std::int32_t *status) = 0;
};

struct SORVIK_EXPORT IOptimizationEditor : IRefCounted
{
    virtual void UnoptimizeProperty(const WString &level, const PropertyRecord *property, std::int32_t *status) = 0;
    // dataType 0: the server's default data type.
    virtual void OptimizeProperty(const WString &level, const PropertyRecord *property, std::uint32_t dataType,
                                  std::int32_t *status) = 0;
    // Applies what was recorded; UpdateTimedOut (-1008) on time-out.
    virtual void Commit(std::int32_t *status) = 0;
};

// Exists only while the server runs: once the server has gone, every
// operation fails with ServerNotRunning.
struct SORVIK_EXPORT IIndexManager : IRefCounted
{
    // major + minor / 100 + patch / 10000: 2.1.0 is 2.01, 18.0.0 is 18.0.
    virtual double GetVersion(std::int32_t *status) = 0;
    virtual void ResetTimeoutFiles(std::int32_t *status) = 0;
    virtual void ResetFailedFiles(std::int32_t *status) = 0;
    // kind kBrowseTimeout or kQueryTimeout; takes effect at once.
    virtual void SetServiceTimeout(std::int32_t kind, std::uint32_t milliseconds, std::int32_t *status) = 0;
    // Returns when the server has applied every change committed before the
    // call; UpdateTimedOut (-1008) when its own time-out passed first,
    // ServerNotRunning when the server is gone or ends meanwhile. Safe to
    // call from any thread.
    virtual void WaitForUpdate(std::int32_t *status) = 0;
    virtual ILevelPropertyList *GetLevelProperties(const WString &level, std::int32_t *status) = 0; // or null
    virtual IServerContext *GetServerContext(std::int32_t *status) = 0;
    virtual bool GetServerFlag(std::int32_t *status) = 0; // true for a server instance, false for the desktop one
    virtual IOptimizationEditor *GetOptimizationEditor(std::int32_t *status) = 0;
    virtual IIndexStatus *GetIndexStatus(std::int32_t *status) = 0;
};

struct SORVIK_EXPORT ISorvik : IRefCounted
{
    virtual WString GetSorvikName(std::int32_t *status) = 0; // empty for the local Sorvik
    virtual IConfigurationView *GetConfigurationView(std::int32_t *status) = 0;
    virtual IConfigurationEditor *GetConfigurationEditor(std::int32_t *status) = 0;
    // The running server's index manager; null (without error) when none runs.
    virtual IIndexManager *GetIndexManager(std::int32_t *status) = 0;
    // mode kResetIndexAndConfiguration or kResetIndex; flags must be 0.
    virtual void ResetSorvik(std::int32_t mode, std::int32_t flags, std::int32_t *status) = 0;
};

struct SORVIK_EXPORT IRovoEnvironment : IRefCounted
{
    // Empty connection text: the local Sorvik. Otherwise tagged elements
    // "<Tag>value</Tag>"; which ones the library reads is its own choice.
    virtual ISorvik *OpenSorvik(const WString &connection, std::int32_t *status) = 0;
};

} // namespace cv::rovo

extern "C" {
SORVIK_EXPORT void Init(void);
SORVIK_EXPORT void Cleanup(void);
// Builds the server environment on a data-store environment (the caller
// keeps its own reference to it).
SORVIK_EXPORT cv::rovo::IRovoEnvironment *rovoCreateEnvironment(cv::vekex::IEnvironment *dataStore,
                                                                std::int32_t *status);
// A readable description of the last failure on the calling thread (empty
// when there was none); not one of the entry points a caller must find.
SORVIK_EXPORT void rovoGetLastErrorText(cv::krn::WString *text);
}

namespace cv::rovo {
using PFN_Init = void (*)();
using PFN_Cleanup = void (*)();
using PFN_rovoCreateEnvironment = IRovoEnvironment *(*)(vekex::IEnvironment *, std::int32_t *);
using PFN_rovoGetLastErrorText = void (*)(WString *);
} // namespace cv::rovo
