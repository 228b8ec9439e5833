// Removes the search area PATH (after asking) or the excluded folder PATH.

#include "host/searcharea.h"
#include "host/subcommand.h"

namespace host {

int RunRemove(SubcommandContext &context)
{
    cv::krn::WString path = ToWString(context.arguments.value(0));
    return ReportResult(context.service().RemoveSearchArea(path));
}

} // namespace host
