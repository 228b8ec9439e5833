#include "faultyvfs.h"

#include <sqlite3.h>

#include <csignal>
#include <cstring>

namespace reftest {

namespace {

sqlite3_vfs *g_real = nullptr;
sqlite3_vfs g_shim;
Fault g_fault = Fault::None;
long g_at = 0;
long g_operations = 0;
bool g_full = false;

// Our file: the real one's state follows the base.
struct ShimFile
{
    sqlite3_file base;
    sqlite3_file *real;
};

sqlite3_file *Real(sqlite3_file *file)
{
    return reinterpret_cast<ShimFile *>(file)->real;
}

// True when the operation must fail as on a full disk.
bool CountChange()
{
    ++g_operations;
    if (g_fault == Fault::Kill && g_operations == g_at)
        std::raise(SIGKILL);
    if (g_fault == Fault::DiskFull && g_operations >= g_at)
        g_full = true;
    return g_full;
}

int Close(sqlite3_file *file)
{
    const int result = Real(file)->pMethods ? Real(file)->pMethods->xClose(Real(file)) : SQLITE_OK;
    sqlite3_free(Real(file));
    return result;
}
int Read(sqlite3_file *f, void *b, int n, sqlite3_int64 o) { return Real(f)->pMethods->xRead(Real(f), b, n, o); }
int Write(sqlite3_file *f, const void *b, int n, sqlite3_int64 o)
{
    return CountChange() ? SQLITE_FULL : Real(f)->pMethods->xWrite(Real(f), b, n, o);
}
int Truncate(sqlite3_file *f, sqlite3_int64 size)
{
    return CountChange() ? SQLITE_FULL : Real(f)->pMethods->xTruncate(Real(f), size);
}
// A full disk refuses new data, not the flush of what it already took.
int Sync(sqlite3_file *f, int flags)
{
    CountChange();
    return Real(f)->pMethods->xSync(Real(f), flags);
}
int FileSize(sqlite3_file *f, sqlite3_int64 *size) { return Real(f)->pMethods->xFileSize(Real(f), size); }
int Lock(sqlite3_file *f, int level) { return Real(f)->pMethods->xLock(Real(f), level); }
int Unlock(sqlite3_file *f, int level) { return Real(f)->pMethods->xUnlock(Real(f), level); }
int CheckReservedLock(sqlite3_file *f, int *out) { return Real(f)->pMethods->xCheckReservedLock(Real(f), out); }
int FileControl(sqlite3_file *f, int op, void *arg) { return Real(f)->pMethods->xFileControl(Real(f), op, arg); }
int SectorSize(sqlite3_file *f) { return Real(f)->pMethods->xSectorSize(Real(f)); }
int DeviceCharacteristics(sqlite3_file *f) { return Real(f)->pMethods->xDeviceCharacteristics(Real(f)); }
int ShmMap(sqlite3_file *f, int page, int size, int extend, void volatile **out)
{
    return Real(f)->pMethods->xShmMap(Real(f), page, size, extend, out);
}
int ShmLock(sqlite3_file *f, int offset, int n, int flags) { return Real(f)->pMethods->xShmLock(Real(f), offset, n, flags); }
void ShmBarrier(sqlite3_file *f) { Real(f)->pMethods->xShmBarrier(Real(f)); }
int ShmUnmap(sqlite3_file *f, int deleteFlag) { return Real(f)->pMethods->xShmUnmap(Real(f), deleteFlag); }

// Version 2: write-ahead logging needs the shared-memory methods; memory
// mapping (version 3) stays off, so every change passes through Write.
const sqlite3_io_methods g_methods = {
    2,        Close,        Read,     Write,    Truncate, Sync,       FileSize,  Lock,    Unlock,
    CheckReservedLock,      FileControl, SectorSize, DeviceCharacteristics, ShmMap, ShmLock, ShmBarrier, ShmUnmap,
    nullptr,  nullptr,
};

int Open(sqlite3_vfs *, sqlite3_filename name, sqlite3_file *file, int flags, int *outFlags)
{
    auto *shim = reinterpret_cast<ShimFile *>(file);
    shim->base.pMethods = nullptr;
    shim->real = static_cast<sqlite3_file *>(sqlite3_malloc(g_real->szOsFile));
    if (!shim->real)
        return SQLITE_NOMEM;
    std::memset(shim->real, 0, std::size_t(g_real->szOsFile));
    const int result = g_real->xOpen(g_real, name, shim->real, flags, outFlags);
    if (result != SQLITE_OK) {
        sqlite3_free(shim->real);
        return result;
    }
    shim->base.pMethods = &g_methods;
    return SQLITE_OK;
}

int Delete(sqlite3_vfs *, const char *name, int syncDir)
{
    CountChange();
    return g_real->xDelete(g_real, name, syncDir);
}

} // namespace

void InstallFaultyFileSystem(Fault fault, long atOperation)
{
    g_real = sqlite3_vfs_find(nullptr);
    g_shim = *g_real;
    g_shim.zName = "faulty";
    g_shim.szOsFile = int(sizeof(ShimFile));
    g_shim.xOpen = Open;
    g_shim.xDelete = Delete;
    g_shim.pNext = nullptr;
    g_fault = fault;
    g_at = atOperation;
    sqlite3_vfs_register(&g_shim, 1);
}

long FileChangingOperations()
{
    return g_operations;
}

} // namespace reftest
