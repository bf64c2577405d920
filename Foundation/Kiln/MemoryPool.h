// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <list>
#include <map>
#include <memory>
#include <mutex>
#include <vector>

#include "Kiln/Backend.h"
#include "Kiln/LruFrameCache.h"
#include "Kiln/MemoryManager.h"

namespace Kiln {

/// The pool behind both kinds of memory.
///
/// Sizes are rounded up to classes that waste at most a sixteenth, so that frames of one size share one class and take
/// each other's blocks. Blocks of device memory are free at once: whoever gets one queues its work behind the work that
/// used it before. Host memory is written by the processor, out of the queue's order, so its blocks wait for a mark.
///
/// The pool's lock may be held while a mark is recorded or asked. It is never held while blocks are allocated or freed
/// by the backend, or while frames are let go.
class MemoryPool final : public MemoryManager {
public:
    enum class Kind { kDevice, kHost };

    MemoryPool(std::shared_ptr<Backend> backend, Kind kind, std::uint64_t limit);
    /// Gives everything back, blocks in use included: whoever could return those has gone.
    ~MemoryPool() override;
    MemoryPool(const MemoryPool&) = delete;
    MemoryPool& operator=(const MemoryPool&) = delete;

    std::uint64_t Allocate(std::uint64_t bytes) override;
    void Free(std::uint64_t block) override { Free(block, {}); }
    void Free(std::uint64_t block, const TimingMarkRef& lastUse) override;
    bool Owns(std::uint64_t address) const override;
    MemoryFigures GetFigures() const override;
    MemoryStatistics GetStatistics() const override;
    void ResetStatistics() override;
    std::uint64_t ReleaseUnused(std::uint64_t bytes) override;
    FrameCache& GetFrameCache() override { return mCache; }
    void SetAllocationFilter(boost::function<bool(std::uint64_t bytes)> refuse) override;

    /// The hard limit; the gentle one and the cache's bound follow.
    void SetLimit(std::uint64_t bytes);
    void CloseCache() { mCache.Close(); }

private:
    struct Block {
        std::uint64_t handle;
        std::uint64_t bytes;
    };
    struct WaitingBlock {
        Block block;
        TimingMarkRef lastUse;  ///< empty until a mark is recorded for a batch of blocks
    };
    using FreeBlocks = std::list<Block>;

    // Called under the lock.
    std::uint64_t TakePooled(std::uint64_t bytes);
    void AddPooled(const Block& block);
    Block RemovePooled(FreeBlocks::iterator block);
    void HandOut(const Block& block);
    void MarkWaitingBlocks();
    void CollectReachedBlocks();

    // Called without it.
    std::uint64_t TryAllocate(std::uint64_t bytes);
    bool GiveUpSomething(std::uint64_t bytes);
    bool AwaitMarks();
    void ReturnToSystem(const std::vector<Block>& blocks);
    std::uint64_t AllocateFromSystem(std::uint64_t bytes);

    const std::shared_ptr<Backend> mBackend;
    const Kind mKind;

    mutable std::mutex mMutex;
    std::map<std::uint64_t, std::uint64_t> mInUse;                   ///< handle to bytes
    FreeBlocks mFree;                                                ///< least recently freed first
    std::multimap<std::uint64_t, FreeBlocks::iterator> mFreeBySize;  ///< by bytes; the latest freed last
    std::list<WaitingBlock> mWaiting;
    std::uint64_t mUnmarkedBytes = 0;
    std::size_t mUnmarkedBlocks = 0;
    MemoryFigures mFigures;
    MemoryStatistics mStatistics;
    boost::function<bool(std::uint64_t)> mRefuse;

    LruFrameCache mCache;
};

}  // namespace Kiln
