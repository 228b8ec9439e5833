#pragma once

// The host program's command line:
//   sorvik-config [--connection TEXT] [--no-wait] [--answers LIST]
//                 [--module FILE] SUBCOMMAND [ARGUMENTS...]
//   sorvik-config [--module FILE] --screenshots DIR
// Options come before the subcommand; what follows it belongs to the
// subcommand.

#include <QString>
#include <QStringList>

#include <optional>

namespace host {

struct Options
{
    QString connection; // empty: the local Sorvik
    bool wait = true;
    std::optional<QStringList> answers;
    QString module;
    QString screenshots;
    QString subcommand;
    QStringList arguments;
    bool help = false;
};

// Nothing, with error set, when the command line is not valid.
std::optional<Options> ParseOptions(const QStringList &arguments, QString &error);
QString UsageText();

} // namespace host
