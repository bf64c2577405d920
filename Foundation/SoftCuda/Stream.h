// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <deque>
#include <functional>
#include <memory>
#include <mutex>
#include <thread>
#include <utility>
#include <vector>

#include "SoftCuda/Chain.h"

namespace SoftCuda {

class Stream;

/// A moment of a stream: all that was queued up to a ticket.
struct StreamPoint {
    std::shared_ptr<Stream> stream;
    std::uint64_t ticket = 0;
};

/// Work that runs in order on a thread of the stream's own. Pointwise launches are held back for a moment, to be run
/// together with those that follow; anything else, a wait or the moment's end lets them go. Two things may come between
/// them: a small copy that has nothing to do with them (a record for a later launch) goes first, and a stamp gets its
/// share of the time that the launches take together.
///
/// May be called from any thread. Under its lock only that of the memory is taken; work runs without it, but for small
/// copies.
class Stream {
public:
    using Clock = std::chrono::steady_clock;
    using Stamp = std::shared_ptr<Clock::time_point>;

    struct SmallCopy {
        std::uintptr_t target = 0;
        std::uintptr_t source = 0;
        std::size_t bytes = 0;
        std::shared_ptr<void> holder;  ///< of the source, where it is the stream's own
    };
    /// Copies up to so many bytes count as small.
    static constexpr std::size_t kSmallBytes = std::size_t{64} << 10;

    Stream();
    ~Stream();
    Stream(const Stream&) = delete;
    Stream& operator=(const Stream&) = delete;

    /// Queues a function to run after `after` have been reached. Returns its ticket.
    std::uint64_t Submit(std::function<void()> work, std::vector<StreamPoint> after = {});
    std::uint64_t Submit(const Launch& launch, std::vector<StreamPoint> after = {});
    std::uint64_t Submit(SmallCopy copy, std::vector<StreamPoint> after = {});
    /// Queues the writing of the time.
    std::uint64_t Submit(Stamp stamp, std::vector<StreamPoint> after = {});

    [[nodiscard]] bool IsReached(std::uint64_t ticket) const { return mDone.load() >= ticket; }
    /// Waits until the work of a ticket, and all before it, is done.
    void Wait(std::uint64_t ticket);
    /// The last ticket given out.
    [[nodiscard]] std::uint64_t GetLast() const { return mLast.load(); }
    [[nodiscard]] bool IsIdle() const { return IsReached(GetLast()); }

    static void SetFusing(bool on) { sFusing.store(on); }

private:
    /// One of the four.
    struct Item {
        std::function<void()> work;
        std::unique_ptr<Launch> launch;
        std::unique_ptr<SmallCopy> copy;
        Stamp stamp;
        std::vector<StreamPoint> after;

        [[nodiscard]] bool IsPointwise() const { return launch && launch->IsPointwise(); }
    };

    std::uint64_t Push(Item item);
    void Work();
    bool Pop(Item& item);
    bool WaitForNext(std::unique_lock<std::mutex>& lock);
    bool ExtendChain();
    bool TakeIntoChain(Item& item);
    void RunChain();
    std::uint64_t RunItem(Item& item);
    void Finish(std::uint64_t count);

    mutable std::mutex mMutex;
    std::condition_variable mWake;
    std::condition_variable mReached;
    std::deque<Item> mItems;
    std::atomic<std::uint64_t> mLast{0};
    std::atomic<std::uint64_t> mDone{0};
    int mWaiting = 0;
    bool mStop = false;

    // The stream's thread alone.
    Chain mChain;
    std::uint64_t mChainItems = 0;
    std::vector<std::pair<std::size_t, Stamp>> mChainStamps;  ///< and behind how many launches each comes
    std::thread mThread;

    static std::atomic<bool> sFusing;
};

}  // namespace SoftCuda
