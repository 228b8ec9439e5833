// A library in the comm library's place that lacks NewClientSocket.

#include "sorvik/com.h"

extern "C" SORVIK_EXPORT int NewClientSocketMissing()
{
    return 0;
}
