// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/PendingHostMemoryCopyManager.h"

#include <algorithm>

namespace Vantrel {

namespace {

PendingHostMemoryCopyManager gInstance;  // NOLINT(cert-err58-cpp): without its lock the library can't be loaded

}  // namespace

PendingHostMemoryCopyManager& PendingHostMemoryCopyManager::Instance() { return gInstance; }

bool PendingHostMemoryCopyManager::GetOrClaim(const Kiln::DeviceRef& device, const Guid& hash, bool blocking,
                                              const RenderResultsRef& results, VideoFrameRef& frame) {
    frame.Reset();
    if (!blocking && results->HasFailed()) return true;

    frame = results->FindFrame(hash);
    if (frame) return true;
    if (blocking && ExecuteCopyImmediateIfNotStarted(hash, results)) {
        frame = results->FindFrame(hash);
        return true;
    }

    boost::unique_lock<boost::mutex> lock(mStateMutex);
    // A copy may have ended since the first look.
    frame = results->FindFrame(hash);
    if (frame) return true;
    frame = device->GetHostMemory()->GetFrameCache().FindFrame(hash);
    if (frame) {
        results->StoreFrame(hash, frame);
        return true;
    }

    results->BeginAsyncPiece();
    Waiters& waiters = mWaiters[hash];
    waiters.push_back(results);
    if (waiters.size() == 1) return false;

    if (blocking) {
        const auto waited = mWaitedHashes.insert(hash);
        while (mWaiters.count(hash) != 0) mStateChanged.wait(lock);
        frame = results->FindFrame(hash);
        mWaitedHashes.erase(waited);
    }
    return true;
}

void PendingHostMemoryCopyManager::QueueCopy(const boost::shared_ptr<Halden::threads::AsyncExecutor>& executor,
                                             const Guid& hash, Copy copy) {
    {
        Ostrand::ScopedLock lock(mQueueLock, "PendingHostMemoryCopyManager::QueueCopy");
        mQueue.emplace_back(hash, std::move(copy));
    }
    executor->Post([this] { ExecuteThreadCopy(); }, 0);
}

void PendingHostMemoryCopyManager::Complete(const Kiln::DeviceRef& device, const Guid& hash,
                                            const VideoFrameRef& frame) {
    if (frame) device->GetHostMemory()->GetFrameCache().CacheFrame(hash, frame);

    boost::unique_lock<boost::mutex> lock(mStateMutex);
    const auto entry = mWaiters.find(hash);
    if (entry != mWaiters.end()) {
        for (const RenderResultsRef& waiter : entry->second) {
            // A store keeps the first entry under a fingerprint: an empty one would shut out the frame of a later copy
            // that another request begins and this one waits for.
            if (frame) waiter->StoreFrame(hash, frame);
            waiter->EndAsyncPiece();
        }
        mWaiters.erase(entry);
    }
    WakeBlockedCallers(hash);
}

bool PendingHostMemoryCopyManager::ExecuteCopyImmediateIfNotStarted(const Guid& hash, const RenderResultsRef& results) {
    Copy copy;
    {
        Ostrand::ScopedLock lock(mQueueLock, "PendingHostMemoryCopyManager::ExecuteCopyImmediateIfNotStarted");
        const auto queued =
            std::find_if(mQueue.begin(), mQueue.end(), [&hash](const auto& entry) { return entry.first == hash; });
        if (queued == mQueue.end()) return false;
        copy = std::move(queued->second);
        mQueue.erase(queued);
    }
    {
        boost::unique_lock<boost::mutex> lock(mStateMutex);
        Waiters& waiters = mWaiters[hash];
        if (std::find(waiters.begin(), waiters.end(), results) == waiters.end()) {
            results->BeginAsyncPiece();
            waiters.push_back(results);
        }
    }
    copy();
    return true;
}

void PendingHostMemoryCopyManager::ExecuteThreadCopy() {
    for (;;) {
        std::pair<Guid, Copy> entry;
        {
            Ostrand::ScopedLock lock(mQueueLock, "PendingHostMemoryCopyManager::ExecuteThreadCopy");
            if (mQueue.empty()) return;
            entry = std::move(mQueue.front());
            mQueue.pop_front();
        }
        if (entry.first.IsNil() || !IsStillWanted(entry.first)) continue;
        entry.second();
        return;
    }
}

bool PendingHostMemoryCopyManager::IsStillWanted(const Guid& hash) {
    boost::unique_lock<boost::mutex> lock(mStateMutex);
    const auto entry = mWaiters.find(hash);
    if (entry == mWaiters.end()) return false;
    const auto wants = [](const RenderResultsRef& waiter) { return !waiter->HasFailed(); };
    if (std::any_of(entry->second.begin(), entry->second.end(), wants)) return true;

    // The requests have failed, but their hosts still wait for the pieces that were counted.
    for (const RenderResultsRef& waiter : entry->second) waiter->EndAsyncPiece();
    mWaiters.erase(entry);
    WakeBlockedCallers(hash);
    return false;
}

void PendingHostMemoryCopyManager::WakeBlockedCallers(const Guid& hash) {
    if (mWaitedHashes.count(hash) != 0) mStateChanged.notify_all();
}

}  // namespace Vantrel
