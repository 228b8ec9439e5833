#include "entry/serverdialogsapp.h"

namespace cv::vek::rovo {

CServerDialogsApp::CServerDialogsApp() = default;

CServerDialogsApp::~CServerDialogsApp()
{
    // Still here at static destruction: the host ended without the last
    // Cleanup. Qt's own globals may be gone by now, so the application is
    // left to the end of the process rather than destroyed.
    (void)m_ownApplication.release();
}

bool CServerDialogsApp::InitInstance()
{
    // The grid library needs no start on this platform.
    m_applicationName = kApplicationName;
    m_registryKey = kRegistryKey;
    return true;
}

int CServerDialogsApp::ExitInstance()
{
    m_ownApplication.reset();
    return 0;
}

QApplication *CServerDialogsApp::EnsureApplication()
{
    if (QCoreApplication *existing = QCoreApplication::instance())
        return qobject_cast<QApplication *>(existing);
    m_ownApplication = std::make_unique<QApplication>(m_argc, m_argv);
    QCoreApplication::setApplicationName(QString::fromStdU16String(m_applicationName));
    return m_ownApplication.get();
}

CServerDialogsApp &TheApp()
{
    static CServerDialogsApp app;
    return app;
}

} // namespace cv::vek::rovo
