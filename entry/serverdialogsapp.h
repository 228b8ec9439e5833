#pragma once

// The module's application object: its name and registry key, and the Qt
// application its windows need.

#include <QApplication>

#include <memory>
#include <string>

namespace cv::vek::rovo {

class CServerDialogsApp final
{
public:
    static constexpr char16_t kApplicationName[] = u"Sorvik Configuration";
    static constexpr char16_t kRegistryKey[] = u"Corvane\\Common\\ROVO";

    CServerDialogsApp();
    CServerDialogsApp(const CServerDialogsApp &) = delete;
    CServerDialogsApp &operator=(const CServerDialogsApp &) = delete;
    ~CServerDialogsApp();

    // Start and end of the module (load and unload).
    bool InitInstance();
    int ExitInstance();

    const std::u16string &ApplicationName() const { return m_applicationName; }
    const std::u16string &RegistryKey() const { return m_registryKey; }

    // The application the module's windows live in: the host's when it has
    // one (left as the host named it), else one the module creates on first
    // use and owns until ExitInstance. Null when the host runs a Qt
    // application without widgets, in which no window can be shown. Called on
    // the user-interface thread.
    QApplication *EnsureApplication();
    bool OwnsApplication() const { return m_ownApplication != nullptr; }

private:
    std::u16string m_applicationName;
    std::u16string m_registryKey;
    // QApplication keeps references to its argc and argv for its whole life.
    int m_argc = 1;
    char m_programName[16] = "ServerDialogs";
    char *m_argv[2] = {m_programName, nullptr};
    std::unique_ptr<QApplication> m_ownApplication;
};

CServerDialogsApp &TheApp();

} // namespace cv::vek::rovo
