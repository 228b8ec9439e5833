#include "reference/server/managerrequests.h"

#include "reference/libsupport/refobject.h"
#include "reference/managerchannel/managermessage.h"
#include "reference/managerchannel/managerprotocol.h"
#include "sorvik/rovoapi.h"

#include <QFileInfo>
#include <QJsonArray>

#include <cstdio>

namespace sorvik::server {

namespace {

namespace status = cv::rovo::status;
using namespace manager;

// The longest service time-out the configuration can hold: 9999 s.
constexpr std::int64_t kMaxServiceTimeoutMs = 9999000;

// The level a request names; raises NotFound for anything else.
int LevelOf(const QJsonObject &request)
{
    const QString key = request.value(field::Level).toString();
    const auto level = LevelOfKey(key);
    if (!level)
        ref::Fail(status::NotFound, QStringLiteral("there is no property level \"%1\" (levels: sorvik_root, "
                                                   "qdm_channelgroup, qdm_channel)")
                                        .arg(key)
                                        .toStdU16String());
    return *level;
}

} // namespace

ManagerRequests::ManagerRequests(const ServerOptions &options, QString storeFile, IndexStatus &status,
                                 ConfigApplier &applier, ServiceTimeouts &timeouts, Indexer &indexer,
                                 PropertyIndex &properties)
    : m_options(options), m_storeFile(std::move(storeFile)), m_status(status), m_applier(applier),
      m_timeouts(timeouts), m_indexer(indexer), m_properties(properties)
{
}

std::optional<QJsonObject> ManagerRequests::Handle(const QJsonObject &request, std::span<const int> cancel)
{
    const QString op = request.value(kOp).toString();
    try {
        if (op == op::Hello)
            return Hello(request);
        if (op == op::WaitApplied)
            return WaitApplied(request, cancel);
        if (op == op::State)
            return State(request);
        if (op == op::ResetTimeoutFiles)
            return ResetTimeoutFiles(request);
        if (op == op::ResetFailedFiles)
            return ResetFailedFiles(request);
        if (op == op::SetServiceTimeout)
            return SetServiceTimeout(request);
        if (op == op::IndexingProgress)
            return IndexingProgress(request);
        if (op == op::PropertyModel)
            return PropertyModel(request);
        if (op == op::LevelProperties)
            return LevelProperties(request);
        if (op == op::CountOccurrences)
            return CountOccurrences(request);
        if (op == op::CountingOccurrences)
            return CountingOccurrences(request);
        if (op == op::OptimizationState)
            return OptimizationState(request);
        if (op == op::OptimizedProperties)
            return OptimizedProperties(request);
    } catch (const ref::Failure &failure) {
        return Answer(failure.code, QString::fromStdU16String(failure.text));
    }
    return Answer(status::Unsupported, QStringLiteral("this server does not know the request \"%1\"").arg(op));
}

QJsonObject ManagerRequests::Hello(const QJsonObject &)
{
    QJsonObject answer = Answer(0);
    answer.insert(field::Version, qint64(m_options.version));
    answer.insert(field::PortName, QString::fromStdU16String(m_options.portName));
    answer.insert(field::ServerFlag, !m_options.portName.empty());
    answer.insert(field::Store, QFileInfo(m_storeFile).absoluteFilePath());
    return answer;
}

std::optional<QJsonObject> ManagerRequests::WaitApplied(const QJsonObject &request, std::span<const int> cancel)
{
    const auto generation = IntegerField(request, field::Generation, 0, INT64_MAX);
    if (!generation)
        return Answer(status::InvalidArgument, QStringLiteral("wait-applied needs a generation"));
    // The client has read this generation from the store, so it is visible
    // there even when the commit's marker never came.
    if (*generation > m_applier.Applied())
        m_applier.Poke();
    switch (m_applier.WaitUntilApplied(*generation, cancel)) {
    case ConfigApplier::Wait::Cancelled:
        return std::nullopt;
    case ConfigApplier::Wait::Failed:
        return Answer(status::Internal, QStringLiteral("the server could not take up the configuration: %1")
                                            .arg(m_applier.Failure()));
    case ConfigApplier::Wait::Applied:
        break;
    }
    QJsonObject answer = Answer(0);
    answer.insert(field::Applied, qint64(m_applier.Applied()));
    return answer;
}

QJsonObject ManagerRequests::State(const QJsonObject &)
{
    QJsonObject answer = Answer(0);
    answer.insert(field::Applied, qint64(m_applier.Applied()));
    answer.insert(field::BrowseTimeoutMs, qint64(m_timeouts.BrowseMs()));
    answer.insert(field::QueryTimeoutMs, qint64(m_timeouts.QueryMs()));
    answer.insert(field::Waiting, qint64(m_applier.Waiting()));
    answer.insert(field::ApplyDelayMs, qint64(m_applier.ApplyDelay().count()));
    return answer;
}

QJsonObject ManagerRequests::ResetTimeoutFiles(const QJsonObject &)
{
    m_status.ResetTimeouted();
    return Answer(0);
}

QJsonObject ManagerRequests::ResetFailedFiles(const QJsonObject &)
{
    m_status.ResetFailure();
    return Answer(0);
}

QJsonObject ManagerRequests::SetServiceTimeout(const QJsonObject &request)
{
    const auto kind = IntegerField(request, field::Kind, 1, 2);
    const auto milliseconds = IntegerField(request, field::Milliseconds, 1, kMaxServiceTimeoutMs);
    if (!kind || !milliseconds)
        return Answer(status::InvalidArgument,
                      QStringLiteral("set-service-timeout needs a kind of 1 or 2 and 1 to %1 milliseconds")
                          .arg(kMaxServiceTimeoutMs));
    m_timeouts.Set(std::int32_t(*kind), std::uint32_t(*milliseconds));
    std::printf("service timeout %s: %u ms\n", *kind == 1 ? "browse" : "query", unsigned(*milliseconds));
    std::fflush(stdout);
    return Answer(0);
}

QJsonObject ManagerRequests::IndexingProgress(const QJsonObject &)
{
    const Indexer::State state = m_indexer.GetState();
    QJsonObject answer = Answer(0);
    answer.insert(field::Done, qint64(state.done));
    answer.insert(field::Total, qint64(state.total));
    if (state.lastMs >= 0)
        answer.insert(field::Time, qint64(state.lastMs));
    answer.insert(field::Passes, qint64(state.passes));
    answer.insert(field::Running, state.running);
    answer.insert(field::Pending, state.pending);
    return answer;
}

QJsonObject ManagerRequests::PropertyModel(const QJsonObject &)
{
    QJsonArray levels;
    for (const PropertyLevel &level : kPropertyLevels) {
        levels.append(QJsonObject{{field::Name, QLatin1String(level.name)},
                                  {field::Key, QLatin1String(level.key)},
                                  {field::DisplayNames, QJsonObject{{QLatin1String("eng"), QLatin1String(level.displayName)}}}});
    }
    QJsonObject answer = Answer(0);
    answer.insert(field::Levels, levels);
    return answer;
}

QJsonObject ManagerRequests::LevelProperties(const QJsonObject &request)
{
    QJsonArray properties;
    for (const LevelProperty &property : m_properties.Properties(LevelOf(request)))
        properties.append(QJsonObject{{field::Name, property.name}, {field::Occurrences, qint64(property.occurrences)}});
    QJsonObject answer = Answer(0);
    answer.insert(field::Properties, properties);
    return answer;
}

QJsonObject ManagerRequests::CountOccurrences(const QJsonObject &request)
{
    m_properties.StartOccurrenceCount(LevelOf(request));
    QJsonObject answer = Answer(0);
    answer.insert(field::Counting, true);
    return answer;
}

QJsonObject ManagerRequests::CountingOccurrences(const QJsonObject &request)
{
    QJsonObject answer = Answer(0);
    answer.insert(field::Counting, m_properties.IsCounting(LevelOf(request)));
    return answer;
}

QJsonObject ManagerRequests::OptimizationState(const QJsonObject &request)
{
    const int level = LevelOf(request);
    const QJsonValue property = request.value(field::Property);
    if (!property.isString())
        return Answer(status::InvalidArgument, QStringLiteral("optimization-state needs a property name"));
    QJsonObject answer = Answer(0);
    answer.insert(field::State, qint64(m_properties.OptimizationState(level, property.toString())));
    return answer;
}

QJsonObject ManagerRequests::OptimizedProperties(const QJsonObject &request)
{
    QJsonArray properties;
    for (const auto &[name, state] : m_properties.OptimizedProperties(LevelOf(request)))
        properties.append(QJsonObject{{field::Name, name}, {field::State, qint64(state)}});
    QJsonObject answer = Answer(0);
    answer.insert(field::Properties, properties);
    return answer;
}

} // namespace sorvik::server
