#pragma once

#include "dunemere/config.h"
#include "dunemere/idirectstoreaccess.h"
#include "dunemere/requestorbase.h"
#include "log/ilogimp.h"

#include <atomic>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

namespace cv::vek::rovo::dunemere {

class CStopWaitThread;

// Asks the server instance at "localhost" under a port name for index
// statistics over the server's own protocol. Connects on the first request
// and keeps the connection until a receive fails or the object goes.
class CDirectStoreAccess final : public IDirectStoreAccess
{
public:
    // Settings text for the instance, and the same with a client identification.
    static std::u16string SettingsText(std::u16string_view portName);
    static std::u16string SettingsText(std::u16string_view portName, std::u16string_view identification,
                                       std::u16string_view secretKey);

    CDirectStoreAccess(std::u16string_view portName, std::uint32_t flag, std::u16string settings);

    HRESULT QueryInterface(REFIID iid, void **object) override;
    ULONG AddRef() override;
    ULONG Release() override;

    std::uint32_t GetUserCount(std::uint32_t argument) override;
    std::uint32_t GetElementCount(std::uint32_t kind) override;
    void StartStopWaitThread(IServerStoppedCallback *callback) override;
    bool GetDiskIsFullCrawlStop() override;
    std::uint32_t GetFileviewsTimeouted() override;
    void GetFileviewsTimeoutedPerPlugIn(std::uint32_t capacity, std::u16string *names, std::uint32_t *counts,
                                        std::uint32_t *total) override;
    void ResetIndexStatusTimeouted() override;
    void ResetIndexStatusFailure() override;
    void ResetIndexStatusNotMyFile() override;

    std::uint32_t Flag() const noexcept { return m_flag; }
    const PLUGIN::Config &Settings() const noexcept { return m_config; }

private:
    ~CDirectStoreAccess();

    struct Answer
    {
        std::uint32_t value;
        std::u16string text;
    };
    // One request of category 5; nothing when it failed, whatever the reason.
    std::optional<Answer> Request(const char *name, std::uint32_t code, std::uint32_t argumentWord = 0,
                                  std::uint32_t argument = 0);
    std::uint32_t Version() const noexcept { return m_config.GetServerVersion(); }

    std::atomic<std::uint32_t> m_refs{1};
    std::u16string m_portName;
    std::uint32_t m_flag;
    std::u16string m_settings;
    // Counts its lines and writes them nowhere.
    util::file::log::ILogImp m_log;
    PLUGIN::Config m_config;
    RequestorBase m_requestor;
    CStopWaitThread *m_stopWait = nullptr;
};

// The per-Parselet text "name$count;name$count;..." spread over the arrays:
// entry i goes to names[i] and counts[i] for i below min(total, capacity);
// an entry that is not exactly two pieces leaves names[i] and sets counts[i] to 0.
void SpreadPerPlugInText(std::u16string_view text, std::uint32_t total, std::uint32_t capacity,
                         std::u16string *names, std::uint32_t *counts);

} // namespace cv::vek::rovo::dunemere
