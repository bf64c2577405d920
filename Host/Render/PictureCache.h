// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <list>
#include <map>
#include <mutex>
#include <utility>

#include "Host/Media/HostPicture.h"

namespace Vantrel::Host {

/// Pictures by key, least recently used first to go, bounded in bytes. Thread safe.
template <class Key>
class PictureCache {
public:
    explicit PictureCache(std::size_t limitBytes) : mLimit(limitBytes) {}

    /// Null when absent. The picture thereby becomes the most recent one.
    [[nodiscard]] HostPictureRef Find(const Key& key) {
        const std::lock_guard<std::mutex> hold(mMutex);
        const auto found = mEntries.find(key);
        if (found == mEntries.end()) return nullptr;
        mOrder.splice(mOrder.begin(), mOrder, found->second);
        return found->second->second;
    }

    /// A picture larger than the whole cache isn't kept.
    void Store(const Key& key, HostPictureRef picture) {
        std::list<std::pair<Key, HostPictureRef>> dropped;  // goes after the lock
        const std::lock_guard<std::mutex> hold(mMutex);
        if (picture->GetBytes() > mLimit || mEntries.count(key) != 0) return;
        mBytes += picture->GetBytes();
        mOrder.emplace_front(key, std::move(picture));
        mEntries.emplace(key, mOrder.begin());
        while (mBytes > mLimit) {
            mBytes -= mOrder.back().second->GetBytes();
            mEntries.erase(mOrder.back().first);
            dropped.splice(dropped.end(), mOrder, std::prev(mOrder.end()));
        }
    }

    void Clear() {
        const std::lock_guard<std::mutex> hold(mMutex);
        mEntries.clear();
        mOrder.clear();
        mBytes = 0;
    }

    [[nodiscard]] std::size_t GetBytes() const {
        const std::lock_guard<std::mutex> hold(mMutex);
        return mBytes;
    }

private:
    using Order = std::list<std::pair<Key, HostPictureRef>>;

    const std::size_t mLimit;
    mutable std::mutex mMutex;
    Order mOrder;
    std::map<Key, typename Order::iterator> mEntries;
    std::size_t mBytes = 0;
};

}  // namespace Vantrel::Host
