#include "sorvik/bytebuffer.h"

#include <gtest/gtest.h>

#include <cstring>

using cv::krn::ByteBuffer;

namespace {

TEST(ByteBuffer, IsThreePointersAndGrowsKeepingItsBytes)
{
    ByteBuffer buffer;
    for (std::uint8_t i = 0; i < 200; ++i)
        buffer.append(&i, 1);
    ASSERT_EQ(buffer.size(), 200u);
    EXPECT_EQ(buffer.data()[199], 199);

    std::uint8_t *raw[3];
    std::memcpy(raw, &buffer, sizeof raw);
    EXPECT_EQ(raw[0], buffer.data());
    EXPECT_EQ(raw[1] - raw[0], 200);
    EXPECT_GE(raw[2], raw[1]);

    buffer.resize(204);
    EXPECT_EQ(buffer.data()[203], 0) << "resized bytes are zero";
    buffer.clear();
    EXPECT_TRUE(buffer.empty());
}

TEST(ByteBuffer, AppendsFromItsOwnStorageWhileGrowing)
{
    ByteBuffer buffer("abcd", 4);
    for (int i = 0; i < 5; ++i)
        buffer.append(buffer.data() + 1, buffer.size() - 1);
    EXPECT_EQ(std::memcmp(buffer.data(), "abcdbcd", 7), 0);

    ByteBuffer copy = buffer;
    ByteBuffer moved = std::move(buffer);
    EXPECT_TRUE(buffer.empty());
    EXPECT_EQ(copy.size(), moved.size());
    EXPECT_EQ(std::memcmp(copy.data(), moved.data(), copy.size()), 0);
}

} // namespace
