#pragma once

#include "sorvik/rovoapi.h"

#include <QDateTime>

#include <optional>

namespace sorvik::server {

// The first time after `after` at which the indexing schedule (kind and
// date-time of GetSchedule, in UTC) falls due: hourly at the minute and
// second of the time, daily at its time of day, weekly (kinds 3 and 5) at
// that time on the weekday of its date. Nothing for "never" (kind 0) or an
// unknown kind.
std::optional<QDateTime> NextScheduledRun(std::int32_t kind, const cv::rovo::CalendarTime &when,
                                          const QDateTime &after);

} // namespace sorvik::server
