#include "host/options.h"

#include "host/autoanswer.h"
#include "host/subcommand.h"

namespace host {

namespace {

bool TakeValue(const QStringList &arguments, qsizetype &at, QString &value, QString &error)
{
    if (at + 1 >= arguments.size()) {
        error = arguments[at] + QStringLiteral(" needs a value");
        return false;
    }
    value = arguments[++at];
    return true;
}

bool CheckSubcommand(const Options &options, QString &error)
{
    const Subcommand *subcommand = FindSubcommand(options.subcommand);
    if (!subcommand) {
        error = QStringLiteral("unknown subcommand: ") + options.subcommand;
        return false;
    }
    const auto count = options.arguments.size();
    if (count < subcommand->minArguments || count > subcommand->maxArguments) {
        error = QStringLiteral("usage: %1 %2").arg(QLatin1String(subcommand->name), QLatin1String(subcommand->synopsis));
        return false;
    }
    return true;
}

} // namespace

std::optional<Options> ParseOptions(const QStringList &arguments, QString &error)
{
    Options options;
    qsizetype at = 1;
    for (; at < arguments.size() && arguments[at].startsWith(u'-'); ++at) {
        const QString &option = arguments[at];
        QString value;
        if (option == u"--help" || option == u"-h") {
            options.help = true;
            return options;
        }
        if (option == u"--no-wait") {
            options.wait = false;
        } else if (option == u"--connection") {
            if (!TakeValue(arguments, at, options.connection, error))
                return std::nullopt;
        } else if (option == u"--module") {
            if (!TakeValue(arguments, at, options.module, error))
                return std::nullopt;
        } else if (option == u"--screenshots") {
            if (!TakeValue(arguments, at, options.screenshots, error))
                return std::nullopt;
        } else if (option == u"--answers") {
            if (!TakeValue(arguments, at, value, error))
                return std::nullopt;
            options.answers = value.split(u',', Qt::SkipEmptyParts);
            for (const QString &answer : *options.answers) {
                if (!AutoAnswer::IsAnswer(answer)) {
                    error = QStringLiteral("not an answer: ") + answer;
                    return std::nullopt;
                }
            }
        } else {
            error = QStringLiteral("unknown option: ") + option;
            return std::nullopt;
        }
    }
    if (at < arguments.size()) {
        options.subcommand = arguments[at];
        options.arguments = arguments.mid(at + 1);
    }
    if (!options.screenshots.isEmpty()) {
        if (!options.subcommand.isEmpty()) {
            error = QStringLiteral("--screenshots takes no subcommand");
            return std::nullopt;
        }
        return options;
    }
    if (options.subcommand.isEmpty()) {
        error = QStringLiteral("no subcommand");
        return std::nullopt;
    }
    if (!CheckSubcommand(options, error))
        return std::nullopt;
    return options;
}

QString UsageText()
{
    QString text = QStringLiteral(
        "usage: sorvik-config [--connection TEXT] [--no-wait] [--answers LIST] [--module FILE] SUBCOMMAND [ARGS]\n"
        "       sorvik-config [--module FILE] --screenshots DIR\n"
        "  --connection TEXT  the Sorvik to configure (default: the local one)\n"
        "  --no-wait          no wait window after a commit\n"
        "  --answers LIST     for automation: comma-separated answers (ok, cancel, yes, no), one for each\n"
        "                     modal window as it appears; a window left without one is cancelled\n"
        "  --module FILE      libServerDialogs.so to load\n"
        "  --screenshots DIR  render every dialog of the module to PNG files in DIR\n"
        "subcommands:\n");
    for (const Subcommand &subcommand : Subcommands())
        text += QStringLiteral("  %1 %2\n").arg(QLatin1String(subcommand.name), QLatin1String(subcommand.synopsis));
    return text;
}

} // namespace host
