// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Halden/Executor.h"

#include <algorithm>
#include <condition_variable>
#include <deque>
#include <future>
#include <list>
#include <memory>
#include <mutex>
#include <thread>
#include <utility>
#include <vector>

#include <pthread.h>
#include <boost/make_shared.hpp>

namespace Halden::threads {

namespace {

using Work = boost::function<void()>;

/// Runs a queue's first piece of work outside of the lock that guards the queue.
void RunFirstOf(std::deque<Work>& queue, std::unique_lock<std::mutex>& lock) {
    Work work = std::move(queue.front());
    queue.pop_front();
    lock.unlock();
    work();
    // What the work holds may end here, the last executor of its queue included; hence outside the lock as well.
    work.clear();
    lock.lock();
}

/// A queue of work and the loop that its threads run. Once closed, the loop ends when the queue is empty.
class WorkLoop {
public:
    /// `threadCount` threads are going to call Run.
    explicit WorkLoop(std::size_t threadCount) : mThreadsInside(threadCount) {}

    /// False, with `work` dropped, when no thread is left to run it.
    bool Post(Work work) {
        {
            const std::lock_guard<std::mutex> lock(mMutex);
            if (mThreadsInside == 0) return false;
            mQueue.push_back(std::move(work));
        }
        mWake.notify_one();
        return true;
    }

    void Close() {
        {
            const std::lock_guard<std::mutex> lock(mMutex);
            mClosed = true;
        }
        mWake.notify_all();
    }

    void Run() {
        std::unique_lock<std::mutex> lock(mMutex);
        for (;;) {
            mWake.wait(lock, [this] { return mClosed || !mQueue.empty(); });
            if (mQueue.empty()) break;
            ++mBusyThreads;
            RunFirstOf(mQueue, lock);
            if (--mBusyThreads == 0 && mQueue.empty()) mIdle.notify_all();
        }
        --mThreadsInside;
    }

    void WaitUntilIdle() {
        std::unique_lock<std::mutex> lock(mMutex);
        mIdle.wait(lock, [this] { return mBusyThreads == 0 && mQueue.empty(); });
    }

    [[nodiscard]] bool HasEnded() const {
        const std::lock_guard<std::mutex> lock(mMutex);
        return mThreadsInside == 0;
    }

private:
    mutable std::mutex mMutex;
    std::condition_variable mWake;
    std::condition_variable mIdle;
    std::deque<Work> mQueue;
    std::size_t mThreadsInside;
    std::size_t mBusyThreads = 0;
    bool mClosed = false;
};

/// Owns every thread of every loop. An executor can't join its own thread, for its last reference may go on that very
/// thread; so threads are joined here: when a later loop starts, or at the end of the process, by which time all work
/// posted has run.
class ThreadKeeper {
public:
    static ThreadKeeper& Instance() {
        static ThreadKeeper instance;
        return instance;
    }

    ThreadKeeper() = default;
    ThreadKeeper(const ThreadKeeper&) = delete;
    ThreadKeeper& operator=(const ThreadKeeper&) = delete;
    ~ThreadKeeper() {
        // One by one and outside the lock, for the work that still runs may start further loops.
        std::unique_lock<std::mutex> lock(mMutex);
        while (!mCrews.empty()) {
            std::list<Crew> ending;
            ending.splice(ending.begin(), mCrews, mCrews.begin());
            lock.unlock();
            ending.clear();
            lock.lock();
        }
    }

    std::shared_ptr<WorkLoop> StartLoop(const std::string& name, std::size_t threadCount) {
        const std::lock_guard<std::mutex> lock(mMutex);
        mCrews.remove_if([](const Crew& crew) { return crew.loop->HasEnded(); });
        auto loop = std::make_shared<WorkLoop>(threadCount);
        Crew& crew = mCrews.emplace_back(loop);
        for (std::size_t i = 0; i < threadCount; ++i) {
            crew.threads.emplace_back([loop, shownName = name.substr(0, 15)] {
                pthread_setname_np(pthread_self(), shownName.c_str());
                loop->Run();
            });
        }
        return loop;
    }

