#include "support/kdcrealm.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <netinet/in.h>
#include <signal.h>
#include <spawn.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <random>
#include <set>
#include <sstream>
#include <stdexcept>
#include <system_error>
#include <thread>

extern char **environ;

namespace testsupport {

namespace {

using Clock = std::chrono::steady_clock;
using namespace std::chrono_literals;

constexpr auto kToolDeadline = 20s;
constexpr auto kKdcStartDeadline = 5s;
constexpr int kPortAttempts = 5;

} // namespace

std::string KdcRealm::FindTool(const std::string &name)
{
    std::string path = std::getenv("PATH") ? std::getenv("PATH") : "";
    path += ":/usr/sbin:/sbin:/usr/bin:/bin";
    std::istringstream folders(path);
    for (std::string folder; std::getline(folders, folder, ':');) {
        if (folder.empty())
            continue;
        const std::string candidate = folder + "/" + name;
        if (::access(candidate.c_str(), X_OK) == 0)
            return candidate;
    }
    throw std::runtime_error("Kerberos tool '" + name +
                             "' not found: run scripts/setup (it installs krb5-kdc, krb5-admin-server and krb5-user)");
}

namespace {

std::string ReadFile(const std::filesystem::path &file)
{
    std::ifstream in(file);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

void WriteFile(const std::filesystem::path &file, const std::string &text)
{
    std::ofstream out(file, std::ios::trunc);
    out << text;
    if (!out.flush())
        throw std::runtime_error("cannot write " + file.string());
}

std::string RandomPassword()
{
    std::random_device device;
    std::ostringstream text;
    text << "Pw-" << std::hex << device() << device() << device();
    return text.str();
}

class Spawned final
{
public:
    // stdin comes from input, stdout and stderr go to outputFile.
    Spawned(const std::vector<std::string> &arguments, const std::string &input, const std::filesystem::path &outputFile)
    {
        // A socket pair rather than a pipe, so that writing to a tool that
        // exited early fails instead of raising SIGPIPE.
        int channel[2];
        if (::socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, channel) != 0)
            throw std::system_error(errno, std::generic_category(), "socketpair");
        posix_spawn_file_actions_t actions;
        posix_spawn_file_actions_init(&actions);
        posix_spawn_file_actions_adddup2(&actions, channel[0], STDIN_FILENO);
        posix_spawn_file_actions_addopen(&actions, STDOUT_FILENO, outputFile.c_str(), O_WRONLY | O_CREAT | O_APPEND,
                                         0600);
        posix_spawn_file_actions_adddup2(&actions, STDOUT_FILENO, STDERR_FILENO);
        std::vector<char *> argv;
        for (const std::string &argument : arguments)
            argv.push_back(const_cast<char *>(argument.c_str()));
        argv.push_back(nullptr);
        const int error = ::posix_spawn(&m_pid, argv[0], &actions, nullptr, argv.data(), environ);
        posix_spawn_file_actions_destroy(&actions);
        ::close(channel[0]);
        if (error != 0) {
            ::close(channel[1]);
            throw std::system_error(error, std::generic_category(), "posix_spawn " + arguments[0]);
        }
        // Tools read their password as one line.
        const std::string line = input.empty() ? std::string() : input + "\n";
        std::size_t written = 0;
        while (written < line.size()) {
            const ssize_t n = ::send(channel[1], line.data() + written, line.size() - written, MSG_NOSIGNAL);
            if (n <= 0)
                break;
            written += std::size_t(n);
        }
        ::close(channel[1]);
    }

    pid_t Pid() const { return m_pid; }

    // The exit code, or -1 when it did not end in time (it is then killed).
    int Wait(std::chrono::milliseconds within)
    {
        const auto deadline = Clock::now() + within;
        for (;;) {
            int status = 0;
            const pid_t done = ::waitpid(m_pid, &status, WNOHANG);
            if (done == m_pid)
                return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
            if (done < 0 && errno != EINTR)
                return -1;
            if (Clock::now() >= deadline) {
                ::kill(m_pid, SIGKILL);
                ::waitpid(m_pid, &status, 0);
                return -1;
            }
            std::this_thread::sleep_for(5ms);
        }
    }

private:
    pid_t m_pid = -1;
};

// A port free for UDP and TCP on 127.0.0.1 at this moment.
int CandidatePort()
{
    for (int attempt = 0; attempt < 20; ++attempt) {
        const int tcp = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
        const int udp = ::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
        sockaddr_in address{};
        address.sin_family = AF_INET;
        address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        socklen_t length = sizeof address;
        int port = 0;
        if (tcp >= 0 && udp >= 0 && ::bind(tcp, reinterpret_cast<sockaddr *>(&address), sizeof address) == 0 &&
            ::getsockname(tcp, reinterpret_cast<sockaddr *>(&address), &length) == 0 &&
            ::bind(udp, reinterpret_cast<sockaddr *>(&address), sizeof address) == 0)
            port = ntohs(address.sin_port);
        if (tcp >= 0)
            ::close(tcp);
        if (udp >= 0)
            ::close(udp);
        if (port != 0)
            return port;
    }
    throw std::runtime_error("no free loopback port for the KDC");
}

// Socket inodes bound to 127.0.0.1:port in a /proc/net table; for TCP only
// listening ones.
std::set<std::string> LoopbackSockets(const char *table, int port, bool listeningOnly)
{
    char local[32];
    std::snprintf(local, sizeof local, "0100007F:%04X", port);
    std::set<std::string> inodes;
    std::ifstream in(table);
    std::string line;
    std::getline(in, line);
    while (std::getline(in, line)) {
        std::istringstream fields(line);
        std::string slot, localAddress, remoteAddress, state, queues, timer, retransmits, uid, timeout, inode;
        fields >> slot >> localAddress >> remoteAddress >> state >> queues >> timer >> retransmits >> uid >> timeout >>
            inode;
        if (localAddress == local && (!listeningOnly || state == "0A"))
            inodes.insert(inode);
    }
    return inodes;
}

std::set<std::string> SocketsOf(pid_t pid)
{
    std::set<std::string> inodes;
    std::error_code error;
    for (const auto &entry : std::filesystem::directory_iterator("/proc/" + std::to_string(pid) + "/fd", error)) {
        std::error_code ignored;
        const std::string target = std::filesystem::read_symlink(entry.path(), ignored).string();
        if (target.starts_with("socket:[") && target.ends_with("]"))
            inodes.insert(target.substr(8, target.size() - 9));
    }
    return inodes;
}

} // namespace

KdcRealm::KdcRealm()
{
    // Fail before touching anything when the tools are missing.
    for (const char *tool : {"krb5kdc", "kdb5_util", "kadmin.local", "kinit"})
        FindTool(tool);

    std::string pattern = (std::filesystem::temp_directory_path() / "sorvik-kdc-XXXXXX").string();
    if (!::mkdtemp(pattern.data()))
        throw std::system_error(errno, std::generic_category(), "mkdtemp");
    m_folder = pattern;
    m_password = RandomPassword();
    try {
        std::filesystem::create_directory(m_folder / "rcache");
        m_environment = {
            {"KRB5_CONFIG", (m_folder / "krb5.conf").string()},
            {"KRB5_KDC_PROFILE", (m_folder / "kdc.conf").string()},
            {"KRB5CCNAME", "FILE:" + CcachePath().string()},
            {"KRB5_KTNAME", "FILE:" + KeytabPath().string()},
            {"KRB5RCACHEDIR", (m_folder / "rcache").string()},
        };
        for (const auto &[name, value] : m_environment)
            m_exported.push_back(std::make_unique<ScopedEnv>(name, value));
        m_port = CandidatePort();
        WriteConfiguration();
        CreateDatabase();
        StartKdc();
        WaitForTicket();
    } catch (...) {
        StopKdc();
        m_exported.clear();
        std::error_code ignored;
        std::filesystem::remove_all(m_folder, ignored);
        throw;
    }
}

KdcRealm::~KdcRealm()
{
    StopKdc();
    m_exported.clear();
    std::error_code ignored;
    std::filesystem::remove_all(m_folder, ignored);
}

void KdcRealm::WriteConfiguration()
{
    const std::string dir = m_folder.string();
    const std::string address = "127.0.0.1:" + std::to_string(m_port);
    // No name of this realm may reach a resolver: hosts stay as written.
    WriteFile(m_folder / "krb5.conf", std::string("[libdefaults]\n") +
                                          " default_realm = " + kRealm + "\n"
                                          " dns_lookup_kdc = false\n"
                                          " dns_lookup_realm = false\n"
                                          " dns_canonicalize_hostname = false\n"
                                          " qualify_shortname = \"\"\n"
                                          " rdns = false\n"
                                          " forwardable = true\n"
                                          "[realms]\n " +
                                          kRealm + " = {\n  kdc = " + address +
                                          "\n }\n"
                                          "[domain_realm]\n localhost = " +
                                          kRealm + "\n");
    WriteFile(m_folder / "kadm5.acl", "");
    WriteFile(m_folder / "kdc.conf", std::string("[kdcdefaults]\n") + " kdc_listen = " + address +
                                         "\n kdc_tcp_listen = " + address + "\n[realms]\n " + kRealm +
                                         " = {\n"
                                         "  database_name = " +
                                         dir + "/principal\n  key_stash_file = " + dir + "/stash\n  acl_file = " + dir +
                                         "/kadm5.acl\n  kdc_listen = " + address + "\n  kdc_tcp_listen = " + address +
                                         "\n }\n[logging]\n kdc = FILE:" + dir + "/kdc.log\n default = FILE:" + dir +
                                         "/krb5lib.log\n");
}

void KdcRealm::CreateDatabase()
{
    Run({FindTool("kdb5_util"), "create", "-s", "-r", kRealm, "-P", RandomPassword()});
    AddUser(kUser, m_password);
    const std::string kadmin = FindTool("kadmin.local");
    Run({kadmin, "-r", kRealm, "-q", std::string("addprinc -randkey ") + kService});
    Run({kadmin, "-r", kRealm, "-q", std::string("addprinc -randkey ") + kOtherService});
    Run({kadmin, "-r", kRealm, "-q", "ktadd -k " + KeytabPath().string() + " " + kService});
}

void KdcRealm::AddUser(const std::string &name, const std::string &password)
{
    Run({FindTool("kadmin.local"), "-r", kRealm, "-q", "addprinc -pw " + password + " " + name});
}

// krb5kdc binds with address reuse, so a second KDC on a taken port would
// start too and clients might reach the other one: the port counts as ours
// only when our KDC holds the one UDP and the one listening TCP socket on it.
bool KdcRealm::KdcOwnsPort(std::string &why) const
{
    const auto udp = LoopbackSockets("/proc/net/udp", m_port, false);
    const auto tcp = LoopbackSockets("/proc/net/tcp", m_port, true);
    const auto ours = SocketsOf(m_kdc);
    if (udp.size() != 1 || tcp.size() != 1) {
        why = std::to_string(udp.size()) + " UDP and " + std::to_string(tcp.size()) + " TCP sockets on the port";
        return false;
    }
    if (!ours.contains(*udp.begin()) || !ours.contains(*tcp.begin())) {
        why = "the sockets on the port belong to another process";
        return false;
    }
    return true;
}

void KdcRealm::StartKdc()
{
    const std::string krb5kdc = FindTool("krb5kdc");
    std::string why;
    for (int attempt = 0; attempt < kPortAttempts; ++attempt) {
        if (attempt > 0) {
            m_port = CandidatePort();
            WriteConfiguration();
        }
        Spawned kdc({krb5kdc, "-n", "-r", kRealm}, {}, m_folder / "krb5kdc.out");
        m_kdc = kdc.Pid();
        const auto deadline = Clock::now() + kKdcStartDeadline;
        bool ready = false;
        for (;;) {
            int status = 0;
            if (::waitpid(m_kdc, &status, WNOHANG) == m_kdc) {
                m_kdc = -1;
                why = "krb5kdc exited: " + ReadFile(m_folder / "krb5kdc.out") + ReadFile(m_folder / "kdc.log");
                break;
            }
            if (KdcOwnsPort(why)) {
                ready = true;
                break;
            }
            if (Clock::now() >= deadline)
                break;
            std::this_thread::sleep_for(5ms);
        }
        if (ready)
            return;
        StopKdc();
    }
    throw std::runtime_error("the KDC did not start on a port of its own: " + why);
}

void KdcRealm::StopKdc()
{
    if (m_kdc <= 0)
        return;
    ::kill(m_kdc, SIGTERM);
    const auto deadline = Clock::now() + 5s;
    int status = 0;
    while (::waitpid(m_kdc, &status, WNOHANG) == 0) {
        if (Clock::now() >= deadline) {
            ::kill(m_kdc, SIGKILL);
            ::waitpid(m_kdc, &status, 0);
            break;
        }
        std::this_thread::sleep_for(5ms);
    }
    m_kdc = -1;
}

// The first ticket doubles as the check that the KDC answers.
void KdcRealm::WaitForTicket()
{
    const auto deadline = Clock::now() + kKdcStartDeadline;
    std::string output;
    for (;;) {
        output.clear();
        if (RunQuietly({FindTool("kinit"), "-f", "-c", "FILE:" + CcachePath().string(), UserPrincipal()}, m_password,
                       output) == 0)
            return;
        if (Clock::now() >= deadline)
            throw std::runtime_error("kinit against the fresh KDC kept failing: " + output);
        std::this_thread::sleep_for(20ms);
    }
}

void KdcRealm::Kinit(const std::string &principal, const std::string &password, bool forwardable,
                     const std::string &lifetime)
{
    std::vector<std::string> arguments{FindTool("kinit"), forwardable ? "-f" : "-F", "-c",
                                       "FILE:" + CcachePath().string()};
    if (!lifetime.empty())
        arguments.insert(arguments.end(), {"-l", lifetime});
    arguments.push_back(principal);
    Run(arguments, password);
}

void KdcRealm::DestroyCredentials()
{
    std::error_code ignored;
    std::filesystem::remove(CcachePath(), ignored);
}

void KdcRealm::Run(const std::vector<std::string> &arguments, const std::string &input) const
{
    std::string output;
    const int code = RunQuietly(arguments, input, output);
    if (code != 0)
        throw std::runtime_error(arguments[0] + " failed (" + std::to_string(code) + "): " + output);
}

int KdcRealm::RunQuietly(const std::vector<std::string> &arguments, const std::string &input,
                         std::string &output) const
{
    const std::filesystem::path log = m_folder / "tool.out";
    std::error_code ignored;
    std::filesystem::remove(log, ignored);
    Spawned tool(arguments, input, log);
    const int code = tool.Wait(kToolDeadline);
    output = ReadFile(log);
    return code;
}

} // namespace testsupport
