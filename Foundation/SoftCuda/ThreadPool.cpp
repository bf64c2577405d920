// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "SoftCuda/ThreadPool.h"

#include <algorithm>

#include "SoftCuda/Settings.h"

namespace SoftCuda {

namespace {
// Jobs follow each other closely while a frame renders: a helper that looks out for the next one a little while saves
// the wake-up, which costs more than a small job.
constexpr int kSpins = 400;
}  // namespace

ThreadPool::ThreadPool(int threads) : mLimit(threads) {
    for (int i = 1; i < threads; ++i) mThreads.emplace_back([this, i] { Work(i); });
}

ThreadPool::~ThreadPool() {
    {
        const std::lock_guard<std::mutex> lock(mMutex);
        mStop = true;
        mGeneration.fetch_add(1);
    }
    mWake.notify_all();
    for (std::thread& thread : mThreads) thread.join();
}

int ThreadPool::GetLimit() const {
    return std::clamp(mLimit.load(std::memory_order_relaxed), 1, static_cast<int>(mThreads.size()) + 1);
}

void ThreadPool::TakeParts() {
    for (int part = mNext.fetch_add(1); part < mCount; part = mNext.fetch_add(1)) mPart(mContext, part);
}

void ThreadPool::RunParts(int count, Part part, const void* context) {
    const int helpers = std::min(GetLimit(), count) - 1;
    if (helpers <= 0) {
        for (int i = 0; i < count; ++i) part(context, i);
        return;
    }
    const std::lock_guard<std::mutex> job(mJobMutex);
    {
        const std::lock_guard<std::mutex> lock(mMutex);
        mPart = part;
        mContext = context;
        mCount = count;
        mHelpers = helpers;
        mNext.store(0);
        mOpen = true;
        mGeneration.fetch_add(1);
    }
    mWake.notify_all();
    TakeParts();
    // Helpers that haven't come by now aren't waited for: the parts are all taken.
    std::unique_lock<std::mutex> lock(mMutex);
    mOpen = false;
    mDone.wait(lock, [this] { return mActive == 0; });
}

void ThreadPool::Work(int index) {
    unsigned seen = 0;
    std::unique_lock<std::mutex> lock(mMutex);
    for (;;) {
        if (mGeneration.load() == seen) {
            lock.unlock();
            for (int spin = 0; spin < kSpins && mGeneration.load() == seen; ++spin) __builtin_ia32_pause();
            lock.lock();
        }
        mWake.wait(lock, [&] { return mGeneration.load() != seen; });
        seen = mGeneration.load();
        if (mStop) return;
        if (!mOpen || index > mHelpers) continue;
        ++mActive;
        lock.unlock();
        TakeParts();
        lock.lock();
        if (--mActive == 0) mDone.notify_one();
    }
}

ThreadPool& GetPool() {
    // Never destroyed: streams that the program leaves behind use it to the end.
    static ThreadPool& pool = *new ThreadPool(ReadSettings().threads);
    return pool;
}

}  // namespace SoftCuda
