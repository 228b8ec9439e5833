#pragma once

// One running server instance as the objects of the index manager see it:
// each request travels on a connection of its own (see managerinstance.cpp).

#include <QJsonObject>

#include <cstdint>
#include <optional>
#include <string>

namespace sorvik::rovo {

// Every request but WaitForUpdate is answered at once by a healthy server.
inline constexpr std::uint32_t kRequestTimeoutMs = 5000;

class Instance
{
public:
    explicit Instance(std::u16string portName) : m_portName(std::move(portName)) {}

    const std::u16string &PortName() const { return m_portName; }

    // The answer of a request with status 0; any other outcome raises
    // ref::Failure: timeoutCode when no answer came in time,
    // ServerNotRunning when nobody serves the instance or the server ended
    // meanwhile, the server's own code when it refused.
    QJsonObject Call(const QJsonObject &request, std::uint32_t timeoutMs, std::int32_t timeoutCode) const;
    // As Call, but nothing when nobody serves the instance.
    std::optional<QJsonObject> TryCall(const QJsonObject &request, std::uint32_t timeoutMs,
                                       std::int32_t timeoutCode) const;
    // A request answered at once: ServerNotResponding when it is not.
    QJsonObject Ask(const QJsonObject &request) const;
    QJsonObject Hello() const;

private:
    const std::u16string m_portName;
};

} // namespace sorvik::rovo
