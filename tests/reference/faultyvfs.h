#pragma once

// A SQLite file system shim for tests of what a commit leaves behind when
// the process dies or the disk fills: it counts the operations that change
// files (write, truncate, sync) and, at the chosen one, kills the process
// or from then on reports a full disk. Registered as the default, so a
// library that opens its database with the default file system gets it.

namespace reftest {

enum class Fault
{
    None,
    Kill,     // SIGKILL at the chosen operation, before it happens
    DiskFull, // from the chosen operation on, every write and truncation fails with SQLITE_FULL
};

// Installs the shim over the current default; operation counts from 1.
void InstallFaultyFileSystem(Fault fault, long atOperation);

// Operations that changed (or would have changed) a file so far.
long FileChangingOperations();

} // namespace reftest
