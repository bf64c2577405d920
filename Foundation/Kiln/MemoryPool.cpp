// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/MemoryPool.h"

#include <algorithm>
#include <limits>
#include <utility>

namespace Kiln {
namespace {

constexpr std::uint64_t kAll = std::numeric_limits<std::uint64_t>::max();
constexpr std::uint64_t kAlignment = 256;

// A mark costs some microseconds and makes the device begin what it has put off, so one serves several blocks: so many,
// or so many bytes, may lie idle until then.
constexpr std::size_t kBlocksPerMark = 16;
constexpr std::uint64_t kBytesPerMark = 16U << 20;

// The size's class: a multiple of a sixteenth of the power of two below it.
std::uint64_t RoundToClass(std::uint64_t bytes) {
    std::uint64_t step = kAlignment;
    while (step <= bytes / 32) step *= 2;
    return bytes > kAll - step ? kAll - step : std::max(bytes + step - 1, step) / step * step;
}

std::uint64_t GentleShare(std::uint64_t limit) { return limit / 10 * 7; }

// Staged pictures are soon made again, and a film seldom asks for one twice: a large cache of them would let it run
// through fresh pages, which cost more than the copies into them, for minutes.
std::uint64_t CacheShare(MemoryPool::Kind kind, std::uint64_t limit) {
    return kind == MemoryPool::Kind::kDevice ? limit / 2 : limit / 64;
}

}  // namespace

MemoryPool::MemoryPool(std::shared_ptr<Backend> backend, Kind kind, std::uint64_t limit)
    : mBackend(std::move(backend)), mKind(kind) {
    SetLimit(limit);
}

MemoryPool::~MemoryPool() {
    mCache.Close();
    mBackend->Synchronize();
    std::vector<Block> blocks(mFree.begin(), mFree.end());
    for (const WaitingBlock& waiting : mWaiting) blocks.push_back(waiting.block);
    for (const auto& [handle, bytes] : mInUse) blocks.push_back({handle, bytes});
    ReturnToSystem(blocks);
}

std::uint64_t MemoryPool::Allocate(std::uint64_t bytes) {
    boost::function<bool(std::uint64_t)> refuse;
    {
        const std::lock_guard<std::mutex> lock(mMutex);
        refuse = mRefuse;
    }
    if (!refuse || !refuse(bytes)) {
        const std::uint64_t size = RoundToClass(bytes);
        do {
            if (const std::uint64_t block = TryAllocate(size)) return block;
        } while (GiveUpSomething(size));
    }
    const std::lock_guard<std::mutex> lock(mMutex);
    ++mStatistics.refusals;
    return 0;
}

std::uint64_t MemoryPool::TryAllocate(std::uint64_t bytes) {
    std::vector<Block> makingRoom;
    {
        const std::lock_guard<std::mutex> lock(mMutex);
        CollectReachedBlocks();
        if (const std::uint64_t block = TakePooled(bytes)) return block;
        const auto fits = [&] {
            const std::uint64_t taken = mFigures.bytesInUse + mFigures.bytesPooled;
            return bytes <= mFigures.hardLimit && taken <= mFigures.hardLimit - bytes;
        };
        while (!fits() && !mFree.empty()) makingRoom.push_back(RemovePooled(mFree.begin()));
        if (fits()) {
            // Counted before it is there, so that no other thread takes the room meanwhile.
            mFigures.bytesInUse += bytes;
        } else {
            bytes = 0;
        }
    }
    ReturnToSystem(makingRoom);
    if (bytes == 0) return 0;
    const std::uint64_t handle = AllocateFromSystem(bytes);
    const std::lock_guard<std::mutex> lock(mMutex);
    mFigures.bytesInUse -= bytes;
    if (handle != 0) HandOut({handle, bytes});
    return handle;
}

bool MemoryPool::GiveUpSomething(std::uint64_t bytes) {
    if (ReleaseUnused(kAll - 1) > 0 || AwaitMarks()) return true;
    // Within the limit it was the system that refused, and nobody knows how much it lacks.
    std::uint64_t missing = bytes;
    {
        const std::lock_guard<std::mutex> lock(mMutex);
        const std::uint64_t room = mFigures.hardLimit - std::min(mFigures.hardLimit, mFigures.bytesInUse);
        if (room < bytes) missing = bytes - room;
    }
    return mCache.Purge(missing) > 0;
}

void MemoryPool::Free(std::uint64_t block, const TimingMarkRef& lastUse) {
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto found = mInUse.find(block);
    if (found == mInUse.end()) return;
    const Block freed{found->first, found->second};
    mInUse.erase(found);
    mFigures.bytesInUse -= freed.bytes;
    mFigures.bytesPooled += freed.bytes;
    if (mKind == Kind::kDevice) {
        AddPooled(freed);
        return;
    }
    mWaiting.push_back({freed, lastUse});
    if (lastUse) return;
    ++mUnmarkedBlocks;
    mUnmarkedBytes += freed.bytes;
    if (mUnmarkedBlocks >= kBlocksPerMark || mUnmarkedBytes >= kBytesPerMark) MarkWaitingBlocks();
}

bool MemoryPool::Owns(std::uint64_t address) const {
    const std::lock_guard<std::mutex> lock(mMutex);
    auto next = mInUse.upper_bound(address);
    if (next == mInUse.begin()) return false;
    --next;
    return address - next->first < next->second;
}

MemoryFigures MemoryPool::GetFigures() const {
    const std::lock_guard<std::mutex> lock(mMutex);
    return mFigures;
}

MemoryStatistics MemoryPool::GetStatistics() const {
    const std::lock_guard<std::mutex> lock(mMutex);
    return mStatistics;
}

void MemoryPool::ResetStatistics() {
    const std::lock_guard<std::mutex> lock(mMutex);
    mStatistics = {};
    mStatistics.peakBytesInUse = mFigures.bytesInUse;
}

std::uint64_t MemoryPool::ReleaseUnused(std::uint64_t bytes) {
    if (bytes == kAll) AwaitMarks();
    std::vector<Block> released;
    std::uint64_t total = 0;
    {
        const std::lock_guard<std::mutex> lock(mMutex);
        CollectReachedBlocks();
        while (!mFree.empty() && mFree.front().bytes <= bytes - total) {
            released.push_back(RemovePooled(mFree.begin()));
            total += released.back().bytes;
        }
    }
    ReturnToSystem(released);
    return total;
}

void MemoryPool::SetAllocationFilter(boost::function<bool(std::uint64_t bytes)> refuse) {
    const std::lock_guard<std::mutex> lock(mMutex);
    mRefuse = std::move(refuse);
}

void MemoryPool::SetLimit(std::uint64_t bytes) {
    mCache.SetBound(CacheShare(mKind, bytes));
    std::vector<Block> released;
    {
        const std::lock_guard<std::mutex> lock(mMutex);
        mFigures.hardLimit = bytes;
        mFigures.gentleLimit = GentleShare(bytes);
        while (!mFree.empty() && mFigures.bytesInUse + mFigures.bytesPooled > bytes) {
            released.push_back(RemovePooled(mFree.begin()));
        }
    }
    ReturnToSystem(released);
}

std::uint64_t MemoryPool::TakePooled(std::uint64_t bytes) {
    // The latest freed block of exactly this size is the likeliest to be in the processor's cache still; one that is
    // somewhat larger beats a new one.
    const auto exactEnd = mFreeBySize.upper_bound(bytes);
    auto found = mFreeBySize.lower_bound(bytes);
    if (found == mFreeBySize.end() || found->first > bytes + bytes / 8) return 0;
    if (found != exactEnd) found = std::prev(exactEnd);
    const Block block = RemovePooled(found->second);
    ++mStatistics.poolHits;
    HandOut(block);
    return block.handle;
}

void MemoryPool::AddPooled(const Block& block) {
    mFree.push_back(block);
    mFreeBySize.emplace(block.bytes, std::prev(mFree.end()));
}

MemoryPool::Block MemoryPool::RemovePooled(FreeBlocks::iterator block) {
    auto [entry, end] = mFreeBySize.equal_range(block->bytes);
    while (entry != end && entry->second != block) ++entry;
    mFreeBySize.erase(entry);
    const Block removed = *block;
    mFree.erase(block);
    mFigures.bytesPooled -= removed.bytes;
    return removed;
}

void MemoryPool::HandOut(const Block& block) {
    mInUse[block.handle] = block.bytes;
    mFigures.bytesInUse += block.bytes;
    ++mStatistics.allocations;
    mStatistics.peakBytesInUse = std::max(mStatistics.peakBytesInUse, mFigures.bytesInUse);
}

void MemoryPool::MarkWaitingBlocks() {
    const TimingMarkRef mark = mBackend->RecordMark();
    if (!mark) return;
    for (WaitingBlock& waiting : mWaiting) {
        if (!waiting.lastUse) waiting.lastUse = mark;
    }
    mUnmarkedBlocks = 0;
    mUnmarkedBytes = 0;
}

void MemoryPool::CollectReachedBlocks() {
    // Blocks wait in the queue's order but for those with marks of their own, so the first that isn't reached ends it.
    while (!mWaiting.empty() && mWaiting.front().lastUse && mWaiting.front().lastUse->IsReached()) {
        AddPooled(mWaiting.front().block);
        mWaiting.pop_front();
    }
}

bool MemoryPool::AwaitMarks() {
    TimingMarkRef last;
    std::size_t count = 0;
    {
        const std::lock_guard<std::mutex> lock(mMutex);
        if (mWaiting.empty()) return false;
        MarkWaitingBlocks();
        last = mBackend->RecordMark();
        count = mWaiting.size();
    }
    if (!last) return false;
    last->Wait();
    const std::lock_guard<std::mutex> lock(mMutex);
    CollectReachedBlocks();
    return mWaiting.size() < count;
}

void MemoryPool::ReturnToSystem(const std::vector<Block>& blocks) {
    for (const Block& block : blocks) {
        if (mKind == Kind::kDevice) {
            mBackend->FreeDevice(block.handle);
        } else {
            mBackend->FreeHost(reinterpret_cast<void*>(block.handle));
        }
    }
}

std::uint64_t MemoryPool::AllocateFromSystem(std::uint64_t bytes) {
    if (mKind == Kind::kDevice) return mBackend->AllocateDevice(bytes);
    return reinterpret_cast<std::uint64_t>(mBackend->AllocateHost(bytes));
}

}  // namespace Kiln
