#include "krn/osdep/notresolvedexception.h"
#include "krn/osdep/posixerror.h"
#include "krn/osdep/winerror.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <cstring>

namespace cv::krn::osdep {
namespace {

TEST(KrnOsError, WinErrorMapsEveryPlatformNumberToItsCode)
{
    const std::pair<std::uint32_t, std::uint32_t> table[] = {
        {0, 0},           {2, 7},           {3, 7},  {15, 7},  {4, 11},          {5, 0x80070005},
        {6, 1},           {87, 1},          {8, 2},  {14, 2},  {11, 23},         {16, 8},
        {19, 8},          {32, 8},          {33, 8}, {20, 37}, {23, 0xFFFFFE04}, {38, 4},
        {39, 9},          {80, 0xFFFFFF9E}, {1, 42}, {7, 42},  {123, 42},        {0xFFFFFFFF, 42},
    };
    for (const auto &[number, code] : table) {
        const WinError error(number);
        EXPECT_EQ(error.Code(), code) << "error number " << number;
        EXPECT_EQ(error.ErrorNumber(), number);
    }
}

TEST(KrnOsError, PosixErrorCodes)
{
    EXPECT_EQ(PosixError(0).Code(), 0u);
    EXPECT_EQ(PosixError(ENOENT).Code(), 7u);
    EXPECT_EQ(PosixError(EACCES).Code(), 42u);
    EXPECT_EQ(PosixError(ENOTDIR).Code(), 42u);
}

TEST(KrnOsError, TakesTheThreadsErrnoAndTheSystemMessage)
{
    errno = EACCES;
    const PosixError posix("Mutex", 17);
    EXPECT_EQ(posix.ErrorNumber(), static_cast<std::uint32_t>(EACCES));
    EXPECT_EQ(posix.Description(), std::strerror(EACCES));
    EXPECT_EQ(posix.SourceFile(), "Mutex");
    EXPECT_EQ(posix.SourceLine(), 17u);

    errno = 5;
    const WinError win;
    EXPECT_EQ(win.Code(), 0x80070005u);
    EXPECT_EQ(win.Description(), std::strerror(5));
    EXPECT_FALSE(WinError(0xFFFFFFFF).Description().empty());
}

TEST(KrnOsError, BaseAndResolverErrors)
{
    const OSException plain;
    EXPECT_EQ(plain.Description(), "Unknown error");
    EXPECT_EQ(plain.ErrorNumber(), 0u);
    EXPECT_EQ(plain.Code(), 42u);
    EXPECT_EQ(OSException("disk gone", 19).Code(), 42u);
    EXPECT_EQ(NotResolvedException().Description(), "Not able to resolve the network name or address");
}

} // namespace
} // namespace cv::krn::osdep
