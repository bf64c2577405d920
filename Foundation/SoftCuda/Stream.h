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
/// together with those that follow; anything else, a wait or the moment's end lets them go.
///
/// May be called from any thread. Its lock is taken alone; work runs without it.
class Stream {
public:
    Stream();
    ~Stream();
    Stream(const Stream&) = delete;
    Stream& operator=(const Stream&) = delete;

    /// Queues a function to run after `after` have been reached. Returns its ticket.
    std::uint64_t Submit(std::function<void()> work, std::vector<StreamPoint> after = {});
    std::uint64_t Submit(const Launch& launch, std::vector<StreamPoint> after = {});

    [[nodiscard]] bool IsReached(std::uint64_t ticket) const { return mDone.load() >= ticket; }
    /// Waits until the work of a ticket, and all before it, is done.
    void Wait(std::uint64_t ticket);
    /// The last ticket given out.
    [[nodiscard]] std::uint64_t GetLast() const { return mLast.load(); }
    [[nodiscard]] bool IsIdle() const { return IsReached(GetLast()); }

    static void SetFusing(bool on) { sFusing.store(on); }

private:
    using Clock = std::chrono::steady_clock;

    struct Item {
        std::function<void()> work;
        std::unique_ptr<Launch> launch;
        std::vector<StreamPoint> after;

        [[nodiscard]] bool IsPointwise() const { return launch && launch->IsPointwise(); }
    };

    std::uint64_t Push(Item item);
    void Work();
    bool Pop(Item& item);
    bool ExtendChain();
    std::uint64_t RunItem(const Item& item);
    void Finish(std::uint64_t count);

    mutable std::mutex mMutex;
    std::condition_variable mWake;
    std::condition_variable mReached;
    std::deque<Item> mItems;
    std::atomic<std::uint64_t> mLast{0};
    std::atomic<std::uint64_t> mDone{0};
    int mWaiting = 0;
    bool mStop = false;
    Chain mChain;
    std::thread mThread;

    static std::atomic<bool> sFusing;
};

}  // namespace SoftCuda
