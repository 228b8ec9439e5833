#include "reference/rovoapi/indexmanager.h"

#include "reference/libsupport/refobject.h"
#include "reference/managerchannel/managerconnection.h"
#include "reference/managerchannel/managermessage.h"
#include "reference/managerchannel/managerprotocol.h"
#include "reference/rovoapi/objects.h"
#include "reference/rovoapi/store.h"
#include "reference/comm/deadline.h"
#include "sorvik/packedversion.h"
#include "sorvik/wstringqt.h"

#include <QFileInfo>

#include <cerrno>
#include <climits>
#include <cstring>
#include <memory>
#include <optional>

namespace sorvik::rovo {

namespace {

namespace status = cv::rovo::status;
using manager::ManagerConnection;
using cv::krn::WString;

// Every request but WaitForUpdate is answered at once by a healthy server.
constexpr std::uint32_t kRequestTimeoutMs = 5000;
constexpr std::uint32_t kDefaultUpdateTimeoutMs = 3000;

template <typename Body>
auto Guard(std::int32_t *status, Body &&body)
{
    return ref::Guarded(kCodes, status, std::forward<Body>(body));
}

[[noreturn]] void Bad(std::int32_t code, const QString &text)
{
    ref::Fail(code, text.toStdU16String());
}

QString Describe(std::u16string_view portName)
{
    return portName.empty() ? QStringLiteral("the local server")
                            : QStringLiteral("the server instance %1").arg(QString::fromUtf16(portName.data(), qsizetype(portName.size())));
}

// One running instance as the index manager and its server context see it.
// Each request travels on a connection of its own, so a WaitForUpdate on one
// thread holds up no other call, and nothing another thread releases can
// end a call in progress.
class Instance
{
public:
    explicit Instance(std::u16string portName) : m_portName(std::move(portName)) {}

    const std::u16string &PortName() const { return m_portName; }

    // The answer of a request with status 0; any other outcome raises:
    // timeoutCode when no answer came in time, ServerNotRunning when
    // nobody serves the instance or the server ended meanwhile.
    QJsonObject Call(const QJsonObject &request, std::uint32_t timeoutMs, std::int32_t timeoutCode) const
    {
        if (auto answer = TryCall(request, timeoutMs, timeoutCode))
            return *answer;
        Bad(status::ServerNotRunning, QStringLiteral("%1 is not running").arg(Describe(m_portName)));
    }

    // As Call, but nothing when nobody serves the instance.
    std::optional<QJsonObject> TryCall(const QJsonObject &request, std::uint32_t timeoutMs, std::int32_t timeoutCode) const
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

    QJsonObject Hello() const
    {
        return Call(QJsonObject{{manager::kOp, manager::op::Hello}}, kRequestTimeoutMs, status::ServerNotResponding);
    }

private:
    const std::u16string m_portName;
};

[[noreturn]] void NotYetOffered(const char *operation)
{
    Bad(status::Unsupported, QStringLiteral("the running server does not offer %1").arg(QLatin1String(operation)));
}

class ServerContext final : public ref::RefObject<cv::rovo::IServerContext>
{
public:
    explicit ServerContext(std::shared_ptr<const Instance> instance) : m_instance(std::move(instance)) {}

    void GetPortName(WString *portName, std::int32_t *status) override
    {
        Guard(status, [&] {
            if (!portName)
                Bad(status::InvalidArgument, QStringLiteral("the port name out-argument is null"));
            *portName = WString(m_instance->PortName());
        });
    }

    cv::rovo::IPropertyModel *GetPropertyModel(std::int32_t *status) override
    {
        return Guard(status, []() -> cv::rovo::IPropertyModel * { NotYetOffered("a property model"); });
    }

private:
    const std::shared_ptr<const Instance> m_instance;
};

class IndexManager final : public ref::RefObject<cv::rovo::IIndexManager>
{
public:
    IndexManager(std::shared_ptr<const Instance> instance, const QString &storeFile)
        : m_instance(std::move(instance)), m_db(OpenStore(storeFile, false))
    {
    }

    double GetVersion(std::int32_t *status) override
    {
        return Guard(status, [&] {
            const auto packed = manager::IntegerField(m_instance->Hello(), manager::field::Version, 0, UINT32_MAX);
            if (!packed)
                Bad(status::Internal, QStringLiteral("the server did not tell its version"));
            const std::uint32_t version = std::uint32_t(*packed);
            // One division of whole numbers: 2.1.0 gives exactly the double 2.01.
            return double(VersionMajor(version) * 10000 + VersionMinor(version) * 100 + VersionPatch(version)) / 10000.0;
        });
    }

