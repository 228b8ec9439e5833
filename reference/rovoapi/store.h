#pragma once

// Where a Sorvik's configuration store lives and how it is opened.
//
// Folder: $CORVANE_SORVIK_STORE, else $XDG_DATA_HOME/corvane/sorvik, else
// ~/.local/share/corvane/sorvik. File: "local.sorvikdb" for the local Sorvik,
// "sorvik-<name>.sorvikdb" for a named one (name case folded, characters
// other than a-z 0-9 . _ - written as %XX of their UTF-8 bytes).

#include "reference/libsupport/db.h"

#include <QString>

#include <cstdint>
#include <memory>
#include <vector>

namespace sorvik::rovo {

QString StoreFolder();
QString StoreFile(const QString &sorvikName);

// Milliseconds a commit waits for another writer:
// $CORVANE_SORVIK_COMMIT_TIMEOUT_MS, else 10000.
int CommitTimeoutMilliseconds();

// Opens the store file, creating and initialising it when it does not exist
// or is empty. A file that is not a Sorvik store of this version is refused
// with StoreCorrupt and left as it is. With verify, the whole file is checked.
std::unique_ptr<Db> OpenStore(const QString &file, bool verify);

// Sets everything the configuration holds back to its defaults (the policy
// and the request log stay); runs inside the caller's write transaction.
void ResetConfiguration(Db &db);
// Appends a request for the server (done after the commit).
void AddRequest(Db &db, const QString &kind, const QString &argument);

// Every commit (and every reset) advances the configuration generation by
// one inside its own transaction; a running server records the generation it
// has applied, and the index manager waits for it. 0 for a store that was
// never committed to.
std::int64_t ConfigGeneration(Db &db);
// Returns the new generation.
std::int64_t AdvanceConfigGeneration(Db &db);

// Once a commit is through, the committer writes the generation to the
// commit marker beside the store ("<store file>-commit"): closing it wakes
// a running server, which watches it. (SQLite's own files change before a
// commit becomes visible to readers, so they cannot serve as the signal.)
// A marker that cannot be written is left alone: the server then takes the
// commit up with the next one, or when a WaitForUpdate asks for it.
QString CommitMarkerFile(const QString &storeFile);
void AnnounceCommit(const QString &storeFile, std::int64_t generation);

struct StoreRequest
{
    std::int64_t id = 0;
    QString kind;
    QString argument;
};
// The requests with an id above afterId, oldest first.
std::vector<StoreRequest> ReadRequests(Db &db, std::int64_t afterId);

} // namespace sorvik::rovo
