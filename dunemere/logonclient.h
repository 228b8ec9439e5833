#pragma once

#include "dunemere/iconfig.h"
#include "dunemere/ikerberosclient.h"

namespace PLUGIN {

// The log-on client the settings ask for: the SID client when they hold a
// security identifier, the Kerberos client otherwise. The caller owns the one
// reference. Raises DataCache::ToIntMsgDa when the client cannot be made.
IKerberosClient *CreateLogOnClient(const IConfig &config);

} // namespace PLUGIN
