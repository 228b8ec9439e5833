#include "dunemere/responsetransferauthentication.h"
#include "dunemere/responsetransferdata.h"
#include "dunemere/transferio.h"
#include "krn/exception/bufferoverflow.h"
#include "krn/exception/deserializationerror.h"
#include "tests/dunemere/wirebytes.h"

#include <gtest/gtest.h>

#include <functional>

namespace {

using namespace cv::vek::rovo;
using cv::krn::ByteBuffer;
using cv::krn::exception::BufferOverflow;
using cv::krn::exception::DeserializationError;
using dunemere_test::kSampleId;
using dunemere_test::ReadU32;
using dunemere_test::ToVector;
using dunemere_test::Wire;
using dunemere_test::WriteU32;

Wire ResponseHeader(std::uint32_t tag, std::int32_t status)
{
    return Wire().u32(tag).guid(kSampleId).u32(std::uint32_t(status));
}

std::vector<std::uint8_t> Serialized(const tResponseTransferData &response)
{
    ByteBuffer out;
    EXPECT_TRUE(response.Serialize(out));
    return ToVector(out);
}

TEST(ResponseWire, ByteExactLayoutsBothWays)
{
    const Wire data = ResponseHeader(64, -65535).u32(0x4400000).str("a\xC3\xA9");
    EXPECT_EQ(Serialized(tResponseTransferData(kSampleId, -65535, 0x4400000, u"a\u00e9")), data.bytes);
    const tResponseTransferData dataBack(data.bytes);
    EXPECT_EQ(dataBack.RequestIdentifier(), kSampleId);
    EXPECT_EQ(dataBack.Status(), -65535);
    EXPECT_EQ(dataBack.Value(), 0x4400000u);
    EXPECT_EQ(dataBack.Text(), u"a\u00e9");

    const std::uint8_t token[] = {0x60, 0x00, 0x82};
    const Wire authentication = ResponseHeader(48, 3).u32(3).raw(token);
    ByteBuffer out;
    ASSERT_TRUE(tResponseTransferAuthentication(kSampleId, 3, token).Serialize(out));
    EXPECT_EQ(ToVector(out), authentication.bytes);
    EXPECT_EQ(tResponseTransferAuthentication(out).Token(), std::vector<std::uint8_t>(std::begin(token), std::end(token)));

    // The header alone matches an answer to its request; the tag is kept, not checked.
    const tResponseTransferDataBase header(ResponseHeader(12345, 2).bytes);
    EXPECT_EQ(header.SizeTag(), 12345u);
    EXPECT_EQ(header.RequestIdentifier(), kSampleId);
    EXPECT_EQ(header.Status(), 2);
}

TEST(ResponseCompression, LongTextsTravelCompressedShortOnesPlain)
{
    const std::u16string longText(200000, u'x');
    const auto compressed = Serialized(tResponseTransferData(kSampleId, 0, 1, longText));
    const std::uint32_t length = ReadU32(compressed, 28);
    ASSERT_EQ(compressed.size(), 40 + std::size_t(length));
    EXPECT_LT(length, 10000u);
    EXPECT_EQ(ReadU32(compressed, 32 + length), 1u) << "flags";
    EXPECT_EQ(ReadU32(compressed, 36 + length), 200000u) << "uncompressed length";
    EXPECT_EQ(tResponseTransferData(compressed).Text(), longText);

    const std::u16string limit(tResponseTransferData::kCompressionThreshold, u'x');
    const auto plain = Serialized(tResponseTransferData(kSampleId, 0, 1, limit));
    ASSERT_EQ(plain.size(), 32 + limit.size());
    EXPECT_EQ(ReadU32(plain, 28), limit.size());
    EXPECT_EQ(tResponseTransferData(plain).Text(), limit);

    // The threshold counts UTF-8 bytes, not characters.
    const std::u16string wide(tResponseTransferData::kCompressionThreshold / 2 + 1, u'\u00e9');
    const auto wideBytes = Serialized(tResponseTransferData(kSampleId, 0, 1, wide));
    EXPECT_EQ(ReadU32(wideBytes, 36 + ReadU32(wideBytes, 28)), 2 * wide.size());
    EXPECT_EQ(tResponseTransferData(wideBytes).Text(), wide);
}

TEST(ResponseCompression, MultiByteCharactersAcrossInflationPieces)
{
    // Sequences of three and four bytes at offsets that cannot line up with
    // any power-of-two piece of inflated output.
    std::u16string text = u"a";
    for (int i = 0; i < 150000; ++i)
        text += i % 3 ? u"\u20ac" : u"\U0001F600";
    const auto bytes = Serialized(tResponseTransferData(kSampleId, 0, 1, text));
    EXPECT_EQ(tResponseTransferData(bytes).Text(), text);
}

TEST(ResponseCompression, HighlyRepetitiveTextStaysWithinTheRatioGuard)
{
    const std::u16string run(10 * 1024 * 1024, u'a');
    const auto bytes = Serialized(tResponseTransferData(kSampleId, 0, 1, run));
    EXPECT_EQ(tResponseTransferData(bytes).Text().size(), run.size());
}

TEST(ResponseDecoding, PlainTextUnlessBit0FollowsThePayload)
{
    struct Row
    {
        const char *name;
        std::vector<std::uint8_t> trailer;
    };
    const Row rows[] = {
        {"buffer ends after the payload", {}},
        {"flags 0", {0, 0, 0, 0, 0x10, 0, 0, 0}},
        {"only bit 1 set", {2, 0, 0, 0}},
        {"a lone flags byte without bit 0", {0xFE}},
    };
    for (const Row &row : rows) {
        Wire wire = ResponseHeader(64, 0);
        wire.u32(7).str("text").raw(row.trailer);
        const tResponseTransferData response(wire.bytes);
        EXPECT_EQ(response.Text(), u"text") << row.name;
        EXPECT_EQ(response.Value(), 7u) << row.name;
    }
}

TEST(ResponseDecoding, InvalidUtf8BecomesReplacementCharacters)
{
    Wire wire = ResponseHeader(64, 0);
    wire.u32(0).str("a\xFF" "b\xC3");
    EXPECT_EQ(tResponseTransferData(wire.bytes).Text(), u"a\ufffdb\ufffd");
}

TEST(ResponseHostileInput, TruncationAtEveryOffset)
{
    const std::uint8_t token[] = {1, 2, 3, 4, 5};
    ByteBuffer authentication;
    ASSERT_TRUE(tResponseTransferAuthentication(kSampleId, 3, token).Serialize(authentication));
    for (std::size_t cut = 0; cut < authentication.size(); ++cut) {
        const std::span prefix(authentication.data(), cut);
        EXPECT_THROW(tResponseTransferAuthentication{prefix}, DeserializationError) << "cut at " << cut;
        if (cut < tResponseTransferDataBase::kHeaderSize) {
            EXPECT_THROW(tResponseTransferDataBase{prefix}, DeserializationError) << "cut at " << cut;
        }
    }

    const auto plain = Serialized(tResponseTransferData(kSampleId, 0, 1, u"hello"));
    for (std::size_t cut = 0; cut < plain.size(); ++cut)
        EXPECT_THROW(tResponseTransferData(std::span(plain.data(), cut)), DeserializationError) << "cut at " << cut;

    // A compressed record cut exactly after its payload reads as plain text,
    // by the rule that keeps older servers working; every other cut fails.
    const auto compressed = Serialized(tResponseTransferData(kSampleId, 0, 1, std::u16string(150000, u'z')));
    const std::size_t payloadEnd = 32 + ReadU32(compressed, 28);
    for (std::size_t cut = 0; cut < compressed.size(); ++cut) {
        const std::span prefix(compressed.data(), cut);
        if (cut == payloadEnd) {
            EXPECT_NO_THROW(tResponseTransferData{prefix});
        } else {
            EXPECT_THROW(tResponseTransferData{prefix}, DeserializationError) << "cut at " << cut;
        }
    }
}

TEST(ResponseHostileInput, TamperedCompressedRecords)
{
    const auto valid = Serialized(tResponseTransferData(kSampleId, 0, 1, std::u16string(200000, u'q')));
    const std::uint32_t length = ReadU32(valid, 28);
    const std::size_t flagsAt = 32 + length;
    const std::size_t sizeAt = 36 + length;

    using Edit = std::function<void(std::vector<std::uint8_t> &)>;
    struct Row
    {
        const char *name;
        Edit edit;
        bool overflow; // BufferOverflow rather than DeserializationError
    };
    const Row rows[] = {
        {"payload length beyond the buffer", [](auto &b) { WriteU32(b, 28, 0xFFFFFFF0); }, false},
        {"stream inflates to more than U", [=](auto &b) { WriteU32(b, sizeAt, 199999); }, true},
        {"stream inflates to fewer than U", [=](auto &b) { WriteU32(b, sizeAt, 200001); }, false},
        {"U beyond what the payload can produce",
         [=](auto &b) { WriteU32(b, sizeAt, length * std::uint32_t(tResponseTransferData::kMaxInflationRatio) + 1); },
         false},
        {"U above the fixed limit", [=](auto &b) { WriteU32(b, sizeAt, kMaxTextBytes + 1); }, true},
        {"U missing", [=](auto &b) { b.resize(sizeAt); }, false},
        {"flags cut to one byte", [=](auto &b) { b.resize(flagsAt + 1); }, false},
        {"stream cut short", [=](auto &b) {
             // Drop the last ten stream bytes, keeping flags and U behind the payload.
             b.erase(b.begin() + std::ptrdiff_t(flagsAt) - 10, b.begin() + std::ptrdiff_t(flagsAt));
             WriteU32(b, 28, length - 10);
         }, false},
        {"corrupt stream", [=](auto &b) { b[32] ^= 0xFF; }, false},
        {"corrupt checksum", [=](auto &b) { b[flagsAt - 1] ^= 0x01; }, false},
    };
    for (const Row &row : rows) {
        auto bytes = valid;
        row.edit(bytes);
        if (row.overflow) {
            EXPECT_THROW(tResponseTransferData{bytes}, BufferOverflow) << row.name;
        } else {
            EXPECT_THROW(tResponseTransferData{bytes}, DeserializationError) << row.name;
        }
    }
}

TEST(ResponseHostileInput, EmptyTextFromAnEmptyStream)
{
    // flags set, U = 0 and a valid zlib stream of nothing: an empty text.
    const std::uint8_t emptyStream[] = {0x78, 0x9C, 0x03, 0x00, 0x00, 0x00, 0x00, 0x01};
    Wire wire = ResponseHeader(64, 0);
    wire.u32(0).u32(sizeof emptyStream).raw(emptyStream).u32(1).u32(0);
    EXPECT_TRUE(tResponseTransferData(wire.bytes).Text().empty());
}

} // namespace