    /// The loop that all processor-bound executors share, started by the first of them.
    std::shared_ptr<WorkLoop> GetSharedLoop() {
        std::call_once(mSharedLoopOnce, [this] {
            mSharedLoop = StartLoop("cpu-bound", std::max(2U, std::thread::hardware_concurrency()));
        });
        return mSharedLoop;
    }

private:
    struct Crew {
        explicit Crew(std::shared_ptr<WorkLoop> crewLoop) : loop(std::move(crewLoop)) {}
        Crew(const Crew&) = delete;
        Crew& operator=(const Crew&) = delete;
        ~Crew() {
            loop->Close();
            for (std::thread& thread : threads) {
                // Work that ends the process runs this destructor on its own thread.
                if (thread.get_id() == std::this_thread::get_id()) {
                    thread.detach();
                } else {
                    thread.join();
                }
            }
        }

        std::shared_ptr<WorkLoop> loop;
        std::vector<std::thread> threads;
    };

    std::mutex mMutex;
    std::list<Crew> mCrews;
    std::once_flag mSharedLoopOnce;
    std::shared_ptr<WorkLoop> mSharedLoop;
};

/// Waits until a marker posted behind everything else is reached or dropped.
void WaitForMarker(AsyncExecutor& executor) {
    auto reached = std::make_shared<std::promise<void>>();
    const std::future<void> done = reached->get_future();
    executor.Post([marker = std::move(reached)] { marker->set_value(); }, 0);
    done.wait();
}

class ThreadExecutor final : public AsyncExecutor {
public:
    explicit ThreadExecutor(const std::string& threadName) : mLoop(ThreadKeeper::Instance().StartLoop(threadName, 1)) {}
    ThreadExecutor(const ThreadExecutor&) = delete;
    ThreadExecutor& operator=(const ThreadExecutor&) = delete;
    ~ThreadExecutor() override { mLoop->Close(); }

    void Post(Work work, std::uint32_t /*flags*/) override { mLoop->Post(std::move(work)); }
    void Drain() override { WaitForMarker(*this); }

private:
    std::shared_ptr<WorkLoop> mLoop;
};

/// Work in order over a shared loop: at most one piece of it is in the loop at any time. The piece in the loop holds
/// the queue, which thereby outlives its executor until it has run dry.
class SerialQueue : public std::enable_shared_from_this<SerialQueue> {
public:
    explicit SerialQueue(std::shared_ptr<WorkLoop> loop) : mLoop(std::move(loop)) {}

    void Post(Work work) {
        {
            const std::lock_guard<std::mutex> lock(mMutex);
            mQueue.push_back(std::move(work));
            if (std::exchange(mInLoop, true)) return;
        }
        EnterLoop();
    }

private:
    // One piece at a time, then back to the end of the loop's queue: no executor starves the others.
    void EnterLoop() {
        if (mLoop->Post([self = shared_from_this()] { self->RunFirst(); })) return;
        std::deque<Work> dropped;
        const std::lock_guard<std::mutex> lock(mMutex);
        dropped.swap(mQueue);
        mInLoop = false;
    }

    void RunFirst() {
        std::unique_lock<std::mutex> lock(mMutex);
        RunFirstOf(mQueue, lock);
        mInLoop = !mQueue.empty();
        if (!mInLoop) return;
        lock.unlock();
        EnterLoop();
    }

    std::shared_ptr<WorkLoop> mLoop;
    std::mutex mMutex;
    std::deque<Work> mQueue;
    bool mInLoop = false;
};

class CPUBoundExecutor final : public AsyncExecutor {
public:
    CPUBoundExecutor() : mQueue(std::make_shared<SerialQueue>(ThreadKeeper::Instance().GetSharedLoop())) {}

    void Post(Work work, std::uint32_t /*flags*/) override { mQueue->Post(std::move(work)); }
    void Drain() override { WaitForMarker(*this); }

private:
    std::shared_ptr<SerialQueue> mQueue;
};

}  // namespace

boost::shared_ptr<AsyncExecutor> CreateThreadExecutor(const std::string& threadName) {
    return boost::make_shared<ThreadExecutor>(threadName);
}

boost::shared_ptr<AsyncExecutor> CreateCPUBoundExecutor() { return boost::make_shared<CPUBoundExecutor>(); }

void DrainCPUBoundExecutors() { ThreadKeeper::Instance().GetSharedLoop()->WaitUntilIdle(); }

}  // namespace Halden::threads
