#pragma once

// The functions libServerDialogs.so exports, and their pointer types for hosts
// that load it with dlopen. Texts are NUL-terminated UTF-16.

#include "sorvik/com.h"
#include "sorvik/serverdialogs.h"
#include "sorvik/wstring.h"

#include <cstdint>

extern "C" {
// A service object with one reference for the caller, or null: a null status
// or a negative *status returns null and changes nothing; a null connection
// stores -1007; other failures store their code.
SORVIK_EXPORT IServerDialogs *sorvikCreateServerDialogs(const char16_t *connection, std::uint32_t serverMode,
                                                        std::int32_t *status);
// Counted start and end: the first Init loads the product libraries, the last
// Cleanup closes open wait windows and releases them.
SORVIK_EXPORT void Init(void);
SORVIK_EXPORT void Cleanup(void);
// 75504568 (0x04801BB8): version 18.0.0, build 7096.
SORVIK_EXPORT std::uint32_t GetVersionNumber(void);
// These return 2 and do nothing else.
SORVIK_EXPORT std::int32_t InitESK(void);
SORVIK_EXPORT std::int32_t InitESK2(void);
SORVIK_EXPORT std::int32_t InitESKWithAdaptor(void);
SORVIK_EXPORT std::int32_t InitESKWithAdaptor2(void);
// These do nothing; the fifth argument's string is released.
SORVIK_EXPORT void ExportLocalSorvik(void);
SORVIK_EXPORT void ExportLocalFederation(void);
SORVIK_EXPORT void ExportLocalSorvikFromASAMDlg(void *, void *, void *, void *, cv::krn::WString text);
SORVIK_EXPORT HRESULT DllCanUnloadNow(void);
// No creatable classes: always CLASS_E_CLASSNOTAVAILABLE with *object null.
SORVIK_EXPORT HRESULT DllGetClassObject(REFCLSID classId, REFIID iid, void **object);
}

using PFN_sorvikCreateServerDialogs = IServerDialogs *(*)(const char16_t *, std::uint32_t, std::int32_t *);
using PFN_ServerDialogsInit = void (*)();
using PFN_ServerDialogsCleanup = void (*)();
using PFN_GetVersionNumber = std::uint32_t (*)();
using PFN_InitESK = std::int32_t (*)();
using PFN_ExportLocalSorvik = void (*)();
using PFN_ExportLocalSorvikFromASAMDlg = void (*)(void *, void *, void *, void *, cv::krn::WString);
using PFN_DllCanUnloadNow = HRESULT (*)();
using PFN_DllGetClassObject = HRESULT (*)(REFCLSID, REFIID, void **);
