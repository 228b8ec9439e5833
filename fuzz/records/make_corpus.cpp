// Writes the seed corpora of the record fuzzers: valid records of every kind,
// compressed ones, and a few broken ones that sit right at a decoder's edges.
//   records_make_corpus DIR    (DIR/response and DIR/request are filled)

#include "dunemere/authenticationrequesttransferdata.h"
#include "dunemere/clientproof.h"
#include "dunemere/requesttransferdata.h"
#include "dunemere/responsetransferauthentication.h"
#include "dunemere/responsetransferdata.h"

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

using namespace cv::vek::rovo;
using Bytes = std::vector<std::uint8_t>;

namespace {

constexpr GUID kId = MakeGuid("{5F3C2A10-7B8D-4E6F-9A0B-1C2D3E4F5A6B}");
constexpr GUID kOther = MakeGuid("{0A1B2C3D-4E5F-6A7B-8C9D-AEBFC0D1E2F3}");

template <typename Record>
Bytes Encode(const Record &record)
{
    cv::krn::ByteBuffer out;
    if (!record.Serialize(out))
        throw std::bad_alloc();
    return {out.data(), out.data() + out.size()};
}

std::uint32_t U32At(const Bytes &b, std::size_t at)
{
    return std::uint32_t(b[at]) | std::uint32_t(b[at + 1]) << 8 | std::uint32_t(b[at + 2]) << 16 |
           std::uint32_t(b[at + 3]) << 24;
}

void PutU32(Bytes &b, std::size_t at, std::uint32_t v)
{
    for (int i = 0; i < 4; ++i)
        b[at + i] = std::uint8_t(v >> (8 * i));
}

Bytes Cut(Bytes b, std::size_t size)
{
    b.resize(size);
    return b;
}

void Save(const std::filesystem::path &dir, const std::string &name, const Bytes &bytes)
{
    std::filesystem::create_directories(dir);
    std::ofstream(dir / name, std::ios::binary).write(reinterpret_cast<const char *>(bytes.data()),
                                                      std::streamsize(bytes.size()));
}

tRequestTransferData Request(std::uint32_t version, std::uint32_t category, std::uint32_t code, int parameters)
{
    tRequestTransferData request(version, category, code);
    request.SetRequestIdentifier(kId);
    for (int i = 0; i < parameters; ++i)
        request.AppendParameter(u"p" + std::u16string(1, char16_t(u'0' + i)));
    return request;
}

void Responses(const std::filesystem::path &dir)
{
    Save(dir, "data_plain", Encode(tResponseTransferData(kId, 0, 2, u"a$3;b$x$y;")));
    Save(dir, "data_empty", Encode(tResponseTransferData(kId, 1, 0)));
    Save(dir, "data_version_rejected", Encode(tResponseTransferData(kId, -65535, sorvik::PackVersion(17, 0, 0))));
    Save(dir, "data_target_name", Encode(tResponseTransferData(kId, 2, 0, u"sorvik@localhost")));

    std::u16string pattern;
    while (pattern.size() <= tResponseTransferData::kCompressionThreshold)
        pattern += u"name" + std::u16string(1, char16_t(u'a' + pattern.size() % 26)) + u"$17;";
    const Bytes compressed = Encode(tResponseTransferData(kId, 0, 9, pattern));
    Save(dir, "data_compressed", compressed);
    Save(dir, "data_compressed_unicode",
         Encode(tResponseTransferData(kId, 0, 1, std::u16string(50000, u'\u20ac'))));

    const std::uint32_t length = U32At(compressed, 28);
    const std::size_t sizeAt = 36 + length;
    Bytes shortU = compressed;
    PutU32(shortU, sizeAt, U32At(compressed, sizeAt) - 1);
    Save(dir, "data_compressed_u_short", shortU);
    Bytes longU = compressed;
    PutU32(longU, sizeAt, U32At(compressed, sizeAt) + 1);
    Save(dir, "data_compressed_u_long", longU);
    Bytes hugeU = compressed;
    PutU32(hugeU, sizeAt, 0xFFFFFFFF);
    Save(dir, "data_compressed_u_huge", hugeU);
    Save(dir, "data_compressed_cut_after_payload", Cut(compressed, 32 + length));
    Save(dir, "data_compressed_no_u", Cut(compressed, sizeAt));
    Save(dir, "data_compressed_cut_in_stream", Cut(compressed, 32 + length / 2));

    Bytes invalid = Encode(tResponseTransferData(kId, 0, 0, u"xxxx"));
    invalid[33] = 0xFF;
    invalid[35] = 0xC3;
    Save(dir, "data_invalid_utf8", invalid);
    Bytes hugeLength = Encode(tResponseTransferData(kId, 0, 0, u"abc"));
    PutU32(hugeLength, 28, 0xFFFFFFFF);
    Save(dir, "data_length_huge", hugeLength);
    Save(dir, "data_cut_in_text", Cut(Encode(tResponseTransferData(kId, 0, 0, u"abcdef")), 34));

    std::vector<std::uint8_t> token(64);
    for (std::size_t i = 0; i < token.size(); ++i)
        token[i] = std::uint8_t(i * 37);
    const Bytes authentication = Encode(tResponseTransferAuthentication(kId, 3, token));
    Save(dir, "auth_token", authentication);
    Save(dir, "auth_empty_token", Encode(tResponseTransferAuthentication(kOther, 1, {})));
    Save(dir, "auth_cut_in_token", Cut(authentication, 40));
    Save(dir, "header_only", Cut(authentication, 24));
    Save(dir, "header_cut", Cut(authentication, 13));
}

void Requests(const std::filesystem::path &dir)
{
    using sorvik::PackVersion;
    tRequestTransferData permission = Request(PackVersion(3, 1, 1), 4, 3001, 0);
    AddPermissionParameters(permission, u"client", u"secret");
    const Bytes permissionBytes = Encode(permission);
    Save(dir, "permission_3_1_1", permissionBytes);
    Save(dir, "permission_3_1_0", Encode(Request(PackVersion(3, 1, 0), 4, 3001, 0)));
    Save(dir, "permission_cut_in_proof", Cut(permissionBytes, permissionBytes.size() - 10));

    tRequestTransferData count = Request(PackVersion(18, 0, 0), 5, 4002, 0);
    count.Arguments()[2] = 8;
    Save(dir, "element_count", Encode(count));

    const GUID ids[] = {kId, kOther, kId};
    tRequestTransferData list = Request(PackVersion(18, 0, 0), 2, 1004, 0);
    list.SetIdentifiers(ids, 3);
    const Bytes listBytes = Encode(list);
    Save(dir, "identifier_list", listBytes);
    Save(dir, "identifier_list_empty", Encode(Request(PackVersion(18, 0, 0), 2, 1004, 0)));
    Bytes negative = listBytes;
    PutU32(negative, 52, 0xFFFFFFFE);
    Save(dir, "identifier_count_negative", negative);
    Bytes huge = listBytes;
    PutU32(huge, 52, 0x7FFFFFFF);
    Save(dir, "identifier_count_huge", huge);

    Save(dir, "strings_6_5001", Encode(Request(PackVersion(18, 0, 0), 6, 5001, 4)));
    Save(dir, "strings_2003_old", Encode(Request(PackVersion(2, 0, 4), 1, 2003, 4)));
    Save(dir, "strings_2003_new", Encode(Request(PackVersion(2, 0, 5), 1, 2003, 5)));
    Save(dir, "strings_1002_v17", Encode(Request(PackVersion(17, 0, 0), 2, 1002, 1)));
    Bytes hugeString = Encode(Request(PackVersion(18, 0, 0), 6, 5002, 3));
    PutU32(hugeString, 56, 0xFFFFFFF0);
    Save(dir, "string_length_huge", hugeString);

    CAuthenticationRequestTransferData step(PackVersion(18, 0, 0));
    step.SetRequestIdentifier(kId);
    const std::uint8_t token[] = {0x53, 0x00, 0x2D, 0x00, 0x31, 0x00};
    step.SetToken(token);
    const Bytes stepBytes = Encode(step);
    Save(dir, "auth_step", stepBytes);
    Save(dir, "auth_step_cut", Cut(stepBytes, 38));
    Save(dir, "header_only", Cut(stepBytes, 36));
}

} // namespace

int main(int argc, char **argv)
{
    if (argc != 2) {
        std::fprintf(stderr, "usage: %s CORPUS_DIR\n", argv[0]);
        return 2;
    }
    const std::filesystem::path root(argv[1]);
    Responses(root / "response");
    Requests(root / "request");
    return 0;
}
