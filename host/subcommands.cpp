#include "host/subcommand.h"

#include <cstdio>

namespace host {

namespace {

// A new subcommand: a source file with its Run function, a line here.
constexpr Subcommand kSubcommands[] = {
    {"add-area", "[PATH]", 0, 1, &RunAddArea},
    {"edit-area", "PATH", 1, 1, &RunEditArea},
    {"exclude", "PATH", 1, 1, &RunExclude},
    {"remove", "PATH", 1, 1, &RunRemove},
    {"properties", "", 0, 0, &RunProperties},
    {"stats", "[--portname NAME] [--identification TEXT --secretkey KEY] [--wait]", 0, 7, &RunStats},
};

} // namespace

std::span<const Subcommand> Subcommands()
{
    return kSubcommands;
}

const Subcommand *FindSubcommand(const QString &name)
{
    for (const Subcommand &subcommand : kSubcommands) {
        if (name == QLatin1String(subcommand.name))
            return &subcommand;
    }
    return nullptr;
}

int ReportResult(std::int32_t result)
{
    std::printf("result: %d\n", int(result));
    return result == 1 ? kExitDone : kExitNotDone;
}

} // namespace host
