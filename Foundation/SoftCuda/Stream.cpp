// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "SoftCuda/Stream.h"

#include <utility>

#include "SoftCuda/Settings.h"

namespace SoftCuda {

namespace {
// How long a pointwise launch waits for the next one: above what a node takes from launch to launch, and far below what
// the launch itself takes.
constexpr std::chrono::microseconds kHold{80};
}  // namespace

std::atomic<bool> Stream::sFusing{true};

Stream::Stream() : mThread([this] { Work(); }) {}

Stream::~Stream() {
    {
        const std::lock_guard<std::mutex> lock(mMutex);
        mStop = true;
    }
    mWake.notify_all();
    mThread.join();
}

std::uint64_t Stream::Push(Item item) {
    std::uint64_t ticket = 0;
    {
        const std::lock_guard<std::mutex> lock(mMutex);
        mItems.push_back(std::move(item));
        ticket = ++mLast;
    }
    mWake.notify_one();
    return ticket;
}

std::uint64_t Stream::Submit(std::function<void()> work, std::vector<StreamPoint> after) {
    return Push({std::move(work), nullptr, std::move(after)});
}

std::uint64_t Stream::Submit(const Launch& launch, std::vector<StreamPoint> after) {
    return Push({nullptr, std::make_unique<Launch>(launch), std::move(after)});
}

void Stream::Wait(std::uint64_t ticket) {
    if (IsReached(ticket)) return;
    std::unique_lock<std::mutex> lock(mMutex);
    ++mWaiting;
    mWake.notify_one();
    mReached.wait(lock, [&] { return IsReached(ticket); });
    --mWaiting;
}

void Stream::Finish(std::uint64_t count) {
    {
        const std::lock_guard<std::mutex> lock(mMutex);
        mDone += count;
    }
    mReached.notify_all();
}

bool Stream::Pop(Item& item) {
    std::unique_lock<std::mutex> lock(mMutex);
    mWake.wait(lock, [this] { return mStop || !mItems.empty(); });
    if (mItems.empty()) return false;
    item = std::move(mItems.front());
    mItems.pop_front();
    return true;
}

bool Stream::ExtendChain() {
    std::unique_lock<std::mutex> lock(mMutex);
    const auto deadline = Clock::now() + kHold;
    while (mItems.empty()) {
        if (mStop || mWaiting != 0) return false;
        if (mWake.wait_until(lock, deadline) == std::cv_status::timeout && mItems.empty()) {
            ++GetCounters().timerFlushes;
            return false;
        }
    }
    const Item& next = mItems.front();
    if (!next.IsPointwise() || !next.after.empty() || !mChain.TryAdd(*next.launch)) return false;
    mItems.pop_front();
    return true;
}

std::uint64_t Stream::RunItem(const Item& item) {
    for (const StreamPoint& point : item.after) point.stream->Wait(point.ticket);
    if (item.work) {
        item.work();
        return 1;
    }
    if (!item.IsPointwise()) {
        RunRange(*item.launch);
        return 1;
    }
    mChain.TryAdd(*item.launch);
    while (sFusing.load() && ExtendChain()) {
    }
    const std::uint64_t count = mChain.GetLength();
    mChain.Run();
    return count;
}

void Stream::Work() {
    Item item;
    while (Pop(item)) {
        const std::uint64_t count = RunItem(item);
        // What the item holds goes before its waiters know: they may be about to destroy the stream.
        item = {};
        Finish(count);
    }
}

}  // namespace SoftCuda
