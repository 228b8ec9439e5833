#pragma once

#include "reference/server/server.h"
#include "reference/server/serveroptions.h"

namespace sorvik::server {

// Makes a GSS-API acceptor for each Kerberos log-on, with the keytab and
// principal of the options; empty when the options name no keytab.
Server::AcceptorFactory KerberosAcceptorFactory(const ServerOptions &options);

} // namespace sorvik::server
