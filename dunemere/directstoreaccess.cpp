#include "dunemere/directstoreaccess.h"

#include "dunemere/requesttransferdata.h"
#include "dunemere/responsetransferdata.h"
#include "dunemere/stopwaitthread.h"
#include "dunemere/tointmsgda.h"
#include "entry/errors/raiseerror.h"
#include "krn/exception/exception.h"
#include "sorvik/packedversion.h"
#include "sorvik/vekexception.h"

#include <algorithm>
#include <charconv>
#include <new>
#include <vector>

namespace cv::vek::rovo::dunemere {

namespace {

constexpr std::uint32_t kStatisticsCategory = 5;
constexpr std::uint32_t kVerbosity = 5;

constexpr std::uint32_t kGetUserCount = 4001;
constexpr std::uint32_t kGetElementCount = 4002;
constexpr std::uint32_t kGetDiskIsFullCrawlStop = 4003;
constexpr std::uint32_t kGetFileviewsTimeouted = 4005;
constexpr std::uint32_t kGetFileviewsTimeoutedPerPlugIn = 4006;
constexpr std::uint32_t kResetIndexStatusTimeouted = 4007;
constexpr std::uint32_t kResetIndexStatusFailure = 4008;
constexpr std::uint32_t kResetIndexStatusNotMyFile = 4009;

bool HasStatistics(std::uint32_t version)
{
    return sorvik::VersionMajor(version) >= 2;
}

bool IsTwoZero(std::uint32_t version)
{
    return sorvik::VersionMajor(version) == 2 && sorvik::VersionMinor(version) == 0;
}

std::vector<std::u16string_view> SplitDroppingEmpty(std::u16string_view text, char16_t separator)
{
    std::vector<std::u16string_view> pieces;
    while (!text.empty()) {
        const auto end = text.find(separator);
        const auto piece = text.substr(0, end);
        if (!piece.empty())
            pieces.push_back(piece);
        if (end == std::u16string_view::npos)
            break;
        text.remove_prefix(end + 1);
    }
    return pieces;
}

// Leading decimal digits as the C library reads them; what does not start
// with a digit counts 0.
std::uint32_t DecimalPrefix(std::u16string_view text)
{
    std::string digits;
    for (char16_t c : text) {
        if (c < u'0' || c > u'9')
            break;
        digits += char(c);
    }
    std::uint32_t value = 0;
    std::from_chars(digits.data(), digits.data() + digits.size(), value);
    return value;
}

} // namespace

void SpreadPerPlugInText(std::u16string_view text, std::uint32_t total, std::uint32_t capacity,
                         std::u16string *names, std::uint32_t *counts)
{
    const auto entries = SplitDroppingEmpty(text, u';');
    // Entries the text does not hold are left as they were.
    const std::size_t filled = std::min<std::size_t>({total, capacity, entries.size()});
    for (std::size_t i = 0; i < filled; ++i) {
        const auto pieces = SplitDroppingEmpty(entries[i], u'$');
        if (pieces.size() == 2) {
            names[i] = std::u16string(pieces[0]);
            counts[i] = DecimalPrefix(pieces[1]);
        } else {
            counts[i] = 0;
        }
    }
}

std::u16string CDirectStoreAccess::SettingsText(std::u16string_view portName)
{
    std::u16string text = u"<server>localhost</server><portname>";
    text += portName;
    text += u"</portname>";
    return text;
}

std::u16string CDirectStoreAccess::SettingsText(std::u16string_view portName, std::u16string_view identification,
                                                std::u16string_view secretKey)
{
    std::u16string text = SettingsText(portName);
    text += u"<clientidentificationstring>";
    text += identification;
    text += u"</clientidentificationstring><clientidentificationsecretkey>";
    text += secretKey;
    text += u"</clientidentificationsecretkey>";
    return text;
}

CDirectStoreAccess::CDirectStoreAccess(std::u16string_view portName, std::uint32_t flag, std::u16string settings)
    : m_portName(portName), m_flag(flag), m_settings(std::move(settings)), m_log({}, 0),
      m_config(m_settings, m_log), m_requestor(m_config, m_log)
{
    m_log.SetOutputFlags(0);
}

CDirectStoreAccess::~CDirectStoreAccess()
{
    if (m_stopWait)
        m_stopWait->Release();
    m_requestor.Disconnect();
}

HRESULT CDirectStoreAccess::QueryInterface(REFIID iid, void **object)
{
    if (!object)
        return E_POINTER;
    if (iid == IID_IDirectStoreAccess || iid == IID_IUnknown) {
        *object = static_cast<IDirectStoreAccess *>(this);
        AddRef();
        return S_OK;
    }
    *object = nullptr;
    return E_NOINTERFACE;
}

ULONG CDirectStoreAccess::AddRef()
{
    return ++m_refs;
}

ULONG CDirectStoreAccess::Release()
{
    const std::uint32_t left = --m_refs;
    if (left == 0)
        delete this;
    return left;
}

std::optional<CDirectStoreAccess::Answer> CDirectStoreAccess::Request(const char *name, std::uint32_t code,
                                                                      std::uint32_t argumentWord,
                                                                      std::uint32_t argument)
{
    try {
        tRequestTransferData request(Version(), kStatisticsCategory, code);
        request.Arguments()[argumentWord] = argument;
        m_log.Info(__FILE__, __LINE__, kVerbosity) << "SKCP:     " << name << " request";
        const krn::ByteBuffer response = m_requestor.Exchange(m_config.GetReceiveTimeout(), request);
        const tResponseTransferData answer(response);
        return Answer{answer.Value(), answer.Text()};
    } catch (const DataCache::ToIntMsgDa &) {
    } catch (DataCache::cErrCodeDa) {
    } catch (const Exception &) {
    } catch (const krn::exception::Exception &) {
        // A response that does not decode is as good as none.
    } catch (const std::bad_alloc &) {
    }
    return std::nullopt;
}

std::uint32_t CDirectStoreAccess::GetUserCount(std::uint32_t argument)
{
    const auto answer = Request("GetUserCount", kGetUserCount, 0, argument);
    return answer ? answer->value : kFailure;
}

std::uint32_t CDirectStoreAccess::GetElementCount(std::uint32_t kind)
{
    const auto answer = Request("GetElementCount", kGetElementCount, 2, kind);
    return answer ? answer->value : kFailure;
}

bool CDirectStoreAccess::GetDiskIsFullCrawlStop()
{
    if (!HasStatistics(Version()))
        return false;
    const auto answer = Request("GetDiskIsFullCrawlStop", kGetDiskIsFullCrawlStop);
    return answer && answer->value != 0;
}

std::uint32_t CDirectStoreAccess::GetFileviewsTimeouted()
{
    if (!HasStatistics(Version()))
        return kFailure;
    const auto answer = Request("GetFileviewsTimeouted", kGetFileviewsTimeouted);
    return answer ? answer->value : kFailure;
}

void CDirectStoreAccess::GetFileviewsTimeoutedPerPlugIn(std::uint32_t capacity, std::u16string *names,
                                                        std::uint32_t *counts, std::uint32_t *total)
{
    if (!HasStatistics(Version()) || (capacity > 0 && (!names || !counts)))
        return;
    const auto answer = Request("GetFileviewsTimeoutedPerPlugIn", kGetFileviewsTimeoutedPerPlugIn, 0, capacity);
    if (!answer)
        return;
    if (total)
        *total = answer->value;
    if (capacity > 0)
        SpreadPerPlugInText(answer->text, answer->value, capacity, names, counts);
}

void CDirectStoreAccess::ResetIndexStatusTimeouted()
{
    const std::uint32_t version = Version();
    if (version >= sorvik::PackVersion(2, 0, 0) && version < sorvik::PackVersion(3, 2, 0))
        Request("ResetIndexStatusTimeouted", kResetIndexStatusTimeouted);
}

void CDirectStoreAccess::ResetIndexStatusFailure()
{
    if (HasStatistics(Version()))
        Request("ResetIndexStatusFailure", kResetIndexStatusFailure);
}

void CDirectStoreAccess::ResetIndexStatusNotMyFile()
{
    const std::uint32_t version = Version();
    if (HasStatistics(version) && !IsTwoZero(version))
        Request("ResetIndexStatusNotMyFile", kResetIndexStatusNotMyFile);
}

void CDirectStoreAccess::StartStopWaitThread(IServerStoppedCallback *callback)
{
    CStopWaitThread *next = nullptr;
    try {
        next = new CStopWaitThread(m_portName, callback);
    } catch (const std::bad_alloc &) {
    }
    // The previous thread's end is awaited here: it has called back, or
    // calls back when the instance ends.
    if (m_stopWait)
        m_stopWait->Release();
    m_stopWait = next;
}

namespace {

IDirectStoreAccess *Create(std::u16string_view portName, std::uint32_t flag, std::u16string settings)
{
    IDirectStoreAccess *access = nullptr;
    try {
        access = new CDirectStoreAccess(portName, flag, std::move(settings));
    } catch (const std::bad_alloc &) {
        RaiseError(u"out of memory", -800, {}, __LINE__);
    } catch (const DataCache::ToIntMsgDa &) {
        RaiseError(u"cannot connect to Sorvik", -1333, {}, __LINE__);
    } catch (DataCache::cErrCodeDa) {
        RaiseError(u"cannot connect to Sorvik", -1333, {}, __LINE__);
    }
    if (!access)
        RaiseError(u"should never be here", -1001, {}, __LINE__);
    return access;
}

} // namespace

IDirectStoreAccess *CreateDirectStoreAccess(std::u16string_view portName, std::uint32_t flag)
{
    return Create(portName, flag, CDirectStoreAccess::SettingsText(portName));
}

IDirectStoreAccess *CreateDirectStoreAccessWithIdentification(std::u16string_view portName, std::uint32_t flag,
                                                              std::u16string_view identification,
                                                              std::u16string_view secretKey)
{
    std::u16string settings = CDirectStoreAccess::SettingsText(portName, identification, secretKey);
    return Create(portName, flag, std::move(settings));
}

} // namespace cv::vek::rovo::dunemere
