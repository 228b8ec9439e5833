#include "entry/serverdialogsapp.h"

#include <gtest/gtest.h>

#include <cstdlib>

namespace cv::vek::rovo {
namespace {

TEST(ServerDialogsApp, OwnsAnApplicationOnlyWhenTheHostHasNone)
{
    ::setenv("QT_QPA_PLATFORM", "offscreen", 0);
    CServerDialogsApp app;
    app.InitInstance();
    EXPECT_EQ(app.RegistryKey(), u"Corvane\\Common\\ROVO");
    QApplication *own = app.EnsureApplication();
    ASSERT_NE(own, nullptr);
    EXPECT_EQ(app.EnsureApplication(), own);
    EXPECT_EQ(QCoreApplication::applicationName(), QStringLiteral("Sorvik Configuration"));
    app.ExitInstance();
    EXPECT_EQ(QCoreApplication::instance(), nullptr) << "the module's own application ends with the module";

    int argc = 1;
    char name[] = "host";
    char *argv[] = {name, nullptr};
    {
        QApplication host(argc, argv);
        QCoreApplication::setApplicationName(QStringLiteral("Host"));
        EXPECT_EQ(app.EnsureApplication(), &host);
        app.ExitInstance();
        EXPECT_EQ(QCoreApplication::applicationName(), QStringLiteral("Host")) << "neither renamed nor ended";
    }
    QCoreApplication console(argc, argv);
    EXPECT_EQ(app.EnsureApplication(), nullptr) << "no windows in an application without widgets";
}

} // namespace
} // namespace cv::vek::rovo
