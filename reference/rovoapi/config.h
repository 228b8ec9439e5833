#pragma once

// The Sorvik configuration as a value (what import and export move), the
// checks every change goes through, and its rows in the store.

#include "sorvik/rovoapi.h"

#include <QString>

#include <cstdint>
#include <utility>
#include <vector>

namespace sorvik::rovo {

class Db;
struct CatalogueInfo;

struct Folder
{
    QString path;
    QString clientPath;
    QString alias;
    QString tag;
};

struct SearchArea : Folder
{
    std::vector<Folder> excluded;
};

struct Settings
{
    std::uint32_t idleTime = 60;        // seconds
    std::uint32_t fileTimeout = 60000;  // milliseconds
    std::int32_t changeTrigger = 1;
    std::int32_t triggerScope = 0;
    std::int32_t triggerEvents = 15;
    std::int32_t scheduleKind = cv::rovo::kScheduleDaily;
    cv::rovo::CalendarTime scheduleTime{2005, 6, 27, 2, 0, 0};
    std::uint32_t browseTimeout = 0;    // seconds, 0 = not set
    std::uint32_t queryTimeout = 0;     // seconds, 0 = not set
    QString indexPath;
};

struct ParseletSetting
{
    QString name;
    bool active = true;
};

struct ExtensionPriority
{
    QString extension; // lower case, without "*."
    std::vector<QString> parselets;
};

struct Configuration
{
    std::vector<SearchArea> areas; // in their order
    Settings settings;
    std::vector<ParseletSetting> parselets;       // only those set explicitly
    std::vector<ExtensionPriority> priorities;    // only those set explicitly
};

// Paths: one trailing separator ('\' or '/') is dropped unless it is the
// only character; empty paths and control characters are refused
// (InvalidArgument, or code when given).
QString NormalizePath(const QString &path, const char16_t *what, std::int32_t code = cv::rovo::status::InvalidArgument);
// The key under which the store compares paths and aliases: case folded.
QString Key(const QString &text);
// True when inner lies inside outer or equals it (both keys or both paths):
// each is compared with its own separator appended.
bool IsInside(const QString &inner, const QString &outer);
// The form IsInside compares: the key with its separator appended. inner
// lies inside outer exactly when ContainmentKey(outer) starts ContainmentKey(inner).
QString ContainmentKey(const QString &path);
// The folders that can contain path, innermost first: path cut at each of
// its separators (a separator in front stands for the root).
std::vector<QString> EnclosingFolders(const QString &path);

// Range checks shared by the editor and the configuration file reader.
// Each raises Failure with code and a text naming the value.
void CheckIdleTime(std::uint32_t seconds, std::int32_t code);
void CheckFileTimeout(std::uint32_t milliseconds, std::int32_t code);
void CheckChangeTrigger(std::int32_t trigger, std::int32_t code);
void CheckTriggerOptions(std::int32_t scope, std::int32_t events, std::int32_t code);
void CheckSchedule(std::int32_t kind, const cv::rovo::CalendarTime &when, std::int32_t code);
void CheckServiceTimeout(std::uint32_t seconds, std::int32_t code);
void CheckSettings(const Settings &settings, std::int32_t code);

QString FormatTime(const cv::rovo::CalendarTime &when);                 // "yyyy-MM-ddTHH:mm:ssZ"
bool ParseTime(const QString &text, cv::rovo::CalendarTime *when);

// Store rows. ReadSettings raises StoreCorrupt for missing or broken rows.
Settings ReadSettings(Db &db);
void WriteSettings(Db &db, const Settings &settings);
Configuration ReadConfiguration(Db &db);

} // namespace sorvik::rovo
