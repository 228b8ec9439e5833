#pragma once

// One record of the manager channel: a compact JSON object.

#include "sorvik/bytebuffer.h"

#include <QLatin1String>

#include <QJsonObject>
#include <QString>

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>

namespace sorvik::manager {

cv::krn::ByteBuffer EncodeMessage(const QJsonObject &message);

// Nothing when the record is larger than limit, is not JSON, or is not an object.
std::optional<QJsonObject> DecodeMessage(std::span<const std::uint8_t> record, std::size_t limit);

// An answer with its status and, on failure, the reason.
QJsonObject Answer(std::int32_t status, const QString &text = {});

// A whole number field within [low, high], or nothing.
std::optional<std::int64_t> IntegerField(const QJsonObject &message, QLatin1String name, std::int64_t low,
                                         std::int64_t high);

} // namespace sorvik::manager
