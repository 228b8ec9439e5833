// sorvik-config run as a separate process, end to end with the reference
// libraries: the store is seeded and read back here, the program answers
// its modal windows through --answers.

#include "tests/reference/rovofixture.h"

#include <QDir>
#include <QImage>
#include <QProcess>
#include <QSet>

#include <gtest/gtest.h>

#include <filesystem>

namespace {

using reftest::RovoTest;

struct HostRun
{
    int exitCode = -1;
    QString out;
    QString err;
};

HostRun RunHost(const QStringList &arguments)
{
    QProcess process;
    // The program draws text; a sanitizer build must not count fontconfig's cache as a leak.
    QProcessEnvironment environment = QProcessEnvironment::systemEnvironment();
    environment.insert(QStringLiteral("LSAN_OPTIONS"),
                       environment.value(QStringLiteral("LSAN_OPTIONS")) +
                           QStringLiteral(":suppressions=" SORVIK_LSAN_SUPPRESSIONS));
    environment.insert(QStringLiteral("QT_QPA_PLATFORM"), QStringLiteral("offscreen"));
    process.setProcessEnvironment(environment);
    process.start(QStringLiteral(SORVIK_CONFIG), arguments);
    HostRun run;
    if (!process.waitForFinished(30000)) {
        process.kill();
        process.waitForFinished();
        ADD_FAILURE() << "sorvik-config did not finish: " << arguments.join(u' ').toStdString();
        return run;
    }
    run.exitCode = process.exitStatus() == QProcess::NormalExit ? process.exitCode() : -1;
    run.out = QString::fromUtf8(process.readAllStandardOutput());
    run.err = QString::fromUtf8(process.readAllStandardError());
    return run;
}

class HostProgram : public RovoTest
{
protected:
    std::string Folder(const std::string &relative)
    {
        const std::filesystem::path path = m_folder.path() / "tree" / relative;
        std::filesystem::create_directories(path);
        return path.string();
    }
    static std::u16string U16(const std::string &text) { return QString::fromStdString(text).toStdU16String(); }
};

TEST_F(HostProgram, AddAreaMergesTheAreasInsideIt)
{
    const std::string data = Folder("data"), a = Folder("data/a"), tmp = Folder("data/a/tmp"), b = Folder("data/b");
    {
        auto editor = Editor();
        AddArea(editor.get(), U16(a).c_str(), u"a");
        AddExcluded(editor.get(), U16(tmp).c_str(), u"tmp");
        AddArea(editor.get(), U16(b).c_str(), u"b");
        Commit(editor.get());
    }
    const HostRun run = RunHost({QStringLiteral("--answers"), QStringLiteral("ok,ok"), QStringLiteral("add-area"),
                             QString::fromStdString(data)});
    EXPECT_EQ(run.exitCode, 0) << run.err.toStdString();
    EXPECT_TRUE(run.out.contains(QStringLiteral("modal: Add Search Area | \nanswer: ok"))) << run.out.toStdString();
    EXPECT_TRUE(run.out.contains(QStringLiteral("modal: Information | The specified path contains search areas.")));
    EXPECT_TRUE(run.out.endsWith(QStringLiteral("result: 1\n")));
    EXPECT_EQ(Areas(), (std::vector<std::string>{data + "|" + data + "|data", "  " + tmp}));

    // Exclude a folder of the new area, then remove that exclusion again (without a question).
    const std::string cache = data + "/b/cache";
    HostRun exclude = RunHost({QStringLiteral("--answers"), QStringLiteral("ok"), QStringLiteral("exclude"),
                           QString::fromStdString(cache)});
    EXPECT_EQ(exclude.exitCode, 0) << exclude.err.toStdString();
    EXPECT_TRUE(exclude.out.contains(QStringLiteral("modal: Warning | If you exclude a folder")));
    EXPECT_EQ(Areas(), (std::vector<std::string>{data + "|" + data + "|data", "  " + tmp, "  " + cache}));
    const HostRun remove = RunHost({QStringLiteral("--answers"), QString(), QStringLiteral("remove"),
                                QString::fromStdString(cache)});
    EXPECT_EQ(remove.exitCode, 0) << remove.err.toStdString();
    EXPECT_FALSE(remove.out.contains(QStringLiteral("modal:"))) << "an excluded folder goes unasked";
    EXPECT_EQ(Areas(), (std::vector<std::string>{data + "|" + data + "|data", "  " + tmp}));
}

TEST_F(HostProgram, DecliningAndFailuresAreReported)
{
    // A connection that cannot be opened: declining the question must not get that far.
    const QString broken = QStringLiteral("<Name>unclosed");
    HostRun run = RunHost({QStringLiteral("--connection"), broken, QStringLiteral("--answers"), QStringLiteral("cancel"),
                       QStringLiteral("exclude"), QStringLiteral("/data/x")});
    EXPECT_EQ(run.exitCode, 1) << run.err.toStdString();
    EXPECT_TRUE(run.out.endsWith(QStringLiteral("answer: cancel\nresult: 2\n"))) << run.out.toStdString();
    EXPECT_FALSE(run.err.contains(QStringLiteral("error"))) << run.err.toStdString();

    run = RunHost({QStringLiteral("--connection"), broken, QStringLiteral("--answers"), QStringLiteral("ok"),
                   QStringLiteral("exclude"), QStringLiteral("/data/x")});
    EXPECT_EQ(run.exitCode, 3);
    EXPECT_TRUE(run.err.contains(QStringLiteral("error -21005"))) << run.err.toStdString();

    run = RunHost({QStringLiteral("edit-area"), QStringLiteral("/not/an/area")});
    EXPECT_EQ(run.exitCode, 1);
    EXPECT_EQ(run.out, QStringLiteral("result: 3\n"));

    run = RunHost({QStringLiteral("--answers"), QStringLiteral("maybe"), QStringLiteral("remove"), QStringLiteral("/x")});
    EXPECT_EQ(run.exitCode, 2);
    run = RunHost({QStringLiteral("exclude")});
    EXPECT_EQ(run.exitCode, 2);
    EXPECT_TRUE(run.err.contains(QStringLiteral("usage: exclude PATH")));
}

TEST(HostScreenshots, EveryDialogIsRenderedReadably)
{
    const QString folder = QStringLiteral(SORVIK_SCREENSHOT_DIR);
    QDir(folder).removeRecursively();
    const HostRun run = RunHost({QStringLiteral("--screenshots"), folder});
    ASSERT_EQ(run.exitCode, 0) << run.err.toStdString();
    for (const char *name : {"add-search-area.png", "add-search-area-resized.png", "edit-search-area.png",
                             "triggers-none.png", "triggers-data-file-changes.png", "box-contains-search-areas.png",
                             "box-exclude-folder.png"}) {
        const QImage image(QDir(folder).filePath(QLatin1String(name)));
        ASSERT_FALSE(image.isNull()) << name;
        EXPECT_GE(image.width(), 200) << name;
        EXPECT_GE(image.height(), 60) << name;
        QSet<QRgb> colours;
        for (int y = 0; y < image.height(); y += 2)
            for (int x = 0; x < image.width(); x += 2)
                colours.insert(image.pixel(x, y));
        EXPECT_GT(colours.size(), 16) << name << ": text and controls, not an empty window";
    }
}

} // namespace