    void ResetTimeoutFiles(std::int32_t *status) override { Simple(status, manager::op::ResetTimeoutFiles); }

    void ResetFailedFiles(std::int32_t *status) override { Simple(status, manager::op::ResetFailedFiles); }

    void SetServiceTimeout(std::int32_t kind, std::uint32_t milliseconds, std::int32_t *status) override
    {
        Guard(status, [&] {
            if (kind != cv::rovo::kBrowseTimeout && kind != cv::rovo::kQueryTimeout)
                Bad(status::InvalidArgument, QStringLiteral("the service time-out kind %1 is neither 1 nor 2").arg(kind));
            if (milliseconds == 0)
                Bad(status::InvalidArgument, QStringLiteral("a service time-out of 0 ms"));
            m_instance->Call(QJsonObject{{manager::kOp, manager::op::SetServiceTimeout},
                                         {manager::field::Kind, kind},
                                         {manager::field::Milliseconds, qint64(milliseconds)}},
                             kRequestTimeoutMs, status::ServerNotResponding);
        });
    }

    void WaitForUpdate(std::int32_t *status) override
    {
        Guard(status, [&] {
            const std::uint32_t timeout = UpdateTimeoutMilliseconds();
            const std::int64_t generation = CommittedGeneration();
            m_instance->Call(QJsonObject{{manager::kOp, manager::op::WaitApplied},
                                         {manager::field::Generation, qint64(generation)}},
                             timeout, status::UpdateTimedOut);
        });
    }

    cv::rovo::ILevelPropertyList *GetLevelProperties(const WString &, std::int32_t *status) override
    {
        return Guard(status, []() -> cv::rovo::ILevelPropertyList * { NotYetOffered("level property lists"); });
    }

    cv::rovo::IServerContext *GetServerContext(std::int32_t *status) override
    {
        return Guard(status, [&]() -> cv::rovo::IServerContext * { return new ServerContext(m_instance); });
    }

    bool GetServerFlag(std::int32_t *status) override
    {
        return Guard(status, [&] { return m_instance->Hello().value(manager::field::ServerFlag).toBool(); });
    }

    cv::rovo::IOptimizationEditor *GetOptimizationEditor(std::int32_t *status) override
    {
        return Guard(status, []() -> cv::rovo::IOptimizationEditor * { NotYetOffered("an optimization editor"); });
    }

    cv::rovo::IIndexStatus *GetIndexStatus(std::int32_t *status) override
    {
        return Guard(status, []() -> cv::rovo::IIndexStatus * { NotYetOffered("an index status"); });
    }

private:
    void Simple(std::int32_t *status, QLatin1String operation)
    {
        Guard(status, [&] {
            m_instance->Call(QJsonObject{{manager::kOp, operation}}, kRequestTimeoutMs, status::ServerNotResponding);
        });
    }

    // The generation of the last commit, from any process.
    std::int64_t CommittedGeneration()
    {
        std::lock_guard guard(m_db->Lock());
        return ConfigGeneration(*m_db);
    }

    const std::shared_ptr<const Instance> m_instance;
    const std::unique_ptr<Db> m_db;
};

bool SameFile(const QString &a, const QString &b)
{
    const QString first = QFileInfo(a).canonicalFilePath();
    return !first.isEmpty() && first == QFileInfo(b).canonicalFilePath();
}

} // namespace

std::u16string InstancePortName(const Connection &connection)
{
    return (connection.portName.isEmpty() ? connection.name : connection.portName).toStdU16String();
}

cv::rovo::IIndexManager *OpenIndexManager(const Connection &connection, const QString &storeFile)
{
    auto instance = std::make_shared<const Instance>(InstancePortName(connection));
    const auto hello =
        instance->TryCall(QJsonObject{{manager::kOp, manager::op::Hello}}, kRequestTimeoutMs, status::ServerNotResponding);
    if (!hello || !SameFile(hello->value(manager::field::Store).toString(), storeFile))
        return nullptr;
    return new IndexManager(std::move(instance), storeFile);
}

std::uint32_t UpdateTimeoutMilliseconds()
{
    bool ok = false;
    const qint64 value = qEnvironmentVariable("CORVANE_SORVIK_UPDATE_TIMEOUT_MS").toLongLong(&ok);
    return ok && value >= 0 && value < 0xFFFFFFFF ? std::uint32_t(value) : kDefaultUpdateTimeoutMs;
}

} // namespace sorvik::rovo
