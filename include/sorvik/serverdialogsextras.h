#pragma once

// Exports of libServerDialogs.so beyond the classic set: the files the
// module carries for its host, and a gallery of its dialogs as images.

#include "sorvik/com.h"
#include "sorvik/logfont.h"

#include <cstdint>

extern "C" {
// The bytes of a file carried for the host ("unitcatalogue.xml",
// "queryproxy-files.xml", "queryproxy-measurements.xml"), valid while the
// module is loaded; null (and *size 0) for any other name.
SORVIK_EXPORT const void *sorvikGetHostResource(const char *name, std::uint32_t *size);
// Renders every dialog of the module, in each of its states, to PNG files
// in folder (created if missing), with font as the dialog font (null: the
// templates' own). Returns the number of files written, or -1 when no
// widget application can exist or the folder cannot be written. Runs on
// the host's user-interface thread.
SORVIK_EXPORT std::int32_t sorvikRenderDialogs(const char16_t *folder, const LOGFONTW *font);
}

using PFN_sorvikGetHostResource = const void *(*)(const char *, std::uint32_t *);
using PFN_sorvikRenderDialogs = std::int32_t (*)(const char16_t *, const LOGFONTW *);
