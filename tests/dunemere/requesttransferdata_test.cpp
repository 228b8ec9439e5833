#include "dunemere/authenticationrequesttransferdata.h"
#include "dunemere/requestidentifier.h"
#include "dunemere/requesttransferdata.h"
#include "dunemere/transferio.h"
#include "krn/exception/bufferoverflow.h"
#include "krn/exception/deserializationerror.h"
#include "sorvik/vekexception.h"
#include "tests/dunemere/wirebytes.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <set>
#include <string>

namespace {

using namespace cv::vek::rovo;
using namespace dunemere_test;
using cv::krn::ByteBuffer;
using cv::krn::exception::BufferOverflow;
using cv::krn::exception::DeserializationError;
using sorvik::PackVersion;

constexpr std::uint32_t V205 = PackVersion(2, 0, 5);
constexpr std::uint32_t V311 = PackVersion(3, 1, 1);
constexpr std::uint32_t V17 = PackVersion(17, 0, 0);
constexpr std::uint32_t V18 = PackVersion(18, 0, 0);

Wire Header(std::uint32_t tag, std::uint32_t version, std::uint32_t category, std::uint32_t code)
{
    return Wire().u32(tag).u32(version).u32(0).u32(category).u32(code).guid(kSampleId);
}

Wire NoArguments(Wire w)
{
    return w.u32(0).u32(0).u32(0).u32(0);
}

template <typename Record>
Record WithSampleId(Record record)
{
    record.SetRequestIdentifier(kSampleId);
    return record;
}

TEST(RequestWire, ByteExactLayouts)
{
    const GUID ids[] = {kSampleId, kOtherId};
    const std::uint8_t token[] = {0xDE, 0xAD, 0x00, 0xBE};

    auto permission = WithSampleId(tRequestTransferData(V311, 4, 3001));
    permission.Arguments() = {1, 2, 3, 0xA0B0C0D0};
    permission.AppendParameter(u"A");
    permission.AppendParameter(u"\u00e9\u20ac");
    auto list = WithSampleId(tRequestTransferData(V18, 2, 1004));
    list.SetIdentifiers(ids, 2);
    auto countOnly = WithSampleId(tRequestTransferData(V18, 2, 1005));
    countOnly.SetIdentifiers(ids, 2);
    auto negative = WithSampleId(tRequestTransferData(V18, 2, 1004));
    negative.SetIdentifiers(ids, -3);
    auto step = WithSampleId(CAuthenticationRequestTransferData(V18));
    step.SetToken(token);
    const auto base = WithSampleId(CRequestTransferDataBase());
    const auto emptyList = WithSampleId(tRequestTransferData(V18, 2, 1004));

    struct Row
    {
        const char *name;
        const CRequestTransferDataBase &record;
        Wire expected;
    };
    const Row rows[] = {
        {"base record: category 4, code 3002", base, Header(48, V18, 4, 3002)},
        {"arguments and parameters",
         permission,
         Header(104, V311, 4, 3001).u32(1).u32(2).u32(3).u32(0xA0B0C0D0).u32(0).str("A").str("\xC3\xA9\xE2\x82\xAC")},
        {"identifier list", list, NoArguments(Header(104, V18, 2, 1004)).u32(2).guid(kSampleId).guid(kOtherId)},
        {"count without list outside 2/1004", countOnly, NoArguments(Header(104, V18, 2, 1005)).u32(2)},
        {"empty list writes the count only", emptyList, NoArguments(Header(104, V18, 2, 1004)).u32(0)},
        {"negative count stored as 0", negative, NoArguments(Header(104, V18, 2, 1004)).u32(0)},
        {"authentication token", step, Header(64, V18, 4, 3002).u32(4).raw(token)},
    };
    for (const Row &row : rows) {
        ByteBuffer out;
        out.append("xy", 2); // serializing appends
        ASSERT_TRUE(row.record.Serialize(out)) << row.name;
        EXPECT_EQ(ToVector(out), Wire().raw("xy").raw(row.expected.bytes).bytes) << row.name;
    }
}

TEST(RequestIdentity, EveryRecordAndEveryReplacedTokenGetsAFreshIdentifier)
{
    EXPECT_FALSE(tRequestTransferData().RequestIdentifier() == tRequestTransferData().RequestIdentifier());
    CAuthenticationRequestTransferData request;
    const GUID first = request.RequestIdentifier();
    const std::uint8_t token[] = {1, 2, 3};
    request.SetToken(token);
    EXPECT_EQ(request.RequestIdentifier(), first) << "the first token keeps the identifier";
    request.SetToken(token);
    EXPECT_FALSE(request.RequestIdentifier() == first);
}

TEST(RequestIdentity, IdentifiersAreRandomUuidsThatDoNotRepeat)
{
    std::set<std::string> seen;
    for (int i = 0; i < 20000; ++i) {
        const std::string text = RequestIdentifierText(NewRequestIdentifier());
        EXPECT_EQ(text[14], '4') << text;                                   // version 4
        EXPECT_NE(std::string("89AB").find(text[19]), std::string::npos) << text; // variant 10xx
        EXPECT_TRUE(seen.insert(text).second) << text;
    }
}

struct CountRow
{
    std::uint32_t version;
    std::uint32_t category;
    std::uint32_t code;
    std::uint32_t expected;
};

class ParameterCountRule : public ::testing::TestWithParam<CountRow>
{
};

TEST_P(ParameterCountRule, RuleSerializationAndDeserializationAgree)
{
    const CountRow row = GetParam();
    ASSERT_EQ(RequestParameterCount(row.version, row.category, row.code), row.expected);

    tRequestTransferData request(row.version, row.category, row.code);
    for (char16_t c = u'a'; c < u'a' + 6; ++c)
        request.AppendParameter(std::u16string(2, c));
    ByteBuffer out;
    ASSERT_TRUE(request.Serialize(out));
    EXPECT_EQ(out.size(), 56 + row.expected * 6) << "exactly N strings, extra parameters left out";

    tRequestTransferData decoded;
    std::size_t position = 0;
    decoded.Deserialize(out, position);
    EXPECT_EQ(position, out.size());
    ASSERT_EQ(decoded.ParameterCount(), row.expected);
    if (row.expected == 0)
        return;
    EXPECT_EQ(decoded.Parameter(row.expected - 1), std::u16string(2, char16_t(u'a' + row.expected - 1)));

    // One parameter short: refused before anything is written.
    tRequestTransferData shortOne(row.version, row.category, row.code);
    for (std::uint32_t i = 0; i + 1 < row.expected; ++i)
        shortOne.AppendParameter(u"p");
    ByteBuffer refused;
    try {
        shortOne.Serialize(refused);
        ADD_FAILURE() << "a request short of parameters was serialized";
    } catch (const cv::vek::Exception &error) {
        EXPECT_EQ(error.Code(), -1007);
    }
    EXPECT_TRUE(refused.empty());
}

constexpr std::uint32_t Below(std::uint32_t version) { return version - 1; }

INSTANTIATE_TEST_SUITE_P(
    WholeTable, ParameterCountRule,
    ::testing::Values(
        // Before 2.0.5 the code alone decides, whatever the category.
        CountRow{Below(V205), 1, 2003, 4}, CountRow{Below(V205), 1, 2001, 1}, CountRow{Below(V205), 1, 2002, 1},
        CountRow{Below(V205), 1, 2004, 1}, CountRow{Below(V205), 1, 2005, 1}, CountRow{Below(V205), 1, 2006, 0},
        CountRow{Below(V205), 7, 3, 1}, CountRow{Below(V205), 1, 1007, 1}, CountRow{Below(V205), 1, 21, 0},
        CountRow{0, 1, 2003, 4},
        // From 2.0.5 on.
        CountRow{V205, 1, 2003, 5}, CountRow{V205, 1, 2001, 2}, CountRow{V205, 1, 2002, 2},
        CountRow{V205, 1, 2004, 2}, CountRow{V205, 1, 2005, 2}, CountRow{V205, 1, 2006, 2},
        CountRow{V205, 1, 3, 1}, CountRow{V205, 1, 21, 1}, CountRow{V205, 1, 1007, 1},
        CountRow{V18, 5, 2003, 5}, CountRow{V18, 2, 3, 1},
        // Category 2 from 17.0.0 on.
        CountRow{V17, 2, 1002, 1}, CountRow{V17, 2, 1008, 1}, CountRow{Below(V17), 2, 1002, 0},
        CountRow{Below(V17), 2, 1008, 0}, CountRow{V18, 3, 1002, 0}, CountRow{V18, 2, 1004, 0},
        // Category 6 at any version.
        CountRow{V18, 6, 5001, 4}, CountRow{V18, 6, 5002, 3}, CountRow{Below(V205), 6, 5001, 4},
        CountRow{Below(V205), 6, 5002, 3}, CountRow{V18, 5, 5001, 0},
        // Permission request from 3.1.1 on.
        CountRow{V311, 4, 3001, 2}, CountRow{Below(V311), 4, 3001, 0}, CountRow{PackVersion(3, 1, 0), 4, 3001, 0},
        CountRow{V18, 4, 3001, 2}, CountRow{V18, 5, 3001, 0}, CountRow{V18, 4, 3002, 0},
        // Everything else carries none.
        CountRow{V18, 5, 4001, 0}, CountRow{V18, 5, 4002, 0}, CountRow{V18, 5, 4009, 0}, CountRow{V18, 1, 6, 0}),
    [](const ::testing::TestParamInfo<CountRow> &info) {
        const CountRow &row = info.param;
        char name[64];
        std::snprintf(name, sizeof name, "v%u_%u_%u_b%u_c%u_k%u", sorvik::VersionMajor(row.version),
                      sorvik::VersionMinor(row.version), sorvik::VersionPatch(row.version),
                      sorvik::VersionBuild(row.version), row.category, row.code);
        return std::string(name);
    });

TEST(RequestParameters, StrictAccessRaisesIllegalNumberLenientAccessGivesEmpty)
{
    tRequestTransferData request;
    request.AppendParameter(u"only");
    EXPECT_EQ(request.Parameter(0), u"only");
    try {
        (void)request.Parameter(1);
        FAIL() << "index beyond the parameters accepted";
    } catch (const cv::vek::Exception &error) {
        EXPECT_EQ(error.Code(), -1007);
        EXPECT_NE(error.Message().view().find(u"illegal number of parameters"), std::u16string_view::npos);
    }
    EXPECT_EQ(request.ParameterOrEmpty(0), u"only");
    EXPECT_TRUE(request.ParameterOrEmpty(1).empty());
}

TEST(RequestRoundTrip, ServerReadsWhatTheClientWrote)
{
    const GUID ids[] = {kOtherId, kSampleId, kOtherId};
    tRequestTransferData list(V18, 2, 1004);
    list.Arguments() = {7, 0, 0xFFFFFFFF, 9};
    list.SetIdentifiers(ids, 3);
    tRequestTransferData permission(V18, 4, 3001);
    permission.AppendParameter(u"Gr\u00fc\u00dfe \U0001D11E");
    permission.AppendParameter(u"");
    CAuthenticationRequestTransferData step(V17);
    const std::uint8_t token[] = {0, 1, 2, 255};
    step.SetToken(token);

    // Back to back: each read stops exactly at its own record's end.
    ByteBuffer out;
    ASSERT_TRUE(list.Serialize(out) && permission.Serialize(out) && step.Serialize(out));
    tRequestTransferData listBack, permissionBack;
    CAuthenticationRequestTransferData stepBack;
    std::size_t position = 0;
    listBack.Deserialize(out, position);
    permissionBack.Deserialize(out, position);
    stepBack.Deserialize(out, position);
    EXPECT_EQ(position, out.size());

    EXPECT_EQ(listBack.RequestIdentifier(), list.RequestIdentifier());
    EXPECT_EQ(listBack.Arguments(), list.Arguments());
    EXPECT_EQ(listBack.Identifiers(), list.Identifiers());
    EXPECT_EQ(permissionBack.Parameters(), permission.Parameters());
    EXPECT_EQ(stepBack.Token(), step.Token());
    EXPECT_EQ(stepBack.Version(), V17);
}

// Every proper prefix of the record's bytes is refused, leaving the position alone.
template <typename Record>
void ExpectEveryTruncationRefused(const Record &record)
{
    ByteBuffer whole;
    ASSERT_TRUE(record.Serialize(whole));
    for (std::size_t cut = 0; cut < whole.size(); ++cut) {
        Record reader;
        std::size_t position = 0;
        EXPECT_THROW(reader.Deserialize(std::span(whole.data(), cut), position), DeserializationError)
            << "cut at " << cut;
        EXPECT_EQ(position, 0u);
    }
}

TEST(RequestHostileInput, TruncationAtEveryOffset)
{
    const GUID ids[] = {kOtherId, kSampleId};
    tRequestTransferData list(V18, 2, 1004);
    list.SetIdentifiers(ids, 2);
    ExpectEveryTruncationRefused(list);

    tRequestTransferData strings(V18, 6, 5001);
    for (auto text : {u"one", u"", u"three", u"\u00e9"})
        strings.AppendParameter(text);
    ExpectEveryTruncationRefused(strings);

    CAuthenticationRequestTransferData step;
    const std::uint8_t token[] = {9, 8, 7};
    step.SetToken(token);
    ExpectEveryTruncationRefused(step);
}

TEST(RequestHostileInput, LengthFieldsBeyondTheBufferOrLimit)
{
    const Wire list = NoArguments(Header(104, V18, 2, 1004));
    const Wire strings = NoArguments(Header(104, V18, 6, 5002)).u32(0);
    struct Row
    {
        const char *name;
        Wire wire;
    };
    const Row rows[] = {
        {"identifier count far beyond the buffer", Wire(list).u32(0x7FFFFFFF).guid(kSampleId)},
        {"string length far beyond the buffer", Wire(strings).u32(0xFFFFFFFF).raw("abc")},
        {"later strings missing", Wire(strings).str("a")},
    };
    for (const Row &row : rows) {
        tRequestTransferData record;
        std::size_t position = 0;
        EXPECT_THROW(record.Deserialize(row.wire.bytes, position), DeserializationError) << row.name;
    }
    const Wire token = Header(64, V18, 4, 3002).u32(100).raw("short");
    CAuthenticationRequestTransferData step;
    std::size_t position = 0;
    EXPECT_THROW(step.Deserialize(token.bytes, position), DeserializationError);

    // Present in the buffer but above the fixed limit.
    Wire many = Wire(list).u32(kMaxIdentifiers + 1);
    many.bytes.resize(many.bytes.size() + std::size_t(kMaxIdentifiers + 1) * 16);
    tRequestTransferData record;
    EXPECT_THROW(record.Deserialize(many.bytes, position), BufferOverflow);

    // A negative count on the wire reads as 0, with no list.
    const Wire negative = Wire(list).u32(0xFFFFFFFF);
    record.Deserialize(negative.bytes, position);
    EXPECT_EQ(record.IdentifierCount(), 0);
    EXPECT_EQ(position, negative.bytes.size());
}

} // namespace
