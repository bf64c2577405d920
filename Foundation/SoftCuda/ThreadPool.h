// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <condition_variable>
#include <mutex>
#include <thread>
#include <type_traits>
#include <vector>

namespace SoftCuda {

/// Threads that share out the parts of one job at a time; the caller is one of them. Asleep when there is no job.
class ThreadPool {
public:
    explicit ThreadPool(int threads);
    ~ThreadPool();
    ThreadPool(const ThreadPool&) = delete;
    ThreadPool& operator=(const ThreadPool&) = delete;

    /// Calls function(part) for each part from 0 to count - 1, on any thread and in any order; returns when all are
    /// done. Jobs of several callers run one after the other.
    template <class Function>
    void Run(int count, const Function& function) {
        RunParts(
            count, [](const void* context, int part) { (*static_cast<const Function*>(context))(part); }, &function);
    }

    /// How many threads may take part, the caller included.
    void SetLimit(int threads) { mLimit.store(threads, std::memory_order_relaxed); }
    [[nodiscard]] int GetLimit() const;

private:
    using Part = void (*)(const void* context, int part);

    void RunParts(int count, Part part, const void* context);
    void Work(int index);
    void TakeParts();

    std::vector<std::thread> mThreads;
    std::atomic<int> mLimit;

    /// Held by the caller for the whole of its job; taken before mMutex.
    std::mutex mJobMutex;
    std::mutex mMutex;
    std::condition_variable mWake;
    std::condition_variable mDone;
    std::atomic<unsigned> mGeneration{0};
    bool mStop = false;
    bool mOpen = false;  ///< helpers may still join the job
    int mActive = 0;     ///< helpers that have

    // The job; written under mMutex while no helper is active.
    Part mPart = nullptr;
    const void* mContext = nullptr;
    int mCount = 0;
    int mHelpers = 0;
    std::atomic<int> mNext{0};
};

/// The process's pool. Made at first use with as many threads as the settings say.
[[nodiscard]] ThreadPool& GetPool();

}  // namespace SoftCuda
