// Feeds arbitrary bytes to the request decoders, as a server receives them
// from any client. A request that decodes must keep its header when encoded
// again, and its encoding must decode back to the same encoding.

#include "dunemere/authenticationrequesttransferdata.h"
#include "dunemere/requesttransferdata.h"
#include "krn/exception/exception.h"

#include <cstdlib>
#include <cstring>

using namespace cv::vek::rovo;

namespace {

template <typename Record>
void DecodeAndReencode(std::span<const std::uint8_t> bytes)
{
    Record record;
    std::size_t position = 0;
    try {
        record.Deserialize(bytes, position);
    } catch (const cv::krn::exception::Exception &) {
        if (position != 0)
            std::abort();
        return;
    }
    cv::krn::ByteBuffer again;
    if (!record.Serialize(again))
        std::abort();
    // Version, then category, code and identifier; the size tag and the
    // reserved word are not read back.
    if (std::memcmp(again.data() + 4, bytes.data() + 4, 4) != 0 ||
        std::memcmp(again.data() + 12, bytes.data() + 12, 24) != 0)
        std::abort();
    // Invalid UTF-8 is replaced and a negative identifier count becomes 0, so
    // the rest may differ from the input, but never between two encodings.
    Record back;
    std::size_t backPosition = 0;
    back.Deserialize(again, backPosition);
    cv::krn::ByteBuffer third;
    if (backPosition != again.size() || !back.Serialize(third) || third.size() != again.size() ||
        std::memcmp(third.data(), again.data(), again.size()) != 0)
        std::abort();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size)
{
    const std::span<const std::uint8_t> bytes(data, size);
    DecodeAndReencode<CRequestTransferDataBase>(bytes);
    DecodeAndReencode<tRequestTransferData>(bytes);
    DecodeAndReencode<CAuthenticationRequestTransferData>(bytes);
    return 0;
}
