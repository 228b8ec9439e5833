// The Add Search Area dialog for PATH (default: empty); on OK the area is added, absorbing the areas inside it.

#include "host/searcharea.h"
#include "host/subcommand.h"

namespace host {

int RunAddArea(SubcommandContext &context)
{
    cv::krn::WString path = ToWString(context.arguments.value(0));
    return ReportResult(context.service().AddSearchArea(path, 0));
}

} // namespace host
