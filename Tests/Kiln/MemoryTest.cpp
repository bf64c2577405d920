// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <atomic>
#include <cstring>
#include <thread>

#include "Kiln/Scratch.h"
#include "Tests/Kiln/OnEachFramework.h"

namespace Kiln {
namespace {

constexpr std::uint64_t kMega = 1U << 20;
constexpr std::uint64_t kAll = ~std::uint64_t{0};

class MemoryOnEachFramework : public OnEachFramework {
protected:
    MemoryManager& Memory() { return *mDevice->GetDeviceMemory(); }
};
KILN_ON_EACH_FRAMEWORK(MemoryOnEachFramework);

TEST_P(MemoryOnEachFramework, FiguresFollowEveryBlock) {
    for (MemoryManager* memory : {mDevice->GetDeviceMemory().get(), mDevice->GetHostMemory().get()}) {
        memory->ResetStatistics();
        std::vector<std::uint64_t> blocks;
        std::uint64_t asked = 0;
        for (const std::uint64_t bytes : {1ULL, 68ULL, 256ULL, 257ULL, 4099ULL, 65536ULL, 1000003ULL, 33177600ULL}) {
            blocks.push_back(memory->Allocate(bytes));
            ASSERT_NE(blocks.back(), 0U);
            asked += bytes;
        }
        const MemoryFigures held = memory->GetFigures();
        EXPECT_GE(held.bytesInUse, asked);
        EXPECT_LE(held.bytesInUse, asked + asked / 16 + 256 * blocks.size());
        EXPECT_EQ(held.bytesPooled, 0U);
        for (const std::uint64_t block : blocks) memory->Free(block);
        EXPECT_EQ(memory->GetFigures().bytesInUse, 0U);
        EXPECT_EQ(memory->GetFigures().bytesPooled, held.bytesInUse);
        EXPECT_EQ(memory->GetStatistics().peakBytesInUse, held.bytesInUse);
        EXPECT_EQ(memory->GetStatistics().allocations, blocks.size());
        EXPECT_EQ(memory->ReleaseUnused(kAll), held.bytesInUse);
        EXPECT_EQ(memory->GetFigures().bytesPooled, 0U);
    }
}

TEST_P(MemoryOnEachFramework, TheLimitIsTheDevicesUnlessLowered) {
    const std::uint64_t whole = mDevice->GetMemoryLimit();
    EXPECT_EQ(Memory().GetFigures().hardLimit, whole);
    mDevice->SetMemoryLimit(whole + kMega);
    EXPECT_EQ(mDevice->GetMemoryLimit(), whole);
    mDevice->SetMemoryLimit(64 * kMega);
    EXPECT_EQ(Memory().GetFigures().hardLimit, 64 * kMega);
    EXPECT_NEAR(static_cast<double>(Memory().GetFigures().gentleLimit), 0.7 * 64 * kMega, kMega);
}

TEST_P(MemoryOnEachFramework, RefusesOnlyWhenPoolAndCacheHaveBeenGivenUp) {
    mDevice->SetMemoryLimit(64 * kMega);
    FrameCache& cache = Memory().GetFrameCache();
    const auto makeHash = [](std::uint32_t i) { return Halden::utility::Guid(i, 0, 0, {}); };
    for (std::uint32_t i = 1; i <= 3; ++i) cache.CacheFrame(makeHash(i), MakeFrame(496, 1024));  // 8 MB each
    EXPECT_TRUE(cache.FindFrame(makeHash(1)));                                                   // 2 is the oldest now
    Memory().Free(Memory().Allocate(30 * kMega));

    const std::uint64_t fitsBesideTheCache = Memory().Allocate(38 * kMega);
    EXPECT_NE(fitsBesideTheCache, 0U);
    EXPECT_EQ(Memory().GetFigures().bytesPooled, 0U) << "the pool goes first";
    EXPECT_TRUE(cache.FindFrame(makeHash(2)) && cache.FindFrame(makeHash(3)) && cache.FindFrame(makeHash(1)));

    const std::uint64_t needsOneFrame = Memory().Allocate(5 * kMega);
    EXPECT_NE(needsOneFrame, 0U);
    EXPECT_FALSE(cache.FindFrame(makeHash(2))) << "the least recently used frame goes";
    EXPECT_TRUE(cache.FindFrame(makeHash(3)));

    EXPECT_EQ(Memory().GetStatistics().refusals, 0U);
    EXPECT_EQ(Memory().Allocate(30 * kMega), 0U);
    EXPECT_EQ(Memory().GetStatistics().refusals, 1U);
    EXPECT_EQ(cache.GetBytes(), 0U);
    EXPECT_EQ(Memory().Allocate(kAll), 0U);
    Memory().Free(fitsBesideTheCache);
    Memory().Free(needsOneFrame);
}

TEST_P(MemoryOnEachFramework, AFilterRefusesWhatItIsAskedTo) {
    std::atomic<int> calls{0};
    Memory().SetAllocationFilter([&calls](std::uint64_t) { return ++calls % 3 == 0; });
    std::string granted;
    for (int i = 0; i < 6; ++i) {
        const DeviceScratchBuffer buffer(mDevice, 1000);
        granted += buffer.GetHandle() != 0 ? '+' : '-';
    }
    EXPECT_EQ(granted, "++-++-");
    EXPECT_EQ(Memory().GetStatistics().refusals, 2U);
    Memory().SetAllocationFilter({});
    mDevice->GetHostMemory()->SetAllocationFilter([](std::uint64_t) { return true; });
    const ScopedRecordedHostMemory block(mDevice, 68);
    EXPECT_EQ(block.GetBlock(), nullptr);
}

// A staged block must not be handed out again while its copy waits: every slot would hold a later number then.
TEST_P(MemoryOnEachFramework, HostBlocksStayTheirsUntilTheQueueHasReadThem) {
    constexpr std::size_t kSlot = 96 << 10;
    constexpr std::uint32_t kSlots = 128;
    std::vector<std::uint64_t> slots;
    for (std::uint32_t i = 0; i < kSlots; ++i) slots.push_back(Memory().Allocate(kSlot));
    {
        const ScopedDeviceAccess access(mDevice);
        for (std::uint32_t i = 0; i < kSlots; ++i) {
            ScopedRecordedHostMemory block(mDevice, kSlot);
            ASSERT_NE(block.GetBlock(), nullptr);
            EXPECT_TRUE(mDevice->GetHostMemory()->Owns(reinterpret_cast<std::uint64_t>(block.GetBlock()) + kSlot - 1));
            const auto bytes = MakeBytes(kSlot, i);
            std::memcpy(block.GetBlock(), bytes.data(), kSlot);
            TimingMarkRef* mark = i % 3 == 0 ? &block.GetMark() : nullptr;
            ASSERT_EQ(mDevice->GetCommands()->CopyHostToDevice(block.GetBlock(), slots[i], kSlot, mark), 0);
        }
    }
    for (std::uint32_t i = 0; i < kSlots; ++i) {
        ASSERT_EQ(ReadBytes(slots[i], kSlot), MakeBytes(kSlot, i)) << "slot " << i;
        Memory().Free(slots[i]);
    }
    EXPECT_LT(mDevice->GetHostMemory()->GetFigures().bytesPooled, kSlots * kSlot) << "blocks are used again";
}

TEST_P(MemoryOnEachFramework, PageableMemoryIsTakenBeforeTheCopyReturns) {
    const DeviceScratchBuffer buffer(mDevice, 1 << 20);
    const auto sent = MakeBytes(1 << 20, 7);
    auto source = sent;
    const ScopedDeviceAccess access(mDevice);
    ASSERT_EQ(mDevice->GetCommands()->CopyHostToDevice(source.data(), buffer.GetHandle(), source.size(), nullptr), 0);
    std::fill(source.begin(), source.end(), std::uint8_t{0});
    EXPECT_EQ(ReadBytes(buffer.GetHandle(), sent.size()), sent);
    EXPECT_LT(mDevice->GetCommands()->CopyHostToDevice(nullptr, buffer.GetHandle(), 4, nullptr), 0);
    EXPECT_LT(mDevice->GetCommands()->CopyHostToDevice(source.data(), 0, 4, nullptr), 0);
}

TEST_P(MemoryOnEachFramework, ManyThreadsShareThePools) {
    mDevice->SetMemoryLimit(96 * kMega);
    std::atomic<int> damaged{0};
    std::vector<std::thread> threads;
    for (std::uint32_t seed = 1; seed <= 4; ++seed) {
        threads.emplace_back([this, seed, &damaged] {
            std::vector<VideoFrameRef> frames;
            for (std::uint32_t i = 0; i < 60; ++i) {
                const std::uint32_t pick = (i * 7919 + seed * 104729) % 11;
                VideoFrameRef frame;
                if (CreateGPUVideoFrame(frame, mDevice, kPixelFormat_GPU_BGRA_4444_16f, 64 << (pick % 4), 300 + pick,
                                        {1, 1}, 0, {}) == 0) {
                    Memory().GetFrameCache().CacheFrame(Halden::utility::Guid(pick, 1, 2, {}), frame);
                    frames.push_back(frame);
                }
                if (pick % 3 == 0) frames.clear();
                if (pick == 5) Memory().ReleaseUnused(kAll);
                const ScopedRecordedHostMemory block(mDevice, 1000 * (pick + 1));
                if (!block.GetBlock()) continue;
                std::memset(block.GetBlock(), static_cast<int>(seed), 1000);
                const auto* bytes = static_cast<const std::uint8_t*>(block.GetBlock());
                std::this_thread::yield();
                for (int k = 0; k < 1000; ++k) damaged += bytes[k] != seed;
            }
        });
    }
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(damaged, 0);
    EXPECT_EQ(Memory().GetFigures().bytesInUse > 0, Memory().GetFrameCache().GetBytes() > 0);
    Memory().GetFrameCache().Purge(kAll);
    EXPECT_EQ(Memory().GetFigures().bytesInUse, 0U);
    EXPECT_EQ(mDevice->GetHostMemory()->GetFigures().bytesInUse, 0U);
}

TEST_P(MemoryOnEachFramework, MarksTellTheQueuesTime) {
    const DeviceScratchBuffer buffer(mDevice, 32 * kMega);
    const ScopedDeviceAccess access(mDevice);
    const TimingMarkRef before = mDevice->GetCommands()->CreateMark();
    for (std::uint32_t i = 0; i < 4; ++i) {
        ASSERT_EQ(mDevice->GetBackend().Fill(buffer.GetHandle(), 0, i, 32 * kMega), 0);
    }
    const TimingMarkRef after = mDevice->GetCommands()->CreateMark();
    ASSERT_TRUE(before && after);
    const float elapsed = before->ElapsedMs(*after);
    EXPECT_GT(elapsed, 0.05F) << "128 MB were written";
    EXPECT_LT(elapsed, 20000.0F);
    EXPECT_TRUE(after->IsReached());
    EXPECT_EQ(mDevice->Synchronize(), 0);
    const TimingMarkRef last = mDevice->GetCommands()->CreateMark();
    last->Wait();
    EXPECT_TRUE(last->IsReached());
    EXPECT_EQ(ReadBytes(buffer.GetHandle(), 4), (std::vector<std::uint8_t>{3, 0, 0, 0}));
}

}  // namespace
}  // namespace Kiln
