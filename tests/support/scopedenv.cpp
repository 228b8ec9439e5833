#include "support/scopedenv.h"

#include <cstdlib>

namespace testsupport {

static void assign(const std::string &name, const std::optional<std::string> &value)
{
    if (value)
        ::setenv(name.c_str(), value->c_str(), 1);
    else
        ::unsetenv(name.c_str());
}

ScopedEnv::ScopedEnv(std::string name, const std::optional<std::string> &value)
    : m_name(std::move(name))
{
    if (const char *old = std::getenv(m_name.c_str()))
        m_previous = old;
    assign(m_name, value);
}

ScopedEnv::~ScopedEnv()
{
    assign(m_name, m_previous);
}

} // namespace testsupport
