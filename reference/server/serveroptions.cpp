#include "reference/server/serveroptions.h"

#include "sorvik/packedversion.h"

#include <QString>

#include <charconv>
#include <string_view>
#include <vector>

namespace sorvik::server {

namespace {

std::u16string Utf16(std::string_view utf8)
{
    return QString::fromUtf8(utf8.data(), qsizetype(utf8.size())).toStdU16String();
}

std::optional<std::uint32_t> ParseField(std::string_view text, std::uint32_t limit)
{
    std::uint32_t value = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value);
    if (text.empty() || error != std::errc() || end != text.data() + text.size() || value > limit)
        return std::nullopt;
    return value;
}

// A day is far more than any test or demonstration needs.
constexpr std::uint32_t kMaxApplyDelayMs = 86400000;
// The configuration's own limit of the idle time.
constexpr std::uint32_t kMaxIdleSeconds = 9999;

} // namespace

std::optional<std::uint32_t> ParsePackedVersion(std::string_view text)
{
    std::vector<std::string_view> fields;
    while (true) {
        const auto dot = text.find('.');
        fields.push_back(text.substr(0, dot));
        if (dot == std::string_view::npos)
            break;
        text.remove_prefix(dot + 1);
    }
    if (fields.size() != 3)
        return std::nullopt;
    const auto major = ParseField(fields[0], 63);
    const auto minor = ParseField(fields[1], 15);
    const auto patch = ParseField(fields[2], 15);
    if (!major || !minor || !patch)
        return std::nullopt;
    return PackVersion(*major, *minor, *patch);
}

std::optional<ServerOptions> ParseServerOptions(int argc, char **argv, std::string &error)
{
    ServerOptions options;
    for (int i = 1; i < argc; ++i) {
        const std::string_view option = argv[i];
        auto value = [&]() -> std::optional<std::string_view> {
            if (i + 1 >= argc) {
                error = std::string(option) + " needs a value";
                return std::nullopt;
            }
            return std::string_view(argv[++i]);
        };
        if (option == "--require-authentication") {
            options.requireAuthentication = true;
            continue;
        }
        if (option == "--skip-mutual-authentication") {
            options.skipMutualAuthentication = true;
            continue;
        }
        if (option != "--portname" && option != "--version" && option != "--identification" &&
            option != "--secretkey" && option != "--keytab" && option != "--principal" && option != "--store" &&
            option != "--client-target" && option != "--apply-delay-ms" && option != "--idle-seconds") {
            error = "unknown option " + std::string(option);
            return std::nullopt;
        }
        const auto text = value();
        if (!text)
            return std::nullopt;
        if (option == "--portname") {
            options.portName = Utf16(*text);
        } else if (option == "--version") {
            const auto version = ParsePackedVersion(*text);
            if (!version) {
                error = "--version wants MAJOR.MINOR.PATCH, got " + std::string(*text);
                return std::nullopt;
            }
            options.version = *version;
        } else if (option == "--identification") {
            options.identification = Utf16(*text);
        } else if (option == "--secretkey") {
            options.secretKey = Utf16(*text);
        } else if (option == "--keytab") {
            options.keytab = std::string(*text);
        } else if (option == "--principal") {
            options.principal = Utf16(*text);
        } else if (option == "--client-target") {
            options.clientTarget = Utf16(*text);
        } else if (option == "--apply-delay-ms") {
            const auto delay = ParseField(*text, kMaxApplyDelayMs);
            if (!delay) {
                error = "--apply-delay-ms wants milliseconds from 0 to " + std::to_string(kMaxApplyDelayMs) + ", got " +
                        std::string(*text);
                return std::nullopt;
            }
            options.applyDelayMs = *delay;
        } else if (option == "--idle-seconds") {
            const auto idle = ParseField(*text, kMaxIdleSeconds);
            if (!idle) {
                error = "--idle-seconds wants seconds from 0 to " + std::to_string(kMaxIdleSeconds) + ", got " +
                        std::string(*text);
                return std::nullopt;
            }
            options.idleSeconds = *idle;
        } else {
            options.store = std::string(*text);
        }
    }
    if (options.identification.empty() != options.secretKey.empty()) {
        error = "--identification and --secretkey go together";
        return std::nullopt;
    }
    if (options.keytab.empty() != options.principal.empty()) {
        error = "--keytab and --principal go together";
        return std::nullopt;
    }
    return options;
}

} // namespace sorvik::server
