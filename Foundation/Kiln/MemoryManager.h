// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include <boost/function.hpp>
#include <boost/shared_ptr.hpp>

#include "Kiln/DeviceCommands.h"
#include "Kiln/FrameCache.h"

namespace Kiln {

/// Bytes of one kind of memory, at one moment.
struct MemoryFigures {
    std::uint64_t bytesInUse = 0;   ///< handed out and not given back
    std::uint64_t bytesPooled = 0;  ///< held for reuse, handed to nobody
    std::uint64_t gentleLimit = 0;  ///< above it, frames that can be made again should go
    std::uint64_t hardLimit = 0;    ///< above it, allocations are refused
};

/// What happened since ResetStatistics.
struct MemoryStatistics {
    std::uint64_t peakBytesInUse = 0;
    std::uint64_t allocations = 0;
    std::uint64_t poolHits = 0;
    std::uint64_t refusals = 0;
};

/// A pool of one kind of memory: a device's own, or host memory that the device can read fast. Blocks given back are
/// kept for reuse until ReleaseUnused, or until an allocation needs their room. All of it from any thread.
class MemoryManager {
public:
    virtual ~MemoryManager() = default;

    /// A block of at least `bytes`, aligned to 256: a device value, or an address for host memory. 0 when refused; a
    /// refusal comes only after the pool and then the cache's least recently used frames have been given up.
    [[nodiscard]] virtual std::uint64_t Allocate(std::uint64_t bytes) = 0;
    /// Gives a block back to the pool. Work already queued on the device may still use it: reuse is ordered behind it.
    virtual void Free(std::uint64_t block) = 0;
    /// As above, for a caller who knows the last work that uses the block: `lastUse` is a mark behind that work. An
    /// empty mark stands for all that is queued.
    virtual void Free(std::uint64_t block, const TimingMarkRef& lastUse) = 0;
    /// Was the block that this address lies in handed out by this manager, and not given back?
    [[nodiscard]] virtual bool Owns(std::uint64_t address) const = 0;

    [[nodiscard]] virtual MemoryFigures GetFigures() const = 0;
    [[nodiscard]] virtual MemoryStatistics GetStatistics() const = 0;
    virtual void ResetStatistics() = 0;

    /// Gives pooled memory back to the system, up to `bytes` of it (all bits set: all). Returns the bytes given back.
    virtual std::uint64_t ReleaseUnused(std::uint64_t bytes) = 0;

    /// The cache of frames that live in this memory.
    [[nodiscard]] virtual FrameCache& GetFrameCache() = 0;

    /// For tests of refusals: asked with the bytes of each allocation, and true refuses it at once, whatever room there
    /// is. An empty function, the default, refuses nothing. Called without a lock, possibly on several threads.
    virtual void SetAllocationFilter(boost::function<bool(std::uint64_t bytes)> refuse) = 0;
};

}  // namespace Kiln
