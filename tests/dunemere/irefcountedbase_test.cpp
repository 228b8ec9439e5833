#include "dunemere/irefcountedbase.h"

#include <gtest/gtest.h>

namespace {

using cv::vek::rovo::IRefCountedBase;

class Counted final : public IRefCountedBase
{
public:
    explicit Counted(int &destroyed) : m_destroyed(destroyed) {}
    ~Counted() override
    {
        // A pair during destruction must not delete the object again.
        AddRef();
        Release();
        ++m_destroyed;
    }

private:
    int &m_destroyed;
};

TEST(IRefCountedBase, CountsFromOneAndDeletesAtZero)
{
    int destroyed = 0;
    auto *object = new Counted(destroyed);
    EXPECT_EQ(object->AddRef(), 2u);
    EXPECT_EQ(object->AddRef(), 3u);
    EXPECT_EQ(object->Release(), 1u);
    EXPECT_EQ(object->Release(), 1u);
    EXPECT_EQ(destroyed, 0);
    EXPECT_EQ(object->Release(), 0u);
    EXPECT_EQ(destroyed, 1);
}

} // namespace
