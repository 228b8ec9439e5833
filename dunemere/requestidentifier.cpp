#include "dunemere/requestidentifier.h"

#include <QUuid>

namespace cv::vek::rovo {

GUID NewRequestIdentifier()
{
    const QUuid uuid = QUuid::createUuid();
    GUID identifier{uuid.data1, uuid.data2, uuid.data3, {}};
    for (int i = 0; i < 8; ++i)
        identifier.Data4[i] = uuid.data4[i];
    return identifier;
}

void AppendRequestIdentifierText(const GUID &identifier, std::string &out)
{
    static constexpr char kDigits[] = "0123456789ABCDEF";
    char text[36];
    char *next = text;
    const auto put = [&next](std::uint32_t value, int digits) {
        for (int shift = (digits - 1) * 4; shift >= 0; shift -= 4)
            *next++ = kDigits[value >> shift & 0xF];
    };
    put(identifier.Data1, 8);
    *next++ = '-';
    put(identifier.Data2, 4);
    *next++ = '-';
    put(identifier.Data3, 4);
    *next++ = '-';
    put(identifier.Data4[0], 2);
    put(identifier.Data4[1], 2);
    *next++ = '-';
    for (int i = 2; i < 8; ++i)
        put(identifier.Data4[i], 2);
    out.append(text, sizeof text);
}

std::string RequestIdentifierText(const GUID &identifier)
{
    std::string text;
    AppendRequestIdentifierText(identifier, text);
    return text;
}

} // namespace cv::vek::rovo
