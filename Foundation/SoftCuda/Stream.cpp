// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "SoftCuda/Stream.h"

#include <cstring>
#include <utility>

#include "SoftCuda/Settings.h"

namespace SoftCuda {

namespace {
// How long a pointwise launch waits for the next one: above what a node takes from launch to launch, and far below what
// the launch itself takes.
constexpr std::chrono::microseconds kHold{80};

void RunCopy(const Stream::SmallCopy& copy) {
    std::memcpy(reinterpret_cast<void*>(copy.target), reinterpret_cast<const void*>(copy.source), copy.bytes);
}
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
    return Push({std::move(work), nullptr, nullptr, nullptr, std::move(after)});
}

std::uint64_t Stream::Submit(const Launch& launch, std::vector<StreamPoint> after) {
    Item item{nullptr, nullptr, nullptr, nullptr, std::move(after)};
    item.launch = std::make_unique<Launch>(launch);
    return Push(std::move(item));
}

std::uint64_t Stream::Submit(SmallCopy copy, std::vector<StreamPoint> after) {
    Item item{nullptr, nullptr, nullptr, nullptr, std::move(after)};
    item.copy = std::make_unique<SmallCopy>(std::move(copy));
    return Push(std::move(item));
}

std::uint64_t Stream::Submit(Stamp stamp, std::vector<StreamPoint> after) {
    return Push({nullptr, nullptr, nullptr, std::move(stamp), std::move(after)});
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

bool Stream::WaitForNext(std::unique_lock<std::mutex>& lock) {
    const auto deadline = Clock::now() + kHold;
    while (mItems.empty()) {
        if (mStop || mWaiting != 0) return false;
        if (mWake.wait_until(lock, deadline) == std::cv_status::timeout && mItems.empty()) {
            ++GetCounters().timerFlushes;
            return false;
        }
    }
    return true;
}

bool Stream::TakeIntoChain(Item& item) {
    if (!item.after.empty()) return false;
    if (item.stamp) {
        mChainStamps.emplace_back(mChain.GetLength(), std::move(item.stamp));
        return true;
    }
    if (item.copy) {
        const SmallCopy& copy = *item.copy;
        if (!mChain.IsApart({copy.target, copy.target + copy.bytes}, {copy.source, copy.source + copy.bytes}))
            return false;
        RunCopy(copy);
        return true;
    }
    return item.IsPointwise() && mChain.TryAdd(*item.launch);
}

bool Stream::ExtendChain() {
    std::unique_lock<std::mutex> lock(mMutex);
    if (!WaitForNext(lock) || !TakeIntoChain(mItems.front())) return false;
    mItems.pop_front();
    ++mChainItems;
    return true;
}

void Stream::RunChain() {
    const auto launches = static_cast<Clock::rep>(mChain.GetLength());
    const Clock::time_point start = Clock::now();
    mChain.Run();
    const Clock::duration whole = Clock::now() - start;
    for (const auto& [before, stamp] : mChainStamps)
        *stamp = start + whole * static_cast<Clock::rep>(before) / launches;
    mChainStamps.clear();
}

std::uint64_t Stream::RunItem(Item& item) {
    for (const StreamPoint& point : item.after) point.stream->Wait(point.ticket);
    if (item.work) item.work();
    if (item.copy) RunCopy(*item.copy);
    if (item.stamp) *item.stamp = Clock::now();
    if (!item.launch) return 1;
    if (!item.IsPointwise()) {
        RunRange(*item.launch);
        return 1;
    }
    mChain.TryAdd(*item.launch);
    mChainItems = 1;
    while (sFusing.load() && ExtendChain()) {
    }
    RunChain();
    return mChainItems;
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
