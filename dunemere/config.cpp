#include "dunemere/config.h"

#include "dunemere/taggedtext.h"
#include "krn/osdep/hostinfo.h"
#include "log/ilogadmin.h"
#include "sorvik/packedversion.h"

#include <optional>

namespace PLUGIN {

namespace {

namespace log = cv::util::file::log;

bool EqualsIgnoringAsciiCase(std::u16string_view a, std::u16string_view b)
{
    if (a.size() != b.size())
        return false;
    for (std::size_t i = 0; i < a.size(); ++i) {
        char16_t x = a[i];
        char16_t y = b[i];
        if (x >= u'A' && x <= u'Z')
            x = char16_t(x - u'A' + u'a');
        if (y >= u'A' && y <= u'Z')
            y = char16_t(y - u'A' + u'a');
        if (x != y)
            return false;
    }
    return true;
}

bool AskHostInfo(std::u16string_view host)
{
    return cv::krn::osdep::HostInfo::Instance().IsLocal(host);
}

void ConfigureLog(log::ILogAdmin &target, const TaggedText::Element &logfile)
{
    target.SetFileName(logfile.content);
    if (const auto mask = logfile.attributes.find(u"bitmask"); mask != logfile.attributes.end())
        target.SetInfoMask(ReadUnsigned(mask->second, 0));
    if (const auto flags = logfile.attributes.find(u"outbitmask"); flags != logfile.attributes.end()) {
        // The additional-output switch belongs to whoever turned it on.
        const std::uint32_t kept = target.GetOutputFlags() & log::kOutputAdditionalSwitch;
        target.SetOutputFlags((ReadUnsigned(flags->second, 0) & ~log::kOutputAdditionalSwitch) | kept);
    }
}

} // namespace

Config::Config(std::u16string_view settings) : Config(settings, nullptr, {})
{
}

Config::Config(std::u16string_view settings, log::ILogAdmin &log) : Config(settings, &log, {})
{
}

Config::Config(std::u16string_view settings, log::ILogAdmin *log, HostCheck isThisMachine)
    : m_settings(settings)
{
    Parse(log, isThisMachine ? isThisMachine : HostCheck(AskHostInfo));
}

void Config::Parse(log::ILogAdmin *log, const HostCheck &isThisMachine)
{
    TaggedText text(m_settings);

    if (log) {
        if (const auto logfile = text.Find(u"logfile"))
            ConfigureLog(*log, *logfile);
    }

    if (const auto server = text.Find(u"server")) {
        m_server = server->content;
        m_serverIsThisMachine = EqualsIgnoringAsciiCase(m_server, u"localhost")
            || (!m_server.empty() && isThisMachine(m_server));
        if (m_queryTimeout == kQueryTimeoutNotSet && !m_serverIsThisMachine)
            m_queryTimeout = kRemoteQueryTimeout;
    }

    if (const auto port = text.Find(u"portname"))
        m_portName = port->content;
    if (const auto identification = text.Find(u"clientidentificationstring"))
        m_clientIdentification = identification->content;
    if (const auto key = text.Find(u"clientidentificationsecretkey"))
        m_clientSecretKey = key->content;

    if (const auto timeout = text.Find(u"receivetimeout"))
        m_receiveTimeout = ReadUnsigned(timeout->content, 10);
    if (const auto timeout = text.Find(u"querytimeout"))
        m_queryTimeout = ReadUnsigned(timeout->content, 10);
    if (const auto timeout = text.Find(u"sendtimeout"))
        m_sendTimeout = ReadUnsigned(timeout->content, 10);

    if (const auto start = text.Find(u"startengine"))
        m_startEngine = !EqualsIgnoringAsciiCase(start->content, u"no");
    if (const auto sync = text.Find(u"syncplugins"))
        m_syncPlugins = ReadSigned(sync->content, 10) > 0;
    if (const auto fsi = text.Find(u"fsionly"))
        m_fileSystemIndexOnly = fsi->content == u"yes";
}

void Config::SetServerVersion(std::uint32_t version)
{
    const std::uint32_t major = sorvik::VersionMajor(version);
    const bool is1800 = major == 18 && sorvik::VersionMinor(version) == 0 && sorvik::VersionPatch(version) == 0;
    if (is1800 || major < 18)
        m_version = version;
    else
        m_version = kDefaultVersion;
}

bool Config::IsLocalServer() const
{
    return m_portName.empty() && m_serverIsThisMachine;
}

bool Config::CanStartEngine() const
{
    return m_startEngine && IsLocalServer();
}

void Config::SetLoggedIn(bool loggedIn, const std::u16string &userName)
{
    m_loggedIn = loggedIn;
    m_userName = userName;
}

void Config::SetClientIdentification(const std::u16string &identification, const std::u16string &secretKey)
{
    m_clientIdentification = identification;
    m_clientSecretKey = secretKey;
}

} // namespace PLUGIN
