#include "dunemere/logonclient.h"

#include "dunemere/kerberosclient.h"
#include "dunemere/kerberosclientsid.h"

namespace PLUGIN {

IKerberosClient *CreateLogOnClient(const IConfig &config)
{
    if (config.GetUserSid().empty())
        return new CKerberosClient();
    return new CKerberosClientSID(config.GetUserSid());
}

} // namespace PLUGIN
