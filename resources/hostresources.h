#pragma once

// Files the module carries for its host and never reads itself: the unit
// catalogue and two query-proxy model configurations.

#include <QByteArray>
#include <QString>
#include <QStringList>

namespace resources {

// "unitcatalogue.xml", "queryproxy-files.xml", "queryproxy-measurements.xml".
QStringList HostResourceNames();
// The file's bytes; empty for an unknown name.
QByteArray HostResource(const QString &name);

} // namespace resources
