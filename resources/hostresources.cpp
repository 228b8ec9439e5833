#include "resources/hostresources.h"

#include <QFile>

namespace resources {

QStringList HostResourceNames()
{
    return {QStringLiteral("unitcatalogue.xml"), QStringLiteral("queryproxy-files.xml"),
            QStringLiteral("queryproxy-measurements.xml")};
}

QByteArray HostResource(const QString &name)
{
    if (!HostResourceNames().contains(name))
        return {};
    QFile file(QStringLiteral(":/sorvik/host/") + name);
    if (!file.open(QIODevice::ReadOnly))
        return {};
    return file.readAll();
}

} // namespace resources
