#pragma once

// Where a Sorvik's configuration store lives and how it is opened.
//
// Folder: $CORVANE_SORVIK_STORE, else $XDG_DATA_HOME/corvane/sorvik, else
// ~/.local/share/corvane/sorvik. File: "local.sorvikdb" for the local Sorvik,
// "sorvik-<name>.sorvikdb" for a named one (name case folded, characters
// other than a-z 0-9 . _ - written as %XX of their UTF-8 bytes).

#include "reference/libsupport/db.h"

#include <QString>

#include <memory>

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

} // namespace sorvik::rovo
