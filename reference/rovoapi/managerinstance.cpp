#include "reference/rovoapi/managerinstance.h"

#include "reference/comm/deadline.h"
#include "reference/libsupport/refobject.h"
#include "reference/managerchannel/managerconnection.h"
#include "reference/managerchannel/managermessage.h"
#include "reference/managerchannel/managerprotocol.h"
#include "sorvik/rovoapi.h"

#include <QString>

#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstring>

namespace sorvik::rovo {

namespace {

namespace status = cv::rovo::status;
using manager::ManagerConnection;

[[noreturn]] void Bad(std::int32_t code, const QString &text)
{
    ref::Fail(code, text.toStdU16String());
}

QString Describe(std::u16string_view portName)
{
    return portName.empty() ? QStringLiteral("the local server")
                            : QStringLiteral("the server instance %1").arg(QString::fromUtf16(portName.data(), qsizetype(portName.size())));
}

} // namespace

QJsonObject Instance::Call(const QJsonObject &request, std::uint32_t timeoutMs, std::int32_t timeoutCode) const
{
    if (auto answer = TryCall(request, timeoutMs, timeoutCode))
        return *answer;
    Bad(status::ServerNotRunning, QStringLiteral("%1 is not running").arg(Describe(m_portName)));
}

std::optional<QJsonObject> Instance::TryCall(const QJsonObject &request, std::uint32_t timeoutMs,
                                             std::int32_t timeoutCode) const
{
    const cv::vek::rovo::comm::Deadline deadline(timeoutMs);
    int error = 0;
    const auto connection = ManagerConnection::Open(m_portName, timeoutMs, error);
    if (!connection) {
        // EINVAL: a port name that cannot name a socket, so nothing serves it.
        if (error == ENOENT || error == ECONNREFUSED || error == ENOTDIR || error == EINVAL)
            return std::nullopt;
        if (error == EAGAIN || error == EWOULDBLOCK)
            Bad(timeoutCode, QStringLiteral("%1 accepts no connection").arg(Describe(m_portName)));
        if (error == EACCES || error == EPERM)
            Bad(status::NotAllowed, QStringLiteral("%1 may not be reached: %2")
                                        .arg(Describe(m_portName), QString::fromLocal8Bit(std::strerror(error))));
        Bad(status::ServerNotRunning, QStringLiteral("%1 cannot be reached: %2")
                                          .arg(Describe(m_portName), QString::fromLocal8Bit(std::strerror(error))));
    }
    QJsonObject answer;
    switch (connection->Call(request, answer, std::uint32_t(std::max(deadline.RemainingMs(), 0)))) {
    case ManagerConnection::Result::Answered:
        break;
    case ManagerConnection::Result::TimedOut:
        Bad(timeoutCode, QStringLiteral("%1 did not answer within %2 ms").arg(Describe(m_portName)).arg(timeoutMs));
    case ManagerConnection::Result::Lost:
        Bad(status::ServerNotRunning, QStringLiteral("%1 has ended").arg(Describe(m_portName)));
    case ManagerConnection::Result::Malformed:
        Bad(status::Internal, QStringLiteral("%1 answered something unreadable").arg(Describe(m_portName)));
    }
    const auto code = manager::IntegerField(answer, manager::kStatus, INT32_MIN, INT32_MAX);
    if (!code)
        Bad(status::Internal, QStringLiteral("%1 answered without a status").arg(Describe(m_portName)));
    if (*code != 0)
        Bad(std::int32_t(*code), answer.value(manager::kText).toString());
    return answer;
}

QJsonObject Instance::Ask(const QJsonObject &request) const
{
    return Call(request, kRequestTimeoutMs, status::ServerNotResponding);
}

QJsonObject Instance::Hello() const
{
    return Ask(QJsonObject{{manager::kOp, manager::op::Hello}});
}

} // namespace sorvik::rovo
