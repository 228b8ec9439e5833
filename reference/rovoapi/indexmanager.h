#pragma once

// The index manager of a running server instance and its server context,
// reached through the manager channel (reference/managerchannel).

#include "reference/rovoapi/connection.h"
#include "sorvik/rovoapi.h"

#include <QString>

#include <cstdint>
#include <string>

namespace sorvik::rovo {

// The instance that serves a Sorvik: its PortName, else its Name (the
// instance of that port name serves the Sorvik of that name), else the
// default local server ("").
std::u16string InstancePortName(const Connection &connection);

// The index manager of the instance serving the store file; null when no
// instance runs for it or the one running serves another store. Raises
// ref::Failure when the instance refuses or does not answer.
cv::rovo::IIndexManager *OpenIndexManager(const Connection &connection, const QString &storeFile);

// How long WaitForUpdate waits: $CORVANE_SORVIK_UPDATE_TIMEOUT_MS, else 3000.
std::uint32_t UpdateTimeoutMilliseconds();

} // namespace sorvik::rovo
