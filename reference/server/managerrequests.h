#pragma once

#include "reference/server/configapplier.h"
#include "reference/server/indexer.h"
#include "reference/server/indexstatus.h"
#include "reference/server/propertyindex.h"
#include "reference/server/serveroptions.h"
#include "reference/server/servicetimeouts.h"

#include <QJsonObject>
#include <QString>

#include <optional>
#include <span>

namespace sorvik::server {

// What the requests of the manager channel (reference/managerchannel) do in
// the server. No input or output: it is handed a decoded request and hands
// back the answer. Thread-safe: every manager connection shares one.
class ManagerRequests
{
public:
    ManagerRequests(const ServerOptions &options, QString storeFile, IndexStatus &status, ConfigApplier &applier,
                    ServiceTimeouts &timeouts, Indexer &indexer, PropertyIndex &properties);

    // The answer; nothing when a wait was cancelled through one of the
    // descriptors (the client went, or the server stops), which ends the
    // connection.
    std::optional<QJsonObject> Handle(const QJsonObject &request, std::span<const int> cancel);

private:
    QJsonObject Hello(const QJsonObject &request);
    std::optional<QJsonObject> WaitApplied(const QJsonObject &request, std::span<const int> cancel);
    QJsonObject State(const QJsonObject &request);
    QJsonObject ResetTimeoutFiles(const QJsonObject &request);
    QJsonObject ResetFailedFiles(const QJsonObject &request);
    QJsonObject SetServiceTimeout(const QJsonObject &request);
    QJsonObject IndexingProgress(const QJsonObject &request);
    QJsonObject PropertyModel(const QJsonObject &request);
    QJsonObject LevelProperties(const QJsonObject &request);
    QJsonObject CountOccurrences(const QJsonObject &request);
    QJsonObject CountingOccurrences(const QJsonObject &request);
    QJsonObject OptimizationState(const QJsonObject &request);
    QJsonObject OptimizedProperties(const QJsonObject &request);

    const ServerOptions &m_options;
    const QString m_storeFile;
    IndexStatus &m_status;
    ConfigApplier &m_applier;
    ServiceTimeouts &m_timeouts;
    Indexer &m_indexer;
    PropertyIndex &m_properties;
};

} // namespace sorvik::server
