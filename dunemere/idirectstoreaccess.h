#pragma once

#include "sorvik/com.h"

#include <cstdint>
#include <string>
#include <string_view>

namespace cv::vek::rovo::dunemere {

inline constexpr IID IID_IDirectStoreAccess = MakeGuid("{242BBA9E-455F-4A74-9A47-405A1FAB389A}");

// Told when a server instance has ended; called on the stop-and-wait thread.
class IServerStoppedCallback : public IUnknown
{
public:
    virtual void OnServerStopped() = 0;
};

// Index statistics of a locally running server instance, asked over the
// server's own protocol. Operations never raise: a server that cannot be
// reached, refuses or is too old for an operation gives its failure value
// (0xFFFFFFFF, false, or nothing filled).
class IDirectStoreAccess : public IUnknown
{
public:
    static constexpr std::uint32_t kFailure = 0xFFFFFFFFu;

    virtual std::uint32_t GetUserCount(std::uint32_t argument) = 0;
    // kind: 8 files, 16 channel groups, 32 channels.
    virtual std::uint32_t GetElementCount(std::uint32_t kind) = 0;
    // Replaces the previous stop-and-wait thread, waiting for it to end.
    virtual void StartStopWaitThread(IServerStoppedCallback *callback) = 0;
    virtual bool GetDiskIsFullCrawlStop() = 0;
    virtual std::uint32_t GetFileviewsTimeouted() = 0;
    // names and counts have capacity entries; total is written after every
    // successful exchange.
    virtual void GetFileviewsTimeoutedPerPlugIn(std::uint32_t capacity, std::u16string *names, std::uint32_t *counts,
                                                std::uint32_t *total) = 0;
    virtual void ResetIndexStatusTimeouted() = 0;
    virtual void ResetIndexStatusFailure() = 0;
    virtual void ResetIndexStatusNotMyFile() = 0;
};

// Both return an object with one reference, or raise cv::vek::Exception:
// -800 "out of memory", -1333 "cannot connect to Sorvik", -1001 "should never be here".
IDirectStoreAccess *CreateDirectStoreAccess(std::u16string_view portName, std::uint32_t flag);
IDirectStoreAccess *CreateDirectStoreAccessWithIdentification(std::u16string_view portName, std::uint32_t flag,
                                                              std::u16string_view identification,
                                                              std::u16string_view secretKey);

} // namespace cv::vek::rovo::dunemere
