#pragma once

#include <cstdint>
#include <string>

namespace PLUGIN {

// The connection settings as the requestor sees them. The slot order is that
// of the settings objects the requestor has always been given.
class IConfig
{
public:
    virtual std::uint32_t GetServerVersion() const = 0;
    // Keeps an 18.0.x version as given; any other of major 18 or more becomes
    // 18.0.0, the highest this client speaks.
    virtual void SetServerVersion(std::uint32_t version) = 0;
    // No port name, and the server is this machine.
    virtual bool IsLocalServer() const = 0;
    virtual std::uint32_t GetSendTimeout() const = 0;
    virtual void SetReceiveTimeout(std::uint32_t milliseconds) = 0;
    virtual std::uint32_t GetReceiveTimeout() const = 0;
    virtual void SetQueryTimeout(std::uint32_t milliseconds) = 0;
    virtual std::uint32_t GetQueryTimeout() const = 0;
    virtual const std::u16string &GetServer() const = 0;
    virtual const std::u16string &GetPortName() const = 0;
    virtual void SetLoggedIn(bool loggedIn, const std::u16string &userName) = 0;
    // Start-up permitted, no port name, and the server is this machine.
    virtual bool CanStartEngine() const = 0;
    virtual const std::u16string &GetClientIdentificationString() const = 0;
    virtual const std::u16string &GetClientIdentificationSecretKey() const = 0;
    virtual void SetClientIdentification(const std::u16string &identification, const std::u16string &secretKey) = 0;
    virtual bool GetSyncPlugins() const = 0;
    virtual const std::u16string &GetUserSid() const = 0;
    // Kept so that the slots after it stay where callers expect them.
    virtual void Reserved() = 0;
    virtual ~IConfig() = default;

    IConfig(const IConfig &) = delete;
    IConfig &operator=(const IConfig &) = delete;

protected:
    IConfig() = default;
};

} // namespace PLUGIN
