#include "entry/errors/raiseerror.h"
#include "entry/errors/statuscall.h"

#include <gtest/gtest.h>

using cv::vek::Exception;

namespace {

template <typename F>
Exception caught(F &&f)
{
    try {
        f();
    } catch (const Exception &e) {
        return e;
    }
    ADD_FAILURE() << "no cv::vek::Exception was thrown";
    return Exception(0, {});
}

TEST(RaiseError, PrefixesTheSourcePositionToTheMessage)
{
    const Exception e = caught([] { cv::vek::RaiseError(u"out of memory", -800, u"", 7); });
    EXPECT_EQ(e.Code(), -800);
    EXPECT_EQ(e.Message(), u"(7): out of memory");

    const Exception named = caught([] { cv::vek::RaiseError(u"x", -1, u"file.cpp", 12); });
    EXPECT_EQ(named.Message(), u"file.cpp(12): x");
}

TEST(RequireString, PassesTextThroughAndRejectsNull)
{
    const char16_t *text = u"";
    EXPECT_EQ(cv::vek::RequireString(text), text);

    const Exception e = caught([] { cv::vek::RequireString(nullptr); });
    EXPECT_EQ(e.Code(), -1007);
    EXPECT_EQ(e.Message(), u"(42): string parameter must not be NULL");
}

int g_calls = 0;

int *objectButFailure(int value, std::int32_t *status)
{
    ++g_calls;
    static int object;
    object = value;
    *status = -4711;
    return &object;
}

int plusOne(int value, std::int32_t *status)
{
    ++g_calls;
    EXPECT_EQ(*status, 0) << "status starts at 0";
    return value + 1;
}

void positiveStatus(std::int32_t *status)
{
    ++g_calls;
    *status = 3;
}

TEST(CallEntryPoint, MissingEntryPointRaisesWithoutAnyCall)
{
    g_calls = 0;
    int (*missing)(int, std::int32_t *) = nullptr;
    const Exception vek = caught([&] { cv::vek::CallEntryPoint(cv::vek::kVekNotInitialized, missing, 1); });
    EXPECT_EQ(vek.Code(), -1006);
    EXPECT_EQ(vek.Message(), u"vek not correctly initialized");

    const Exception rovo = caught([&] { cv::vek::CallEntryPoint(cv::vek::kRovoNotInitialized, missing, 1); });
    EXPECT_EQ(rovo.Code(), -13001);
    EXPECT_EQ(rovo.Message(), u"rovo not correctly initialized");
    EXPECT_EQ(g_calls, 0);
}

TEST(CallEntryPoint, NonZeroStatusWinsOverAReturnedObject)
{
    g_calls = 0;
    const Exception e = caught([] { cv::vek::CallEntryPoint(cv::vek::kRovoNotInitialized, &objectButFailure, 5); });
    EXPECT_EQ(e.Code(), -4711);
    EXPECT_TRUE(e.Message().empty());

    const Exception positive =
        caught([] { cv::vek::CallEntryPoint(cv::vek::kVekNotInitialized, &positiveStatus); });
    EXPECT_EQ(positive.Code(), 3) << "a status is passed through as the library reported it";
    EXPECT_EQ(g_calls, 2);
}

TEST(CallEntryPoint, ZeroStatusReturnsTheResult)
{
    EXPECT_EQ(cv::vek::CallEntryPoint(cv::vek::kVekNotInitialized, &plusOne, 41), 42);
}

TEST(CallWithStatus, WrapsMemberCallsTheSameWay)
{
    struct Object
    {
        int Get(std::int32_t *status) const
        {
            *status = failing ? -1008 : 0;
            return 9;
        }
        bool failing = false;
    } object;

    EXPECT_EQ(cv::vek::CallWithStatus([&](std::int32_t *s) { return object.Get(s); }), 9);
    object.failing = true;
    EXPECT_EQ(caught([&] { cv::vek::CallWithStatus([&](std::int32_t *s) { return object.Get(s); }); }).Code(),
              -1008);
}

} // namespace
