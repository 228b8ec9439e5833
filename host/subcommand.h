#pragma once

// The host program's subcommands: one table (subcommands.cpp), each
// subcommand in a source file of its own.

#include "host/modulehost.h"

#include <QStringList>

#include <functional>
#include <span>

namespace host {

// Exit codes of the host program.
constexpr int kExitDone = 0;
constexpr int kExitNotDone = 1; // cancelled, declined or not found
constexpr int kExitUsage = 2;
constexpr int kExitFailed = 3;

struct SubcommandContext
{
    ModuleHost &module;
    // The service object for --connection, set up with the host's font,
    // help callback and wait flag; created on first use, released by the host.
    std::function<IServerDialogs &()> service;
    QStringList arguments; // after the subcommand's name
};

struct Subcommand
{
    const char *name;
    const char *synopsis; // arguments, as the usage text shows them
    int minArguments;
    int maxArguments;
    int (*run)(SubcommandContext &context);
};

std::span<const Subcommand> Subcommands();
const Subcommand *FindSubcommand(const QString &name);

// Prints "result: N" and maps the operation's result to an exit code.
int ReportResult(std::int32_t result);

// The subcommands, each defined in its own file.
int RunAddArea(SubcommandContext &context);
int RunEditArea(SubcommandContext &context);
int RunExclude(SubcommandContext &context);
int RunRemove(SubcommandContext &context);
int RunProperties(SubcommandContext &context);
int RunStats(SubcommandContext &context);
// stats needs neither the module nor a service object.
int RunStats(const QStringList &arguments);

} // namespace host
