// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Render/WorkerPool.h"

#include <algorithm>

namespace Vantrel::Host {

unsigned WorkerPool::GetDefaultThreads() {
    const unsigned processors = std::thread::hardware_concurrency();
    return std::max(2U, processors > 2 ? processors - 2 : 0U);
}

WorkerPool::WorkerPool(unsigned threads) {
    for (unsigned i = 0; i < threads; ++i) mThreads.emplace_back([this] { Work(); });
}

WorkerPool::~WorkerPool() {
    {
        const std::lock_guard<std::mutex> hold(mMutex);
        mStopping = true;
        for (auto& [key, entry] : mQueue) entry.cancelled = true;
    }
    mWork.notify_all();
    for (std::thread& thread : mThreads) thread.join();
}

std::uint32_t WorkerPool::Submit(std::int64_t time, Job job) {
    std::uint32_t id = 0;
    {
        const std::lock_guard<std::mutex> hold(mMutex);
        id = mNextID++;
        if (mNextID == 0) mNextID = 1;
        const Key key{time, mOrder++};
        mQueue.emplace(key, Entry{id, std::move(job), mStopping});
        mKeys.emplace(id, key);
    }
    mWork.notify_one();
    return id;
}

void WorkerPool::Cancel(std::uint32_t id) {
    const std::lock_guard<std::mutex> hold(mMutex);
    const auto key = mKeys.find(id);
    if (key != mKeys.end()) mQueue.find(key->second)->second.cancelled = true;
}

void WorkerPool::Drain() {
    std::unique_lock<std::mutex> lock(mMutex);
    mIdle.wait(lock, [this] { return mQueue.empty() && mRunning == 0; });
}

void WorkerPool::Work() {
    std::unique_lock<std::mutex> lock(mMutex);
    for (;;) {
        mWork.wait(lock, [this] { return mStopping || !mQueue.empty(); });
        if (mQueue.empty()) return;
        const auto first = mQueue.begin();
        Entry entry = std::move(first->second);
        mKeys.erase(entry.id);
        mQueue.erase(first);
        ++mRunning;
        lock.unlock();
        entry.job(entry.cancelled);
        // What the job holds goes before the pool counts as idle: a drain means that nothing is held any more.
        entry.job = nullptr;
        lock.lock();
        --mRunning;
        if (mQueue.empty() && mRunning == 0) mIdle.notify_all();
    }
}

}  // namespace Vantrel::Host
