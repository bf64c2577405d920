// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <list>
#include <map>
#include <mutex>

#include "Kiln/FrameCache.h"

namespace Kiln {

/// Frames are let go of outside the lock: the last holder of a frame goes back to the memory manager.
class LruFrameCache final : public FrameCache {
public:
    void CacheFrame(const Halden::utility::Guid& hash, const Marl::VideoFrameRef& frame) override;
    Marl::VideoFrameRef FindFrame(const Halden::utility::Guid& hash) override;
    std::uint64_t Purge(std::uint64_t bytes) override;
    std::uint64_t GetBytes() const override;

    /// Sets the bound in bytes and lets go of what exceeds it.
    void SetBound(std::uint64_t bytes);
    /// Empties the cache and keeps nothing from now on: frames hold their device, which holds the cache.
    void Close();

private:
    struct Entry {
        Halden::utility::Guid hash;
        Marl::VideoFrameRef frame;
        std::uint64_t bytes;
    };
    using Entries = std::list<Entry>;

    /// Moves the least recently used entries to `gone` until at most `bytes` are left.
    void Shrink(std::uint64_t bytes, Entries& gone);
    void Remove(Entries::iterator entry, Entries& gone);

    mutable std::mutex mMutex;
    Entries mEntries;  ///< most recently used first
    std::map<Halden::utility::Guid, Entries::iterator> mIndex;
    std::uint64_t mBytes = 0;
    std::uint64_t mBound = 0;
    bool mClosed = false;
};

}  // namespace Kiln
