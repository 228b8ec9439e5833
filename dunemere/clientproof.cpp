#include "dunemere/clientproof.h"

#include "dunemere/requestidentifier.h"
#include "dunemere/requesttransferdata.h"
#include "dunemere/utf8codec.h"

#include <cryptopp/hmac.h>
#include <cryptopp/sha.h>

namespace cv::vek::rovo {

namespace {

std::span<const std::uint8_t> Bytes(std::string_view text)
{
    return {reinterpret_cast<const std::uint8_t *>(text.data()), text.size()};
}

constexpr std::size_t kMacSize = CryptoPP::HMAC<CryptoPP::SHA256>::DIGESTSIZE;

// False when Crypto++ reports an error.
bool HmacSha256(std::span<const std::uint8_t> key, std::span<const std::uint8_t> message, char (&hex)[2 * kMacSize])
{
    static constexpr char kDigits[] = "0123456789abcdef";
    try {
        CryptoPP::HMAC<CryptoPP::SHA256> hmac(key.data(), key.size());
        CryptoPP::byte mac[kMacSize];
        hmac.CalculateDigest(mac, message.data(), message.size());
        for (std::size_t i = 0; i < kMacSize; ++i) {
            hex[2 * i] = kDigits[mac[i] >> 4];
            hex[2 * i + 1] = kDigits[mac[i] & 0xF];
        }
        return true;
    } catch (const CryptoPP::Exception &) {
        return false;
    }
}

} // namespace

std::string HmacSha256Hex(std::span<const std::uint8_t> key, std::span<const std::uint8_t> message)
{
    char hex[2 * kMacSize];
    if (!HmacSha256(key, message, hex))
        return {};
    return std::string(hex, sizeof hex);
}

std::u16string ComputeClientProof(std::u16string_view secretKey, std::u16string_view identification,
                                  const GUID &requestIdentifier)
{
    const std::string key = Utf16ToUtf8(secretKey);
    std::string message;
    message.reserve(3 * identification.size() + 36);
    AppendUtf8(identification, message);
    AppendRequestIdentifierText(requestIdentifier, message);
    char hex[2 * kMacSize];
    if (!HmacSha256(Bytes(key), Bytes(message), hex))
        return {};
    return std::u16string(hex, hex + sizeof hex);
}

void AddPermissionParameters(tRequestTransferData &request, std::u16string_view identification,
                             std::u16string_view secretKey)
{
    if (request.Version() < sorvik::PackVersion(3, 1, 1))
        return;
    if (identification.empty() || secretKey.empty()) {
        request.AppendParameter({});
        request.AppendParameter({});
        return;
    }
    request.AppendParameter(std::u16string(identification));
    request.AppendParameter(ComputeClientProof(secretKey, identification, request.RequestIdentifier()));
}

} // namespace cv::vek::rovo
