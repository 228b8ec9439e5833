#pragma once

#include "support/scopedenv.h"

#include <sys/types.h>

#include <filesystem>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace testsupport {

// A throw-away Kerberos realm for one test: its own configuration, database
// and keytab in a fresh temporary folder, a KDC (krb5kdc) on a free loopback
// port, and a forwardable ticket of the user in a ticket cache of its own.
// The Kerberos environment variables of this process point into the folder
// while the realm lives; Variables() lists them for child processes.
//
// Construction throws std::runtime_error when a step fails, naming
// scripts/setup when the KDC tools are missing. Destruction stops and reaps
// the KDC and removes the folder.
class KdcRealm final
{
public:
    using Environment = std::vector<std::pair<std::string, std::string>>;

    static constexpr const char *kRealm = "SORVIK.TEST";

    // The Kerberos tool's path; a missing tool raises std::runtime_error
    // naming scripts/setup, which installs them.
    static std::string FindTool(const std::string &name);

    static constexpr const char *kUser = "alice";
    // The service the server runs as, and the host-based name clients use.
    static constexpr const char *kService = "sorvik/localhost";
    static constexpr const char *kServiceName = "sorvik@localhost";
    // Known to the KDC but not in the keytab.
    static constexpr const char *kOtherService = "other/localhost";

    KdcRealm();
    ~KdcRealm();

    KdcRealm(const KdcRealm &) = delete;
    KdcRealm &operator=(const KdcRealm &) = delete;

    const std::filesystem::path &Folder() const { return m_folder; }
    std::string UserPrincipal() const { return Qualified(kUser); }
    const std::string &UserPassword() const { return m_password; }
    std::string ServicePrincipal() const { return Qualified(kService); }
    std::string OtherServicePrincipal() const { return Qualified(kOtherService); }
    std::filesystem::path KeytabPath() const { return m_folder / "service.keytab"; }
    std::filesystem::path CcachePath() const { return m_folder / "ccache"; }
    int KdcPort() const { return m_port; }
    pid_t KdcPid() const { return m_kdc; }
    const Environment &Variables() const { return m_environment; }

    // Adds a principal with a password to the realm.
    void AddUser(const std::string &name, const std::string &password);
    // Replaces the ticket cache's content with a ticket of principal;
    // lifetime in kinit's form ("1s", "10h"), empty for the default.
    void Kinit(const std::string &principal, const std::string &password, bool forwardable = true,
               const std::string &lifetime = {});
    // Removes the ticket cache, as after kdestroy.
    void DestroyCredentials();

private:
    std::string Qualified(const std::string &name) const { return name + "@" + kRealm; }
    void WriteConfiguration();
    void CreateDatabase();
    void StartKdc();
    bool KdcOwnsPort(std::string &why) const;
    void StopKdc();
    void WaitForTicket();
    // Runs a tool to its end; throws with its output when it fails.
    void Run(const std::vector<std::string> &arguments, const std::string &input = {}) const;
    int RunQuietly(const std::vector<std::string> &arguments, const std::string &input, std::string &output) const;

    std::filesystem::path m_folder;
    std::string m_password;
    int m_port = 0;
    pid_t m_kdc = -1;
    Environment m_environment;
    std::vector<std::unique_ptr<ScopedEnv>> m_exported;
};

} // namespace testsupport
