#pragma once

// What the Add/Edit Search Area dialog asks the file system about a path:
// whether it is an existing folder, and whether it is an existing remote
// location (a network file system, or a //server/share or \\server\share
// path), which costs the file server traffic when indexed.

#include <QByteArray>
#include <QString>

#include <optional>

namespace pages {

class IPathInspector
{
public:
    // Whether the path's attributes can be read, and whether it is a folder.
    struct Attributes
    {
        bool readable = false;
        bool folder = false;
    };
    virtual Attributes AttributesOf(const QString &path) = 0;
    // The type of the file system that holds path ("ext4", "nfs4", ...), if known.
    virtual std::optional<QByteArray> FileSystemTypeOf(const QString &path) = 0;

protected:
    ~IPathInspector() = default;
};

// QFileInfo and QStorageInfo.
IPathInspector &FileSystemInspector();

bool IsNetworkFileSystemType(const QByteArray &type);
// "//server/share..." or "\\server\share...": a server and a share name.
bool IsUncPath(const QString &path);
bool IsExistingFolder(IPathInspector &inspector, const QString &path);
bool IsExistingRemoteLocation(IPathInspector &inspector, const QString &path);

} // namespace pages
