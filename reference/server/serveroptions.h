#pragma once

#include <cstdint>
#include <optional>
#include <string_view>
#include <string>

namespace sorvik::server {

// The reference server's command line:
//   Sorvik [--portname NAME] [--version MAJOR.MINOR.PATCH]
//          [--identification TEXT --secretkey KEY]
//          [--keytab FILE --principal NAME] [--require-authentication]
//          [--client-target NAME] [--skip-mutual-authentication]
//          [--store DIR] [--apply-delay-ms N] [--idle-seconds N]
struct ServerOptions
{
    // Empty: the default local server, which also holds the global mutex.
    std::u16string portName;
    std::uint32_t version = 0x4800000; // 18.0.0
    // When set, permission requests must carry this identification and a
    // valid client proof made with the key.
    std::u16string identification;
    std::u16string secretKey;
    // Kerberos log-on: the keytab and the principal clients are to target.
    std::string keytab;
    std::u16string principal;
    // For tests of the client: the principal clients are told to target,
    // when it is to differ from the one the server accepts for.
    std::u16string clientTarget;
    // Ask for authentication even without a keytab (SID log-ons only).
    bool requireAuthentication = false;
    // For tests of the client: completes a Kerberos log-on without returning
    // the server's token, so that mutual authentication cannot happen.
    bool skipMutualAuthentication = false;
    // The folder of the configuration stores.
    std::string store;
    // How long taking up each committed configuration takes (for showing and
    // testing slow servers).
    std::uint32_t applyDelayMs = 0;
    // Replaces the configured idle time before indexing (for demonstrations
    // and tests that cannot wait for it).
    std::optional<std::uint32_t> idleSeconds;

    bool RequiresAuthentication() const { return requireAuthentication || !keytab.empty(); }
    bool ChecksClientProof() const { return !identification.empty(); }
};

// The options, or nothing with a message in error.
std::optional<ServerOptions> ParseServerOptions(int argc, char **argv, std::string &error);

// "MAJOR.MINOR.PATCH" within the packed version's fields.
std::optional<std::uint32_t> ParsePackedVersion(std::string_view text);

} // namespace sorvik::server
