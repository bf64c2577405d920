// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tests/Kiln/OnEachFramework.h"

namespace Kiln {
namespace {

class FrameCacheOnEachFramework : public OnEachFramework {
protected:
    FrameCache& Cache() { return mDevice->GetDeviceMemory()->GetFrameCache(); }
    static Halden::utility::Guid Hash(std::uint32_t i) { return {i, 0, 0, {}}; }
};
KILN_ON_EACH_FRAMEWORK(FrameCacheOnEachFramework);

TEST_P(FrameCacheOnEachFramework, KeepsTheMostRecentFrames) {
    const VideoFrameRef first = MakeFrame(64, 64);
    const std::uint64_t bytes = 64 * Ostrand::Demand<Marl::IFrameRows>(first)->GetRowBytes();
    Cache().CacheFrame(Hash(1), first);
    Cache().CacheFrame(Hash(2), MakeFrame(64, 64));
    Cache().CacheFrame(Hash(3), MakeFrame(64, 64));
    EXPECT_EQ(Cache().GetBytes(), 3 * bytes);
    EXPECT_TRUE(Cache().FindFrame(Hash(1)) == first);
    EXPECT_FALSE(Cache().FindFrame(Hash(4)));

    const VideoFrameRef replacement = MakeFrame(64, 64);
    Cache().CacheFrame(Hash(2), replacement);
    EXPECT_EQ(Cache().GetBytes(), 3 * bytes) << "one frame to a fingerprint";
    EXPECT_TRUE(Cache().FindFrame(Hash(2)) == replacement);

    EXPECT_EQ(Cache().Purge(1), bytes);
    EXPECT_FALSE(Cache().FindFrame(Hash(3)));
    EXPECT_EQ(Cache().Purge(bytes + 1), 2 * bytes);
    EXPECT_EQ(Cache().Purge(bytes), 0U);
}

TEST_P(FrameCacheOnEachFramework, StaysWithinItsShareOfTheLimit) {
    constexpr std::uint64_t kLimit = 32U << 20;
    mDevice->SetMemoryLimit(kLimit);
    for (std::uint32_t i = 0; i < 40; ++i) {
        Cache().CacheFrame(Hash(i), MakeFrame(256, 240));  // 1 MB
        ASSERT_LE(Cache().GetBytes(), kLimit);
    }
    EXPECT_FALSE(Cache().FindFrame(Hash(0)));
    EXPECT_TRUE(Cache().FindFrame(Hash(39)));
    EXPECT_GE(Cache().GetBytes(), kLimit / 4);
    Cache().Purge(Cache().GetBytes() / 2);
    const std::uint64_t held = Cache().GetBytes();
    Cache().CacheFrame(Hash(100), MakeFrame(1024, 1100));  // 18 MB: more than the share
    EXPECT_FALSE(Cache().FindFrame(Hash(100)));
    EXPECT_EQ(Cache().GetBytes(), held) << "what can't be kept drives nothing out";
    mDevice->SetMemoryLimit(kLimit / 4);
    EXPECT_LE(Cache().GetBytes(), kLimit / 4);
}

}  // namespace
}  // namespace Kiln
