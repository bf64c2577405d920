// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <thread>

#include <boost/weak_ptr.hpp>

#include "Ostrand/Allocated.h"
#include "Tests/Kiln/OnEachFramework.h"

namespace Kiln {
namespace {

using LifetimeOnEachFramework = OnEachFramework;
KILN_ON_EACH_FRAMEWORK(LifetimeOnEachFramework);

TEST_P(LifetimeOnEachFramework, InitializationsNest) {
    const DeviceRef device = mDevice;
    Initialize(true);
    EXPECT_EQ(GetPrimaryDevice(GetParam()), device);
    Terminate();
    EXPECT_EQ(GetPrimaryDevice(GetParam()), device);
    EXPECT_EQ(GetDevice(GetParam(), 0), device);
    EXPECT_FALSE(GetDevice(GetParam(), GetDeviceCount(GetParam())));
    EXPECT_FALSE(device->GetDescription().empty());
    EXPECT_EQ(device->GetDescription().find('\n'), std::string::npos);
}

TEST_P(LifetimeOnEachFramework, ADeviceLivesAsLongAsItsFrames) {
    const std::int64_t blocksBefore = Ostrand::Allocator::GetLiveBlocks();
    VideoFrameRef frame = MakeFrame(100, 50);
    boost::weak_ptr<Device> watched = mDevice;
    const std::uint64_t identity = mDevice->GetContextIdentity();
    mDevice->GetDeviceMemory()->GetFrameCache().CacheFrame(Halden::utility::Guid(1, 2, 3, {}), frame);
    mDevice.reset();
    Terminate();
    EXPECT_FALSE(GetPrimaryDevice(GetParam()));
    ASSERT_FALSE(watched.expired()) << "the frame holds it";
    {
        const DeviceRef orphan = watched.lock();
        EXPECT_EQ(orphan->GetDeviceMemory()->GetFrameCache().GetBytes(), 0U);
        orphan->GetDeviceMemory()->GetFrameCache().CacheFrame(Halden::utility::Guid(1, 2, 3, {}), frame);
    }
    std::thread([&frame] { frame.Reset(); }).join();
    EXPECT_TRUE(watched.expired());
    EXPECT_EQ(Ostrand::Allocator::GetLiveBlocks(), blocksBefore);

    Initialize(true);
    mDevice = GetPrimaryDevice(GetParam());
    ASSERT_TRUE(mDevice);
    EXPECT_NE(mDevice->GetContextIdentity(), identity);
    EXPECT_TRUE(MakeFrame(16, 16));
}

TEST_P(LifetimeOnEachFramework, ExclusiveAccessIsRecursiveAndHoldsOthersOff) {
    int turns = 0;
    std::vector<std::thread> threads;
    for (int i = 0; i < 3; ++i) {
        threads.emplace_back([this, &turns] {
            for (int k = 0; k < 200; ++k) {
                const ScopedDeviceAccess outer(mDevice);
                const ScopedDeviceAccess inner(mDevice);
                ++turns;
            }
        });
    }
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(turns, 600);
}

}  // namespace
}  // namespace Kiln
