#include "dunemere/clientproof.h"
#include "dunemere/requestidentifier.h"
#include "dunemere/requesttransferdata.h"
#include "tests/dunemere/wirebytes.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

using namespace cv::vek::rovo;
using dunemere_test::kOtherId;
using sorvik::PackVersion;

std::span<const std::uint8_t> Bytes(const std::string &text)
{
    return {reinterpret_cast<const std::uint8_t *>(text.data()), text.size()};
}

TEST(ClientProof, Rfc4231Vectors)
{
    struct Row
    {
        std::string key;
        std::string data;
        const char *mac;
    };
    const Row rows[] = {
        {std::string(20, '\x0b'), "Hi There", "b0344c61d8db38535ca8afceaf0bf12b881dc200c9833da726e9376c2e32cff7"},
        {"Jefe", "what do ya want for nothing?", "5bdcc146bf60754e6a042426089575c75a003f089d2739839dec58b964ec3843"},
        {std::string(131, '\xaa'), "Test Using Larger Than Block-Size Key - Hash Key First",
         "60e431591ee0b67f0d8a26aacbf5b77f8e0bc6213728c5140546040f0ee37f54"},
    };
    for (const Row &row : rows)
        EXPECT_EQ(HmacSha256Hex(Bytes(row.key), Bytes(row.data)), row.mac) << row.data;
}

TEST(ClientProof, MessageIsIdentificationAndUpperCaseIdentifierProofIsLowerCase)
{
    EXPECT_EQ(RequestIdentifierText(kOtherId), "0A1B2C3D-4E5F-6A7B-8C9D-AEBFC0D1E2F3");
    // HMAC-SHA256 under UTF-8 "s3cret-ß" of UTF-8 "client-Ä0A1B2C3D-4E5F-6A7B-8C9D-AEBFC0D1E2F3";
    // the lower-case identifier text would give d2107e63….
    EXPECT_EQ(ComputeClientProof(u"s3cret-\u00df", u"client-\u00c4", kOtherId),
              u"a5a6cf0ace017c827096d104612d65d28e2e9325a591f46ce65a3c0b6a283982");
}

TEST(ClientProof, PermissionRequestParameters)
{
    // Before 3.1.1: none. From 3.1.1: two, empty unless both values are given.
    struct Row
    {
        std::uint32_t version;
        std::u16string_view identification;
        std::u16string_view key;
        std::size_t count;
        bool empty;
    };
    const Row rows[] = {
        {PackVersion(3, 1, 0), u"client", u"key", 0, true},
        {PackVersion(3, 1, 1), u"client", u"", 2, true},
        {PackVersion(3, 1, 1), u"", u"key", 2, true},
        {PackVersion(18, 0, 0), u"client", u"key", 2, false},
    };
    for (const Row &row : rows) {
        tRequestTransferData request(row.version, 4, 3001);
        AddPermissionParameters(request, row.identification, row.key);
        ASSERT_EQ(request.ParameterCount(), row.count);
        cv::krn::ByteBuffer out;
        ASSERT_TRUE(request.Serialize(out));
        if (row.count == 0)
            continue;
        if (row.empty) {
            EXPECT_EQ(request.Parameters(), std::vector<std::u16string>(2));
            EXPECT_EQ(out.size(), 56u + 4 + 4) << "two empty strings";
        } else {
            EXPECT_EQ(request.Parameter(0), row.identification);
            EXPECT_EQ(request.Parameter(1), ComputeClientProof(row.key, row.identification, request.RequestIdentifier()));
        }
    }
}

} // namespace
