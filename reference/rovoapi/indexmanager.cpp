#include "reference/rovoapi/indexmanager.h"

#include "reference/libsupport/refobject.h"
#include "reference/managerchannel/managermessage.h"
#include "reference/managerchannel/managerprotocol.h"
#include "reference/rovoapi/managerinstance.h"
#include "reference/rovoapi/objects.h"
#include "reference/rovoapi/propertyobjects.h"
#include "reference/rovoapi/store.h"
#include "sorvik/packedversion.h"
#include "sorvik/wstringqt.h"

#include <QFileInfo>

#include <memory>

namespace sorvik::rovo {

namespace {

namespace status = cv::rovo::status;
using cv::krn::WString;

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
        return Guard(status, [&] { return NewPropertyModel(*m_instance); });
    }

private:
    const std::shared_ptr<const Instance> m_instance;
};

class IndexManager final : public ref::RefObject<cv::rovo::IIndexManager>
{
public:
    IndexManager(std::shared_ptr<const Instance> instance, const QString &storeFile)
        : m_instance(std::move(instance)), m_storeFile(storeFile), m_db(OpenStore(storeFile, false))
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

    cv::rovo::ILevelPropertyList *GetLevelProperties(const WString &level, std::int32_t *status) override
    {
        return Guard(status, [&] { return NewLevelPropertyList(m_instance, RequireLevelKey(level)); });
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
        return Guard(status, [&] { return NewOptimizationEditor(m_storeFile); });
    }

    cv::rovo::IIndexStatus *GetIndexStatus(std::int32_t *status) override
    {
        return Guard(status, [&] { return NewIndexStatus(m_instance); });
    }

private:
    void Simple(std::int32_t *status, QLatin1String operation)
    {
        Guard(status, [&] {
            m_instance->Ask(QJsonObject{{manager::kOp, operation}});
        });
    }

    // The generation of the last commit, from any process.
    std::int64_t CommittedGeneration()
    {
        std::lock_guard guard(m_db->Lock());
        return ConfigGeneration(*m_db);
    }

    const std::shared_ptr<const Instance> m_instance;
    const QString m_storeFile;
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
