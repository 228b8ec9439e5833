#include "reference/kerberosaccept/kerberosacceptor.h"
#include "reference/kerberosaccept/sidlogon.h"
#include "support/kdcrealm.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <signal.h>
#include <unistd.h>

#if defined(__SANITIZE_ADDRESS__)
#define SORVIK_LSAN 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define SORVIK_LSAN 1
#endif
#endif
#ifdef SORVIK_LSAN
#include <sanitizer/lsan_interface.h>
#endif

#include <chrono>
#include <cstdlib>
#include <fstream>
#include <optional>
#include <stdexcept>

namespace {

using cv::vek::rovo::kerberos::AcceptSidLogOn;
using cv::vek::rovo::kerberos::KerberosAcceptor;
using Outcome = KerberosAcceptor::Outcome;
using testing::HasSubstr;

std::vector<std::uint8_t> Utf16Le(std::u16string_view text)
{
    std::vector<std::uint8_t> bytes;
    for (const char16_t unit : text) {
        bytes.push_back(std::uint8_t(unit & 0xFF));
        bytes.push_back(std::uint8_t(unit >> 8));
    }
    return bytes;
}

// MIT krb5 1.20 loses a copy of the desired name when gss_acquire_cred_from
// fails; that is the library's, not ours.
class LibraryLeaksIgnored final
{
public:
#ifdef SORVIK_LSAN
    LibraryLeaksIgnored() { __lsan_disable(); }
    ~LibraryLeaksIgnored() { __lsan_enable(); }
#else
    LibraryLeaksIgnored() {}
#endif
    LibraryLeaksIgnored(const LibraryLeaksIgnored &) = delete;
    LibraryLeaksIgnored &operator=(const LibraryLeaksIgnored &) = delete;
};

std::optional<std::string> Env(const char *name)
{
    const char *value = std::getenv(name);
    return value ? std::optional<std::string>(value) : std::nullopt;
}

TEST(KdcRealm, StartsQuicklyAndLeavesNothingBehind)
{
    const auto before = Env("KRB5CCNAME");
    std::filesystem::path folder;
    pid_t kdc = -1;
    const auto start = std::chrono::steady_clock::now();
    {
        testsupport::KdcRealm realm;
        folder = realm.Folder();
        kdc = realm.KdcPid();
        EXPECT_GT(kdc, 0);
        EXPECT_TRUE(std::filesystem::exists(realm.KeytabPath()));
        EXPECT_TRUE(std::filesystem::exists(realm.CcachePath()));
        EXPECT_EQ(Env("KRB5CCNAME"), "FILE:" + realm.CcachePath().string());
        EXPECT_EQ(realm.Variables().size(), 5u);
        for (const auto &[name, value] : realm.Variables()) {
            EXPECT_EQ(Env(name.c_str()), value) << name;
            const std::string path = value.starts_with("FILE:") ? value.substr(5) : value;
            EXPECT_TRUE(path.starts_with(folder.string())) << name;
        }
        std::ifstream krb5conf(folder / "krb5.conf");
        const std::string config((std::istreambuf_iterator<char>(krb5conf)), {});
        EXPECT_THAT(config, HasSubstr("kdc = 127.0.0.1:" + std::to_string(realm.KdcPort())));
    }
    const auto elapsed = std::chrono::steady_clock::now() - start;
    EXPECT_LT(elapsed, std::chrono::seconds(5));
    EXPECT_FALSE(std::filesystem::exists(folder));
    // Reaped, not only signalled: no zombie, no process.
    EXPECT_EQ(::kill(kdc, 0), -1);
    EXPECT_EQ(errno, ESRCH);
    EXPECT_EQ(Env("KRB5CCNAME"), before);
}

TEST(KdcRealm, MissingToolIsReportedWithWhereToGetIt)
{
    try {
        testsupport::KdcRealm::FindTool("sorvik-no-such-kerberos-tool");
        ADD_FAILURE() << "found";
    } catch (const std::runtime_error &error) {
        EXPECT_THAT(error.what(), HasSubstr("run scripts/setup"));
    }
    EXPECT_FALSE(testsupport::KdcRealm::FindTool("krb5kdc").empty()) << "CI must have the KDC";
}

TEST(KdcRealm, TwoRealmsRunSideBySideOnTheirOwnPorts)
{
    testsupport::KdcRealm first;
    const int firstPort = first.KdcPort();
    testsupport::KdcRealm second;
    EXPECT_NE(second.KdcPort(), firstPort);
    // The later realm's environment wins while both live.
    EXPECT_EQ(Env("KRB5_CONFIG"), (second.Folder() / "krb5.conf").string());
}

TEST(KerberosAcceptor, RefusesAPrincipalWithoutKeyInTheKeytab)
{
    testsupport::KdcRealm realm;
    LibraryLeaksIgnored failingAcquisitions;
    try {
        KerberosAcceptor acceptor(realm.KeytabPath().string(), realm.OtherServicePrincipal());
        FAIL() << "an acceptor without key was made";
    } catch (const std::runtime_error &error) {
        EXPECT_THAT(error.what(), HasSubstr(realm.OtherServicePrincipal()));
        EXPECT_THAT(error.what(), HasSubstr("minor"));
    }
    EXPECT_THROW(KerberosAcceptor((realm.Folder() / "missing.keytab").string(), realm.ServicePrincipal()),
                 std::runtime_error);
}

TEST(KerberosAcceptor, GarbageEndsTheExchange)
{
    testsupport::KdcRealm realm;
    KerberosAcceptor acceptor(realm.KeytabPath().string(), realm.ServicePrincipal());
    EXPECT_EQ(acceptor.ServicePrincipal(), realm.ServicePrincipal());
    const std::vector<std::uint8_t> garbage{0x60, 0x03, 0x06, 0x01, 0x00};
    const auto refused = acceptor.Step(garbage);
    EXPECT_EQ(refused.outcome, Outcome::Failed);
    EXPECT_THAT(refused.error, HasSubstr("major"));
    const auto again = acceptor.Step(garbage);
    EXPECT_EQ(again.outcome, Outcome::Failed);
    EXPECT_THAT(again.error, HasSubstr("already ended"));

    KerberosAcceptor fresh(realm.KeytabPath().string(), realm.ServicePrincipal());
    EXPECT_EQ(fresh.Step({}).outcome, Outcome::Failed);
    EXPECT_TRUE(fresh.ClientName().empty());
}

TEST(SidLogOn, AcceptsLocalAccountsOnly)
{
    const std::u16string self = u"S-1-22-1-" + [] {
        const std::string uid = std::to_string(::getuid());
        return std::u16string(uid.begin(), uid.end());
    }();
    const auto accepted = AcceptSidLogOn(Utf16Le(self));
    EXPECT_TRUE(accepted.accepted) << accepted.error;
    EXPECT_EQ(accepted.sid, self);
    EXPECT_FALSE(accepted.account.empty());

    const auto system = AcceptSidLogOn(Utf16Le(u"S-1-5-18"));
    EXPECT_TRUE(system.accepted);
    EXPECT_EQ(system.account, u"SYSTEM");

    const struct
    {
        std::vector<std::uint8_t> token;
        const char *why;
    } refused[] = {
        {{}, "empty"},
        {{'S', 0, '-'}, "odd length"},
        {Utf16Le(std::u16string(cv::vek::rovo::kerberos::kMaxSidUnits + 1, u'1')), "longer than any SID"},
        {Utf16Le(u"S-1-5-21-1-2-3-500"), "no local account"},
        {Utf16Le(u"S-1-22-1-01"), "no local account"},
    };
    for (const auto &row : refused) {
        const auto result = AcceptSidLogOn(row.token);
        EXPECT_FALSE(result.accepted) << row.why;
        EXPECT_THAT(result.error, HasSubstr(row.why));
        EXPECT_TRUE(result.account.empty());
    }
}

} // namespace
