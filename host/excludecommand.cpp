// Asks, then excludes the folder PATH from its search area.

#include "host/searcharea.h"
#include "host/subcommand.h"

namespace host {

int RunExclude(SubcommandContext &context)
{
    cv::krn::WString path = ToWString(context.arguments.value(0));
    return ReportResult(context.service().ExcludeFolder(path));
}

} // namespace host
