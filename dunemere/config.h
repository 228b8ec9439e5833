#pragma once

#include "dunemere/iconfig.h"

#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

namespace cv::util::file::log {
class ILogAdmin;
}

namespace PLUGIN {

// Connection settings read from a tagged settings text such as
// "<server>localhost</server><portname>P</portname>" (see TaggedText).
//
// Elements: server, portname, startengine ("no" in any case forbids starting
// the local server), receivetimeout, querytimeout, sendtimeout (decimal ms),
// clientidentificationstring, clientidentificationsecretkey, syncplugins (on
// when above 0), fsionly (on exactly for "yes"), and logfile, which
// configures a given log: its content becomes the file name, its attribute
// bitmask (decimal, 0x hexadecimal or leading-0 octal) the info mask, and
// outbitmask the output flags. Missing elements keep their defaults.
//
// A server element naming another machine lowers the query time-out from
// "not set" to 5000 ms unless a querytimeout element says otherwise.
class Config final : public IConfig
{
public:
    // Tells whether a host name or address is this machine; "localhost" is
    // recognised before it is asked.
    using HostCheck = std::function<bool(std::u16string_view host)>;

    static constexpr std::uint32_t kDefaultReceiveTimeout = 20000;
    static constexpr std::uint32_t kQueryTimeoutNotSet = 20001;
    static constexpr std::uint32_t kRemoteQueryTimeout = 5000;
    static constexpr std::uint32_t kDefaultSendTimeout = 8000;
    static constexpr std::uint32_t kDefaultVersion = 0x4800000; // 18.0.0

    explicit Config(std::u16string_view settings);
    Config(std::u16string_view settings, cv::util::file::log::ILogAdmin &log);
    // isThisMachine defaults to cv::krn::osdep::HostInfo, which may resolve
    // the name.
    Config(std::u16string_view settings, cv::util::file::log::ILogAdmin *log, HostCheck isThisMachine);

    std::uint32_t GetServerVersion() const override { return m_version; }
    void SetServerVersion(std::uint32_t version) override;
    bool IsLocalServer() const override;
    std::uint32_t GetSendTimeout() const override { return m_sendTimeout; }
    void SetReceiveTimeout(std::uint32_t milliseconds) override { m_receiveTimeout = milliseconds; }
    std::uint32_t GetReceiveTimeout() const override { return m_receiveTimeout; }
    void SetQueryTimeout(std::uint32_t milliseconds) override { m_queryTimeout = milliseconds; }
    std::uint32_t GetQueryTimeout() const override { return m_queryTimeout; }
    const std::u16string &GetServer() const override { return m_server; }
    const std::u16string &GetPortName() const override { return m_portName; }
    void SetLoggedIn(bool loggedIn, const std::u16string &userName) override;
    bool CanStartEngine() const override;
    const std::u16string &GetClientIdentificationString() const override { return m_clientIdentification; }
    const std::u16string &GetClientIdentificationSecretKey() const override { return m_clientSecretKey; }
    void SetClientIdentification(const std::u16string &identification, const std::u16string &secretKey) override;
    bool GetSyncPlugins() const override { return m_syncPlugins; }
    const std::u16string &GetUserSid() const override { return m_userSid; }
    void Reserved() override {}

    const std::u16string &GetSettings() const noexcept { return m_settings; }
    bool GetStartEngine() const noexcept { return m_startEngine; }
    bool IsLoggedIn() const noexcept { return m_loggedIn; }
    const std::u16string &GetUserName() const noexcept { return m_userName; }
    bool GetFileSystemIndexOnly() const noexcept { return m_fileSystemIndexOnly; }
    bool IsServerThisMachine() const noexcept { return m_serverIsThisMachine; }

private:
    void Parse(cv::util::file::log::ILogAdmin *log, const HostCheck &isThisMachine);

    std::u16string m_settings;
    std::u16string m_server;
    std::u16string m_portName;
    bool m_startEngine = true;
    std::uint32_t m_receiveTimeout = kDefaultReceiveTimeout;
    std::uint32_t m_queryTimeout = kQueryTimeoutNotSet;
    std::uint32_t m_sendTimeout = kDefaultSendTimeout;
    std::uint32_t m_version = kDefaultVersion;
    bool m_loggedIn = false;
    std::u16string m_userName;
    std::u16string m_clientIdentification;
    std::u16string m_clientSecretKey;
    bool m_syncPlugins = false;
    bool m_fileSystemIndexOnly = false;
    std::u16string m_userSid;
    // Decided once: asking the host layer may mean resolving the name.
    bool m_serverIsThisMachine = false;
};

} // namespace PLUGIN
