// Feeds arbitrary bytes to the client's response decoders, as if the server
// (or anybody on the path) had sent them. Decoded data responses must
// survive a round trip unchanged.

#include "dunemere/responsetransferauthentication.h"
#include "dunemere/responsetransferdata.h"
#include "krn/exception/exception.h"

#include <cstdlib>

using namespace cv::vek::rovo;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t *data, std::size_t size)
{
    const std::span<const std::uint8_t> bytes(data, size);
    try {
        const tResponseTransferDataBase header(bytes);
    } catch (const cv::krn::exception::Exception &) {
    }
    try {
        const tResponseTransferAuthentication authentication(bytes);
    } catch (const cv::krn::exception::Exception &) {
    }
    try {
        const tResponseTransferData response(bytes);
        // Long texts would be compressed again on every run; the short ones
        // cover the encoder and keep the fuzzer fast.
        if (response.Text().size() <= 4096) {
            cv::krn::ByteBuffer again;
            if (!response.Serialize(again))
                std::abort();
            const tResponseTransferData back(again);
            if (back.Text() != response.Text() || back.Value() != response.Value() ||
                back.Status() != response.Status() || !(back.RequestIdentifier() == response.RequestIdentifier()))
                std::abort();
        }
    } catch (const cv::krn::exception::Exception &) {
    }
    return 0;
}
