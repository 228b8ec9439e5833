#include "reference/server/schedule.h"

#include <QDate>
#include <QTime>

namespace sorvik::server {

std::optional<QDateTime> NextScheduledRun(std::int32_t kind, const cv::rovo::CalendarTime &when,
                                          const QDateTime &after)
{
    const QDateTime now = after.toUTC();
    const QTime time(when.hour, when.minute, when.second);
    if (!time.isValid())
        return std::nullopt;
    switch (kind) {
    case cv::rovo::kScheduleHourly: {
        QDateTime run(now.date(), QTime(now.time().hour(), when.minute, when.second), Qt::UTC);
        if (run <= now)
            run = run.addSecs(3600);
        return run;
    }
    case cv::rovo::kScheduleDaily: {
        QDateTime run(now.date(), time, Qt::UTC);
        if (run <= now)
            run = run.addDays(1);
        return run;
    }
    case cv::rovo::kScheduleWeekly:
    case cv::rovo::kScheduleWeeklyLegacy: {
        const QDate date(when.year, when.month, when.day);
        if (!date.isValid())
            return std::nullopt;
        QDateTime run(now.date(), time, Qt::UTC);
        run = run.addDays((date.dayOfWeek() - now.date().dayOfWeek() + 7) % 7);
        if (run <= now)
            run = run.addDays(7);
        return run;
    }
    default:
        return std::nullopt;
    }
}

} // namespace sorvik::server
