#pragma once

// The Parselet catalogue: the store types this data-store library offers,
// read from an XML file that ships beside the library.

#include <QByteArray>
#include <QString>

#include <memory>
#include <vector>

namespace sorvik::vekex {

struct FileFilter
{
    QString extension; // without "*."
    bool userDefined = false;
};

struct StoreType
{
    QString name;
    QString model;
    QString description;
    QString iconFile; // as written in the catalogue; empty when there is none
    QByteArray icon;  // the icon file's contents
    bool system = false;
    bool importSupported = true;
    std::vector<FileFilter> filters;

    bool ReadsExtension(const QString &extension) const;
};

struct Catalogue
{
    QString path;
    std::vector<StoreType> types;

    const StoreType *Find(const QString &name) const; // case ignored
};

// Where the catalogue is: $CORVANE_VEKEX_CATALOGUE, else the file
// "vekex-parselets.xml" beside this library.
QString CataloguePath();

// Reads and checks the whole catalogue. Raises Failure with
// CatalogueUnreadable or CatalogueMalformed and a text naming the file, the
// line and what is wrong.
std::shared_ptr<const Catalogue> LoadCatalogue(const QString &path);

// The same from bytes already read; icons are still read relative to path.
std::shared_ptr<const Catalogue> ParseCatalogue(const QString &path, const QByteArray &bytes);

} // namespace sorvik::vekex
