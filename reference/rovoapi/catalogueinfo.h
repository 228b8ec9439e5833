#pragma once

// What the server API library needs to know of the Parselets: read once per
// Sorvik object from the data-store environment's catalogue.

#include "sorvik/vekex.h"

#include <QString>

#include <functional>
#include <memory>
#include <vector>

namespace sorvik::rovo {

struct ParseletInfo
{
    QString name;
    QString model;
    bool system = false;
    bool importSupported = true;
    std::vector<QString> extensions; // case folded, without "*."

    // Used unless the configuration says otherwise.
    bool ActiveByDefault() const { return importSupported && !system; }
    bool Reads(const QString &extensionKey) const;
};

struct CatalogueInfo
{
    std::vector<ParseletInfo> parselets; // catalogue order

    const ParseletInfo *Find(const QString &name) const; // case ignored
    // The Parselet's catalogue spelling; NotFound (or code) for an unknown name.
    const ParseletInfo &Require(const QString &name, std::int32_t code) const;
};

// The active Parselets reading extensionKey (case folded, without "*."),
// highest priority first: those named in explicitOrder in that order, then
// the others in catalogue order. The configuration view answers with it and
// the server indexes by it, so both always agree.
std::vector<const ParseletInfo *> ExtensionParselets(const CatalogueInfo &catalogue, const QString &extensionKey,
                                                     const std::vector<QString> &explicitOrder,
                                                     const std::function<bool(const ParseletInfo &)> &isActive);

// Raises CatalogueFailed with the data-store library's explanation.
std::shared_ptr<const CatalogueInfo> ReadCatalogueInfo(cv::vekex::IEnvironment *dataStore);

} // namespace sorvik::rovo
