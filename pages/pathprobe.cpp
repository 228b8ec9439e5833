#include "pages/pathprobe.h"

#include <QDir>
#include <QFileInfo>
#include <QRegularExpression>
#include <QStorageInfo>

#include <array>

namespace pages {

namespace {

class CFileSystemInspector final : public IPathInspector
{
public:
    Attributes AttributesOf(const QString &path) override
    {
        const QFileInfo info(path);
        return Attributes{info.exists(), info.isDir()};
    }
    std::optional<QByteArray> FileSystemTypeOf(const QString &path) override
    {
        const QStorageInfo storage(path);
        if (!storage.isValid())
            return std::nullopt;
        return storage.fileSystemType();
    }
};

bool IsAbsolute(const QString &path)
{
    return IsUncPath(path) || QDir::isAbsolutePath(path);
}

} // namespace

IPathInspector &FileSystemInspector()
{
    static CFileSystemInspector inspector;
    return inspector;
}

bool IsNetworkFileSystemType(const QByteArray &type)
{
    static const std::array<QByteArray, 14> kNetworkTypes = {
        "nfs", "nfs4", "cifs", "smb3", "smbfs", "9p", "afs", "ceph", "glusterfs", "fuse.sshfs", "sshfs",
        "fuse.glusterfs", "fuse.cephfs", "ncpfs"};
    const QByteArray lower = type.toLower();
    for (const QByteArray &known : kNetworkTypes) {
        if (lower == known)
            return true;
    }
    return false;
}

bool IsUncPath(const QString &path)
{
    static const QRegularExpression unc(QStringLiteral(R"(^(//|\\\\)[^/\\]+[/\\][^/\\]+)"));
    return unc.match(path).hasMatch();
}

bool IsExistingFolder(IPathInspector &inspector, const QString &path)
{
    if (!IsAbsolute(path))
        return false;
    const IPathInspector::Attributes attributes = inspector.AttributesOf(path);
    return attributes.readable && attributes.folder;
}

bool IsExistingRemoteLocation(IPathInspector &inspector, const QString &path)
{
    if (!IsAbsolute(path) || !inspector.AttributesOf(path).readable)
        return false;
    if (IsUncPath(path))
        return true;
    const std::optional<QByteArray> type = inspector.FileSystemTypeOf(path);
    return type && IsNetworkFileSystemType(*type);
}

} // namespace pages
