// The Edit Search Area dialog for the search area PATH.

#include "host/searcharea.h"
#include "host/subcommand.h"

namespace host {

int RunEditArea(SubcommandContext &context)
{
    cv::krn::WString path = ToWString(context.arguments.value(0));
    return ReportResult(context.service().EditSearchArea(path, 0));
}

} // namespace host
