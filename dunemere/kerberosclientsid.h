#pragma once

#include "dunemere/ikerberosclient.h"

#include <string>

namespace PLUGIN {

// Logs on by presenting a security identifier text in a single step; the
// server decides what that identity may do.
class CKerberosClientSID final : public IKerberosClient
{
public:
    // Throws DataCache::ToIntMsgDa 181 "KerberosClientSID Error: SID empty".
    explicit CKerberosClientSID(std::u16string sid);

    // Puts the SID text as UTF-16LE code units (no terminator) into the
    // record; always true.
    bool StartAuthentication(const cv::krn::ByteBuffer &lastResponse,
                             cv::vek::rovo::CAuthenticationRequestTransferData &record) override;
    // There is no second step: always false.
    bool ContinueAuthentication(const cv::krn::ByteBuffer &lastResponse,
                                cv::vek::rovo::CAuthenticationRequestTransferData &record) override;
    // The local account of the SID; empty when it has none.
    std::u16string GetUserName() override;

private:
    std::u16string m_sid;
};

} // namespace PLUGIN
