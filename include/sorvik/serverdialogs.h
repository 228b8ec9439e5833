#pragma once

// The service interface a host receives from sorvikCreateServerDialogs, and
// the small interfaces around it. Slot orders are fixed: hosts compiled
// elsewhere call through them.

#include "sorvik/bstr.h"
#include "sorvik/com.h"
#include "sorvik/logfont.h"
#include "sorvik/wstring.h"

#include <cstdint>

// The host's help function: the topic as a newly allocated BSTR that the
// module frees after the call, and the context value the host gave with it.
using SorvikHelpCallback = void (*)(BSTR topic, std::uintptr_t context);

// An optional object of the host (SetHostObject). The properties dialog asks
// it for its state and, when that is 3, lets it prepare first.
struct SORVIK_EXPORT IServerDialogsHost : IUnknown
{
    virtual std::int32_t GetState() = 0;
    virtual std::int32_t Prepare() = 0;

protected:
    ~IServerDialogsHost() = default;
};

constexpr IID IID_IServerDialogs = MakeGuid("{AB68ECEC-D36A-4054-AE3D-C3C1226C3C4B}");

struct SORVIK_EXPORT IServerDialogs : IUnknown
{
    virtual void SetHelpCallback(SorvikHelpCallback callback, std::uintptr_t context) = 0;
    virtual void SetDialogFont(const LOGFONTW *font) = 0;
    // Modal results: 1 OK, 2 Cancel, -1 when the dialog cannot be created.
    virtual std::int32_t ShowConfigurationDialog() = 0;
    virtual std::int32_t ShowOptimizeDialog() = 0;
    // 1 when added, else the dialog's modal result.
    virtual std::int32_t AddSearchArea(cv::krn::WString &path, std::int32_t ignored) = 0;
    // 1 when changed, 3 when path is not a search area, else the modal result.
    virtual std::int32_t EditSearchArea(cv::krn::WString &path, std::int32_t ignored) = 0;
    // 1 when excluded, 2 when the user declined.
    virtual std::int32_t ExcludeFolder(cv::krn::WString &path) = 0;
    // 1 when removed, 2 when the user declined, 3 when path is neither a
    // search area nor an excluded folder.
    virtual std::int32_t RemoveSearchArea(cv::krn::WString &path) = 0;
    virtual void SetWaitFlag(std::int32_t flag) = 0;
    // 2 without a Sorvik object, else the modal result.
    virtual std::int32_t ShowResetDialog() = 0;
    virtual void SetHostObject(IServerDialogsHost *host) = 0;
    virtual std::int32_t AddSearchAreaEx(cv::krn::WString &path, std::int32_t ignored) = 0;
    virtual std::int32_t EditSearchAreaEx(cv::krn::WString &path, std::int32_t ignored) = 0;
    virtual void SetReserved(std::int32_t value) = 0;
    // Modes 0, 1, 2 and 4 are stored; any other value is ignored.
    virtual void SetServerMode(std::uint32_t mode) = 0;
    virtual std::int32_t GetInterfaceRevision() = 0; // always 2

protected:
    ~IServerDialogs() = default;
};

// The questions the Add/Edit Search Area dialog asks its owner about the
// existing search areas and the server's policy.
struct IInputTester
{
    // True when some search area has this alias (case ignored).
    virtual bool IsAliasInUse(const cv::krn::WString &alias) = 0;
    // Against each search area's client path: 1 equal, 2 path inside it,
    // -1 path contains it, 0 no conflict; alias receives that area's alias.
    virtual std::int32_t TestClientPath(const cv::krn::WString &path, cv::krn::WString &alias) = 0;
    // The same against each search area's path.
    virtual std::int32_t TestPath(const cv::krn::WString &path, cv::krn::WString &alias) = 0;
    // 4 when the server's policy forbids a search area there.
    virtual std::int32_t CheckPathAllowed(const cv::krn::WString &serverPath, const cv::krn::WString &path,
                                          const cv::krn::WString &alias) = 0;

protected:
    ~IInputTester() = default;
};

// A modeless window the module closes when it shuts down.
struct INonModalDialog
{
    virtual void Close() = 0;

protected:
    ~INonModalDialog() = default;
};
