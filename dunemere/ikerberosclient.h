#pragma once

#include "dunemere/irefcountedbase.h"
#include "sorvik/bytebuffer.h"

#include <string>

namespace cv::vek::rovo {
class CAuthenticationRequestTransferData;
}

namespace PLUGIN {

// A log-on client: produces the tokens of the authentication steps. A step
// returns true when it has put a token into the record that must be sent,
// false when the log-on is complete from the client's side. Failures raise
// DataCache::ToIntMsgDa.
class IKerberosClient : public cv::vek::rovo::IRefCountedBase
{
public:
    // lastResponse is the server's answer to the permission request.
    virtual bool StartAuthentication(const cv::krn::ByteBuffer &lastResponse,
                                     cv::vek::rovo::CAuthenticationRequestTransferData &record) = 0;
    // lastResponse is the server's answer to the previous step.
    virtual bool ContinueAuthentication(const cv::krn::ByteBuffer &lastResponse,
                                        cv::vek::rovo::CAuthenticationRequestTransferData &record) = 0;
    virtual std::u16string GetUserName() = 0;
};

} // namespace PLUGIN
