// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/LruFrameCache.h"

#include <algorithm>
#include <limits>

namespace Kiln {
namespace {

std::uint64_t GetFrameBytes(const Marl::VideoFrameRef& frame) {
    const auto rows = Ostrand::Query<Marl::IFrameRows>(frame);
    if (!rows) return std::numeric_limits<std::uint64_t>::max();
    return static_cast<std::uint64_t>(rows->GetRowBytes()) * static_cast<std::uint64_t>(frame->GetBounds().Height());
}

}  // namespace

void LruFrameCache::CacheFrame(const Halden::utility::Guid& hash, const Marl::VideoFrameRef& frame) {
    if (!frame) return;
    const std::uint64_t bytes = GetFrameBytes(frame);
    Entries gone;
    const std::lock_guard<std::mutex> lock(mMutex);
    if (const auto found = mIndex.find(hash); found != mIndex.end()) Remove(found->second, gone);
    if (mClosed || bytes > mBound) return;
    Shrink(mBound - bytes, gone);
    mEntries.push_front({hash, frame, bytes});
    mIndex[hash] = mEntries.begin();
    mBytes += bytes;
}

Marl::VideoFrameRef LruFrameCache::FindFrame(const Halden::utility::Guid& hash) {
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto found = mIndex.find(hash);
    if (found == mIndex.end()) return {};
    mEntries.splice(mEntries.begin(), mEntries, found->second);
    return found->second->frame;
}

std::uint64_t LruFrameCache::Purge(std::uint64_t bytes) {
    Entries gone;
    const std::lock_guard<std::mutex> lock(mMutex);
    const std::uint64_t before = mBytes;
    Shrink(mBytes - std::min(mBytes, bytes), gone);
    return before - mBytes;
}

std::uint64_t LruFrameCache::GetBytes() const {
    const std::lock_guard<std::mutex> lock(mMutex);
    return mBytes;
}

void LruFrameCache::SetBound(std::uint64_t bytes) {
    Entries gone;
    const std::lock_guard<std::mutex> lock(mMutex);
    mBound = bytes;
    Shrink(mBound, gone);
}

void LruFrameCache::Close() {
    Entries gone;
    const std::lock_guard<std::mutex> lock(mMutex);
    mClosed = true;
    Shrink(0, gone);
}

void LruFrameCache::Shrink(std::uint64_t bytes, Entries& gone) {
    while (mBytes > bytes) Remove(std::prev(mEntries.end()), gone);
}

void LruFrameCache::Remove(Entries::iterator entry, Entries& gone) {
    mBytes -= entry->bytes;
    mIndex.erase(entry->hash);
    gone.splice(gone.end(), mEntries, entry);
}

}  // namespace Kiln
