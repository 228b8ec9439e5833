#pragma once

// Configuration files (".skc"): the whole configuration of a Sorvik as XML.
// Format: reference/rovoapi/README.md.

#include "reference/rovoapi/catalogueinfo.h"
#include "reference/rovoapi/config.h"

#include <QString>

namespace sorvik::rovo {

// Reads and checks a whole file. Raises FileUnreadable or FileMalformed (with
// the line and what is wrong); nothing is returned from a file that fails.
Configuration ReadConfigurationFile(const QString &file, const CatalogueInfo &catalogue);

// The same from bytes already read; file only names them in errors.
Configuration ParseConfiguration(const QString &file, const QByteArray &bytes, const CatalogueInfo &catalogue);

// The file's contents for a configuration.
QByteArray SerializeConfiguration(const Configuration &configuration);

// Writes the file as a whole: either the complete new file replaces the old
// one or the old one stays (FileWriteFailed).
void WriteConfigurationFile(const QString &file, const Configuration &configuration);

} // namespace sorvik::rovo
