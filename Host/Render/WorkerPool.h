// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <condition_variable>
#include <cstdint>
#include <functional>
#include <map>
#include <mutex>
#include <thread>
#include <tuple>
#include <vector>

namespace Vantrel::Host {

/// The host's threads for renders. Jobs of the earliest time go first, those of one time in the order given. Thread
/// safe.
class WorkerPool {
public:
    /// Runs exactly once, with no lock held; `cancelled` tells that nobody wants the result any more.
    using Job = std::function<void(bool cancelled)>;

    explicit WorkerPool(unsigned threads);
    /// Runs what is still queued as cancelled, and waits for what is running.
    ~WorkerPool();
    WorkerPool(const WorkerPool&) = delete;
    WorkerPool& operator=(const WorkerPool&) = delete;

    /// Returns the job's id, never 0. May be called from within a job.
    std::uint32_t Submit(std::int64_t time, Job job);
    /// A job that hasn't begun will run as cancelled; a running one isn't disturbed. Unknown ids are none.
    void Cancel(std::uint32_t id);
    /// Waits until nothing is queued or running.
    void Drain();

    /// Processors less two, but at least two: the render thread and the device want theirs.
    [[nodiscard]] static unsigned GetDefaultThreads();

private:
    struct Key {
        std::int64_t time;
        std::uint64_t order;
        friend bool operator<(const Key& a, const Key& b) {
            return std::tie(a.time, a.order) < std::tie(b.time, b.order);
        }
    };
    struct Entry {
        std::uint32_t id;
        Job job;
        bool cancelled = false;
    };

    void Work();

    std::mutex mMutex;
    std::condition_variable mWork;
    std::condition_variable mIdle;
    std::map<Key, Entry> mQueue;
    std::map<std::uint32_t, Key> mKeys;  ///< of queued jobs
    std::uint64_t mOrder = 0;
    std::uint32_t mNextID = 1;
    std::size_t mRunning = 0;
    bool mStopping = false;
    std::vector<std::thread> mThreads;
};

}  // namespace Vantrel::Host
