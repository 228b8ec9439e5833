// The properties dialog of the Sorvik; its wait window follows the server
// after OK unless --no-wait was given.

#include "host/subcommand.h"

namespace host {

int RunProperties(SubcommandContext &context)
{
    return ReportResult(context.service().ShowConfigurationDialog());
}

} // namespace host
