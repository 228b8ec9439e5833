#include "reference/rovoapi/config.h"

#include "reference/libsupport/refobject.h"
#include "reference/libsupport/db.h"

#include <QDate>
#include <QRegularExpression>

#include <map>

namespace sorvik::rovo {

namespace status = cv::rovo::status;

namespace {

[[noreturn]] void Bad(std::int32_t code, const QString &text)
{
    ref::Fail(code, text.toStdU16String());
}

QChar SeparatorOf(const QString &path)
{
    return path.contains(u'\\') ? u'\\' : u'/';
}

QString WithSeparator(const QString &path)
{
    const QChar separator = SeparatorOf(path);
    return path.endsWith(separator) ? path : path + separator;
}

const char *const kSettingNames[] = {"idle_time",     "file_timeout",  "change_trigger", "trigger_scope",
                                     "trigger_events", "schedule_kind", "schedule_time",  "browse_timeout",
                                     "query_timeout",  "index_path"};

std::uint32_t ToUnsigned(const QString &text, bool *ok)
{
    const qulonglong value = text.toULongLong(ok);
    if (value > 0xFFFFFFFFull)
        *ok = false;
    return std::uint32_t(value);
}

std::int32_t ToSigned(const QString &text, bool *ok)
{
    return text.toInt(ok);
}

} // namespace

QString NormalizePath(const QString &path, const char16_t *what, std::int32_t code)
{
    if (path.trimmed().isEmpty())
        Bad(code, QStringLiteral("the %1 is empty").arg(QString::fromUtf16(what)));
    for (QChar c : path) {
        if (c.unicode() < 0x20)
            Bad(code, QStringLiteral("the %1 \"%2\" holds a control character").arg(QString::fromUtf16(what), path));
    }
    if (path.size() >= 2 && (path.endsWith(u'\\') || path.endsWith(u'/')))
        return path.left(path.size() - 1);
    return path;
}

QString Key(const QString &text)
{
    return text.toCaseFolded();
}

bool IsInside(const QString &inner, const QString &outer)
{
    if (inner.isEmpty() || outer.isEmpty())
        return false;
    return ContainmentKey(inner).startsWith(ContainmentKey(outer));
}

QString ContainmentKey(const QString &path)
{
    return WithSeparator(Key(path));
}

std::vector<QString> EnclosingFolders(const QString &path)
{
    std::vector<QString> folders;
    for (qsizetype i = path.size() - 1; i >= 0; --i) {
        if (path[i] != u'/' && path[i] != u'\\')
            continue;
        if (i > 0)
            folders.push_back(path.left(i));
        else
            folders.push_back(path.left(1));
    }
    return folders;
}

void CheckIdleTime(std::uint32_t seconds, std::int32_t code)
{
    if (seconds > 9999)
        Bad(code, QStringLiteral("the idle time of %1 s lies outside 0 to 9999 s").arg(seconds));
}

void CheckFileTimeout(std::uint32_t milliseconds, std::int32_t code)
{
    if (milliseconds < 5000 || milliseconds > 9999000)
        Bad(code, QStringLiteral("the time-out per file of %1 ms lies outside 5000 to 9999000 ms").arg(milliseconds));
}

void CheckChangeTrigger(std::int32_t trigger, std::int32_t code)
{
    if (trigger != 0 && trigger != 1)
        Bad(code, QStringLiteral("the change trigger %1 is neither 0 nor 1").arg(trigger));
}

void CheckTriggerOptions(std::int32_t scope, std::int32_t events, std::int32_t code)
{
    if (scope != 0)
        Bad(code, QStringLiteral("the trigger scope %1 is not 0").arg(scope));
    if (events < 0 || events > 15)
        Bad(code, QStringLiteral("the trigger events %1 lie outside 0 to 15").arg(events));
}

void CheckSchedule(std::int32_t kind, const cv::rovo::CalendarTime &when, std::int32_t code)
{
    if (kind < cv::rovo::kScheduleNever || kind > cv::rovo::kScheduleWeeklyLegacy || kind == 4)
        Bad(code, QStringLiteral("the schedule kind %1 is unknown").arg(kind));
    if (when.year < 1900 || when.year > 9999 || !QDate::isValid(when.year, when.month, when.day) ||
        when.hour < 0 || when.hour > 23 || when.minute < 0 || when.minute > 59 || when.second < 0 ||
        when.second > 59)
        Bad(code, QStringLiteral("the schedule time %1 is not a valid date and time").arg(FormatTime(when)));
}

void CheckServiceTimeout(std::uint32_t seconds, std::int32_t code)
{
    if (seconds != 0 && (seconds < 3 || seconds > 9999))
        Bad(code, QStringLiteral("the time-out of %1 s is neither 0 nor within 3 to 9999 s").arg(seconds));
}

void CheckSettings(const Settings &settings, std::int32_t code)
{
    CheckIdleTime(settings.idleTime, code);
    CheckFileTimeout(settings.fileTimeout, code);
    CheckChangeTrigger(settings.changeTrigger, code);
    CheckTriggerOptions(settings.triggerScope, settings.triggerEvents, code);
    CheckSchedule(settings.scheduleKind, settings.scheduleTime, code);
    CheckServiceTimeout(settings.browseTimeout, code);
    CheckServiceTimeout(settings.queryTimeout, code);
    NormalizePath(settings.indexPath, u"index path", code);
}

QString FormatTime(const cv::rovo::CalendarTime &when)
{
    return QString::asprintf("%04d-%02d-%02dT%02d:%02d:%02dZ", when.year, when.month, when.day, when.hour,
                             when.minute, when.second);
}

bool ParseTime(const QString &text, cv::rovo::CalendarTime *when)
{
    static const QRegularExpression pattern(
        QStringLiteral("^(\\d{4})-(\\d{2})-(\\d{2})T(\\d{2}):(\\d{2}):(\\d{2})Z$"));
    const QRegularExpressionMatch match = pattern.match(text);
    if (!match.hasMatch())
        return false;
    *when = {match.captured(1).toInt(), match.captured(2).toInt(), match.captured(3).toInt(),
             match.captured(4).toInt(), match.captured(5).toInt(), match.captured(6).toInt()};
    return true;
}

Settings ReadSettings(Db &db)
{
    std::map<QString, QString> rows;
    Statement select(db, "SELECT name, value FROM settings");
    while (select.Step())
        rows[select.Text(0)] = select.Text(1);

    auto value = [&](const char *name) -> const QString & {
        const auto found = rows.find(QString::fromLatin1(name));
        if (found == rows.end())
            Bad(status::StoreCorrupt, QStringLiteral("the store %1 lacks the setting %2").arg(db.File(), name));
        return found->second;
    };
    bool ok = true;
    auto check = [&](const char *name) {
        if (!ok)
            Bad(status::StoreCorrupt,
                QStringLiteral("the store %1 holds a broken value of the setting %2").arg(db.File(), name));
    };
    Settings settings;
    settings.idleTime = ToUnsigned(value("idle_time"), &ok);
    check("idle_time");
    settings.fileTimeout = ToUnsigned(value("file_timeout"), &ok);
    check("file_timeout");
    settings.changeTrigger = ToSigned(value("change_trigger"), &ok);
    check("change_trigger");
    settings.triggerScope = ToSigned(value("trigger_scope"), &ok);
    check("trigger_scope");
    settings.triggerEvents = ToSigned(value("trigger_events"), &ok);
    check("trigger_events");
    settings.scheduleKind = ToSigned(value("schedule_kind"), &ok);
    check("schedule_kind");
    ok = ParseTime(value("schedule_time"), &settings.scheduleTime);
    check("schedule_time");
    settings.browseTimeout = ToUnsigned(value("browse_timeout"), &ok);
    check("browse_timeout");
    settings.queryTimeout = ToUnsigned(value("query_timeout"), &ok);
    check("query_timeout");
    settings.indexPath = value("index_path");
    CheckSettings(settings, status::StoreCorrupt);
    return settings;
}

void WriteSettings(Db &db, const Settings &settings)
{
    const QString values[] = {QString::number(settings.idleTime),      QString::number(settings.fileTimeout),
                              QString::number(settings.changeTrigger), QString::number(settings.triggerScope),
                              QString::number(settings.triggerEvents), QString::number(settings.scheduleKind),
                              FormatTime(settings.scheduleTime),       QString::number(settings.browseTimeout),
                              QString::number(settings.queryTimeout),  settings.indexPath};
    Statement write(db, "INSERT OR REPLACE INTO settings(name, value) VALUES (?, ?)");
    for (std::size_t i = 0; i < std::size(kSettingNames); ++i) {
        write.Bind(1, QString::fromLatin1(kSettingNames[i])).Bind(2, values[i]).Run();
        write.Reset();
    }
}

Configuration ReadConfiguration(Db &db)
{
    Configuration configuration;
    std::map<std::int64_t, std::size_t> areaIndex;
    Statement areas(db, "SELECT id, path, client_path, alias, tag FROM folders WHERE area_id IS NULL "
                        "ORDER BY position, id");
    while (areas.Step()) {
        SearchArea area;
        area.path = areas.Text(1);
        area.clientPath = areas.Text(2);
        area.alias = areas.Text(3);
        area.tag = areas.Text(4);
        areaIndex[areas.Int(0)] = configuration.areas.size();
        configuration.areas.push_back(std::move(area));
    }
    Statement excluded(db, "SELECT area_id, path, client_path, alias, tag FROM folders WHERE area_id IS NOT NULL "
                           "ORDER BY id");
    while (excluded.Step()) {
        const auto owner = areaIndex.find(excluded.Int(0));
        if (owner == areaIndex.end())
            Bad(status::StoreCorrupt, QStringLiteral("the store %1 holds an excluded folder without its search area")
                                          .arg(db.File()));
        configuration.areas[owner->second].excluded.push_back(
            {excluded.Text(1), excluded.Text(2), excluded.Text(3), excluded.Text(4)});
    }
    configuration.settings = ReadSettings(db);

    Statement parselets(db, "SELECT name, active FROM parselets ORDER BY name_key");
    while (parselets.Step())
        configuration.parselets.push_back({parselets.Text(0), parselets.Int(1) != 0});

    Statement priorities(db, "SELECT extension, parselet FROM extension_priorities ORDER BY extension, rank");
    while (priorities.Step()) {
        const QString extension = priorities.Text(0);
        if (configuration.priorities.empty() || configuration.priorities.back().extension != extension)
            configuration.priorities.push_back({extension, {}});
        configuration.priorities.back().parselets.push_back(priorities.Text(1));
    }
    return configuration;
}

} // namespace sorvik::rovo
