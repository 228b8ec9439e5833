#pragma once

#include <optional>
#include <string>

namespace testsupport {

// Sets (or with nullopt, unsets) an environment variable and restores the
// previous value when the object goes.
class ScopedEnv final
{
public:
    ScopedEnv(std::string name, const std::optional<std::string> &value);
    ~ScopedEnv();
    ScopedEnv(const ScopedEnv &) = delete;
    ScopedEnv &operator=(const ScopedEnv &) = delete;

private:
    std::string m_name;
    std::optional<std::string> m_previous;
};

} // namespace testsupport
