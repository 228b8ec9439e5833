// Our response decoder and client proof beside the bare library calls they
// wrap: inflating a 64 MiB text against zlib's uncompress of the same stream,
// and the proof against one Crypto++ HMAC<SHA256> of the same message.

#include "dunemere/clientproof.h"
#include "dunemere/requestidentifier.h"
#include "dunemere/responsetransferdata.h"

#include <benchmark/benchmark.h>
#include <cryptopp/hmac.h>
#include <cryptopp/sha.h>
#include <zlib.h>

#include <cstdlib>
#include <memory>
#include <string>

namespace {

using namespace cv::vek::rovo;

constexpr std::size_t kTextBytes = 64u * 1024u * 1024u;
constexpr GUID kId = MakeGuid("{5F3C2A10-7B8D-4E6F-9A0B-1C2D3E4F5A6B}");

// Index statistics as the server sends them: "name$count;" entries.
const cv::krn::ByteBuffer &CompressedResponse()
{
    static const cv::krn::ByteBuffer record = [] {
        std::u16string text;
        text.reserve(kTextBytes);
        for (std::uint32_t i = 0; text.size() < kTextBytes; ++i) {
            const std::string entry = "plugin_" + std::to_string(i % 977) + "$" + std::to_string(i * 7919u % 100003) + ";";
            text.append(entry.begin(), entry.end());
        }
        text.resize(kTextBytes);
        cv::krn::ByteBuffer out;
        if (!tResponseTransferData(kId, 0, 0, std::move(text)).Serialize(out))
            std::abort();
        return out;
    }();
    return record;
}

std::uint32_t U32At(const std::uint8_t *at)
{
    return std::uint32_t(at[0]) | std::uint32_t(at[1]) << 8 | std::uint32_t(at[2]) << 16 | std::uint32_t(at[3]) << 24;
}

void BM_Inflate64MiB_ResponseDecoder(benchmark::State &state)
{
    const auto &record = CompressedResponse();
    for (auto _ : state) {
        const tResponseTransferData response(record);
        benchmark::DoNotOptimize(response.Text().data());
    }
    state.SetBytesProcessed(std::int64_t(state.iterations()) * std::int64_t(kTextBytes));
}

void BM_Inflate64MiB_ZlibUncompress(benchmark::State &state)
{
    const auto &record = CompressedResponse();
    const std::uint32_t length = U32At(record.data() + 28);
    const std::uint8_t *payload = record.data() + 32;
    for (auto _ : state) {
        std::unique_ptr<Bytef[]> text(new Bytef[kTextBytes]);
        uLongf size = kTextBytes;
        if (uncompress(text.get(), &size, payload, length) != Z_OK || size != kTextBytes)
            std::abort();
        benchmark::DoNotOptimize(text.get());
    }
    state.SetBytesProcessed(std::int64_t(state.iterations()) * std::int64_t(kTextBytes));
}

const std::u16string kIdentification = u"sorvik-config@workstation-17";
const std::u16string kSecret = u"0123456789abcdef0123456789abcdef";

void BM_Proof_ComputeClientProof(benchmark::State &state)
{
    for (auto _ : state) {
        auto proof = ComputeClientProof(kSecret, kIdentification, kId);
        benchmark::DoNotOptimize(proof.data());
    }
}

void BM_Proof_CryptoppHmacSha256(benchmark::State &state)
{
    const std::string key(kSecret.begin(), kSecret.end());
    const std::string message = std::string(kIdentification.begin(), kIdentification.end()) + RequestIdentifierText(kId);
    for (auto _ : state) {
        CryptoPP::HMAC<CryptoPP::SHA256> hmac(reinterpret_cast<const CryptoPP::byte *>(key.data()), key.size());
        CryptoPP::byte mac[CryptoPP::HMAC<CryptoPP::SHA256>::DIGESTSIZE];
        hmac.CalculateDigest(mac, reinterpret_cast<const CryptoPP::byte *>(message.data()), message.size());
        benchmark::DoNotOptimize(mac);
    }
}

} // namespace

BENCHMARK(BM_Inflate64MiB_ResponseDecoder)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Inflate64MiB_ZlibUncompress)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_Proof_ComputeClientProof);
BENCHMARK(BM_Proof_CryptoppHmacSha256);

BENCHMARK_MAIN();
