#include "dunemere/tointmsgda.h"

#include <gtest/gtest.h>

namespace {

using DataCache::ToIntMsgDa;

TEST(ToIntMsgDa, MessageForm)
{
    struct Row
    {
        std::u16string_view source;
        std::uint32_t position;
        std::uint32_t code;
        std::u16string_view text;
        std::u16string_view message;
    };
    const Row rows[] = {
        {u"RequestorBase", 512, 60, u"Error: cannot connect to server.",
         u"RequestorBase(512): ERROR(60): Error: cannot connect to server."},
        {u"/src/dunemere/KerberosClientSID.cpp", 7, 181, u"KerberosClientSID Error: SID empty",
         u"KerberosClientSID(7): ERROR(181): KerberosClientSID Error: SID empty"},
        {u"C:\\src\\rovoCommClient.cpp", 0, 0xFFFFFFFF, u"", u"rovoCommClient(0): ERROR(4294967295): "},
    };
    for (const Row &row : rows) {
        const ToIntMsgDa error(row.source, row.position, row.code, row.text);
        EXPECT_EQ(error.Code(), row.code);
        EXPECT_EQ(error.Message(), row.message);
    }
}

TEST(ToIntMsgDa, PositionDefaultsToTheRaisingLine)
{
    const std::string line = std::to_string(__LINE__ + 1);
    const ToIntMsgDa error(u"RequestorBase", 180, u"SKCP:     Timeout during send");
    const std::u16string expected = u"RequestorBase(" + std::u16string(line.begin(), line.end()) +
                                    u"): ERROR(180): SKCP:     Timeout during send";
    EXPECT_EQ(error.Message(), expected);
}

} // namespace
