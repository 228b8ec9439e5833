#include "reference/managerchannel/managermessage.h"

#include "reference/managerchannel/managerprotocol.h"

#include <QJsonDocument>

#include <cmath>

namespace sorvik::manager {

cv::krn::ByteBuffer EncodeMessage(const QJsonObject &message)
{
    const QByteArray json = QJsonDocument(message).toJson(QJsonDocument::Compact);
    cv::krn::ByteBuffer record;
    record.append(reinterpret_cast<const std::uint8_t *>(json.constData()), std::size_t(json.size()));
    return record;
}

std::optional<QJsonObject> DecodeMessage(std::span<const std::uint8_t> record, std::size_t limit)
{
    if (record.size() > limit)
        return std::nullopt;
    const QByteArray json = QByteArray::fromRawData(reinterpret_cast<const char *>(record.data()), qsizetype(record.size()));
    QJsonParseError error;
    const QJsonDocument document = QJsonDocument::fromJson(json, &error);
    if (error.error != QJsonParseError::NoError || !document.isObject())
        return std::nullopt;
    return document.object();
}

QJsonObject Answer(std::int32_t status, const QString &text)
{
    QJsonObject answer{{kStatus, status}};
    if (!text.isEmpty())
        answer.insert(kText, text);
    return answer;
}

std::optional<std::int64_t> IntegerField(const QJsonObject &message, QLatin1String name, std::int64_t low,
                                         std::int64_t high)
{
    const QJsonValue value = message.value(name);
    if (!value.isDouble())
        return std::nullopt;
    const double number = value.toDouble();
    // Whole numbers within the range a double holds exactly.
    if (!std::isfinite(number) || number != std::floor(number) || number < double(low) || number > double(high) ||
        std::fabs(number) > 9007199254740992.0)
        return std::nullopt;
    return std::int64_t(number);
}

} // namespace sorvik::manager
