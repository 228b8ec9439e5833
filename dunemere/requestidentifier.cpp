#include "dunemere/requestidentifier.h"

#include <QRandomGenerator>

namespace cv::vek::rovo {

GUID NewRequestIdentifier()
{
    // A random (version 4) UUID, as QUuid::createUuid makes one, but from the
    // global generator, which the system seeds once: createUuid asks the
    // system for every one, and on this kind of machine that took about
    // 8 microseconds, more than the rest of an exchange with the server.
    // An identifier only has to differ from the others; the client proof's
    // strength lies in the secret key, not in an unpredictable identifier.
    quint32 words[4];
    QRandomGenerator::global()->fillRange(words);
    GUID identifier{words[0], quint16(words[1]), quint16((words[1] >> 16 & 0x0FFF) | 0x4000), {}};
    for (int i = 0; i < 8; ++i)
        identifier.Data4[i] = quint8(words[2 + i / 4] >> (8 * (i % 4)));
    identifier.Data4[0] = quint8((identifier.Data4[0] & 0x3F) | 0x80);
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
