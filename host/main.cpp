// sorvik-config: a host of libServerDialogs.so. It loads the module with
// dlopen as any host application would, starts it, and runs one of its
// operations for the Sorvik named by --connection.

#include "host/autoanswer.h"
#include "host/modulehost.h"
#include "host/options.h"
#include "host/subcommand.h"
#include "sorvik/vekexception.h"

#include <QApplication>
#include <QDir>
#include <QFileInfo>
#include <QFont>
#include <QEventLoop>
#include <QScreen>
#include <QTimer>

#include <cmath>
#include <cstdio>
#include <cstring>
#include <memory>

namespace {

using namespace host;

void PrintHelpTopic(BSTR topic, std::uintptr_t context)
{
    const QString text = QString::fromUtf16(topic, qsizetype(SysStringLen(topic)));
    std::printf("help: %s (context %llu)\n", qUtf8Printable(text), static_cast<unsigned long long>(context));
    std::fflush(stdout);
}

// The application font as the dialog font, described as a host describes it.
LOGFONTW ApplicationFont()
{
    const QFont font = QApplication::font();
    const int dpi = QApplication::primaryScreen() ? int(QApplication::primaryScreen()->logicalDotsPerInchY()) : 96;
    LOGFONTW result;
    std::memset(&result, 0, sizeof result);
    const double points = font.pointSizeF() > 0 ? font.pointSizeF() : 9.0;
    result.lfHeight = -std::int32_t(std::lround(points * dpi / 72.0));
    result.lfWeight = 400;
    const QString family = font.family().left(LF_FACESIZE - 1);
    std::memcpy(result.lfFaceName, family.utf16(), sizeof(char16_t) * std::size_t(family.size()));
    return result;
}

QString ModuleFile(const Options &options)
{
    if (!options.module.isEmpty())
        return options.module;
    const QString beside =
        QDir(QCoreApplication::applicationDirPath()).filePath(QStringLiteral("../entry/libServerDialogs.so"));
    return QFileInfo::exists(beside) ? QDir::cleanPath(beside) : QStringLiteral(SORVIK_SERVERDIALOGS_FILE);
}

int RenderScreenshots(ModuleHost &module, const QString &folder, const LOGFONTW &font)
{
    const std::int32_t written = module.RenderDialogs(QDir(folder).absolutePath(), &font);
    if (written <= 0) {
        std::fprintf(stderr, "sorvik-config: no screenshots written to %s\n", qUtf8Printable(folder));
        return kExitFailed;
    }
    std::printf("screenshots: %d files in %s\n", int(written), qUtf8Printable(QDir(folder).absolutePath()));
    return kExitDone;
}

// A host lets the module's modeless windows (the wait window after a
// commit) finish before it ends the module.
void WaitForModelessWindows(ModuleHost &module)
{
    QEventLoop loop;
    QTimer poll;
    QObject::connect(&poll, &QTimer::timeout, &loop, [&] {
        if (!module.InUse())
            loop.quit();
    });
    poll.start(50);
    if (module.InUse())
        loop.exec();
}

int RunSubcommand(ModuleHost &module, const Options &options, const LOGFONTW &font)
{
    IServerDialogs *service = nullptr;
    // Released before the module's Cleanup, whatever happens.
    const std::unique_ptr<IServerDialogs *, void (*)(IServerDialogs **)> release(&service, [](IServerDialogs **s) {
        if (*s)
            (*s)->Release();
    });
    SubcommandContext context{module,
                              [&]() -> IServerDialogs & {
                                  if (!service) {
                                      std::int32_t status = 0;
                                      service = module.CreateService(options.connection, &status);
                                      if (!service)
                                          throw cv::vek::Exception(status, cv::krn::WString(u"no service object"));
                                      service->SetDialogFont(&font);
                                      service->SetHelpCallback(&PrintHelpTopic, 0);
                                      service->SetWaitFlag(options.wait ? 1 : 0);
                                  }
                                  return *service;
                              },
                              options.arguments};
    std::unique_ptr<AutoAnswer> answers;
    if (options.answers)
        answers = std::make_unique<AutoAnswer>(*options.answers);
    try {
        const int exitCode = FindSubcommand(options.subcommand)->run(context);
        return answers && answers->Unanswered() > 0 && exitCode == kExitDone ? kExitNotDone : exitCode;
    } catch (const cv::vek::Exception &e) {
        const QString message = QString::fromUtf16(e.Message().c_str(), qsizetype(e.Message().size()));
        std::fprintf(stderr, "sorvik-config: error %d: %s\n", int(e.Code()), qUtf8Printable(message));
        return kExitFailed;
    }
}

QStringList ArgumentsOf(int argc, char **argv)
{
    QStringList arguments;
    for (int i = 0; i < argc; ++i)
        arguments.append(QString::fromLocal8Bit(argv[i]));
    return arguments;
}

} // namespace

int main(int argc, char **argv)
{
    // stats speaks to a server itself: an administrator may run it where
    // there is no display, so it gets an application without windows.
    {
        QString ignored;
        const std::optional<Options> options = ParseOptions(ArgumentsOf(argc, argv), ignored);
        if (options && !options->help && options->screenshots.isEmpty() &&
            options->subcommand == QLatin1String("stats")) {
            QCoreApplication app(argc, argv);
            return RunStats(options->arguments);
        }
    }

    QApplication app(argc, argv);
    QString error;
    const std::optional<Options> options = ParseOptions(app.arguments(), error);
    if (!options) {
        std::fprintf(stderr, "sorvik-config: %s\n%s", qUtf8Printable(error), qUtf8Printable(UsageText()));
        return kExitUsage;
    }
    if (options->help) {
        std::printf("%s", qUtf8Printable(UsageText()));
        return kExitDone;
    }
    try {
        ModuleHost module(ModuleFile(*options));
        const ModuleStart started(module);
        const LOGFONTW font = ApplicationFont();
        if (!options->screenshots.isEmpty())
            return RenderScreenshots(module, options->screenshots, font);
        const int exitCode = RunSubcommand(module, *options, font);
        WaitForModelessWindows(module);
        return exitCode;
    } catch (const std::exception &e) {
        std::fprintf(stderr, "sorvik-config: %s\n", e.what());
        return kExitFailed;
    }
}
