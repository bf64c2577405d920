// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Render/OutputQueue.h"

namespace Vantrel::Host {

namespace {

constexpr std::size_t kWaitingFrames = 4;

}  // namespace

OutputQueue::OutputQueue(FrameWriter& writer) : mWriter(writer), mThread([this] { Work(); }) {}

OutputQueue::~OutputQueue() {
    {
        const std::lock_guard<std::mutex> hold(mMutex);
        mStopping = true;
        mFrames.clear();
    }
    mChanged.notify_all();
    mThread.join();
}

void OutputQueue::ThrowFailure() {
    if (mFailure) std::rethrow_exception(mFailure);
}

void OutputQueue::Push(RenderedFrame frame) {
    std::unique_lock<std::mutex> lock(mMutex);
    mChanged.wait(lock, [this] { return mFailure || mFrames.size() < kWaitingFrames; });
    ThrowFailure();
    mFrames.push_back(std::move(frame));
    mChanged.notify_all();
}

void OutputQueue::Finish() {
    std::unique_lock<std::mutex> lock(mMutex);
    mChanged.wait(lock, [this] { return mFailure || (mFrames.empty() && !mBusy); });
    ThrowFailure();
}

void OutputQueue::Work() {
    std::unique_lock<std::mutex> lock(mMutex);
    for (;;) {
        mChanged.wait(lock, [this] { return mStopping || !mFrames.empty(); });
        if (mStopping) return;
        const RenderedFrame frame = std::move(mFrames.front());
        mFrames.pop_front();
        mBusy = true;
        lock.unlock();
        std::exception_ptr failure;
        try {
            mWriter.Write(*frame.picture, frame.number);
        } catch (...) {
            failure = std::current_exception();
        }
        lock.lock();
        mBusy = false;
        if (failure) {
            mFailure = failure;
            mFrames.clear();
        }
        mChanged.notify_all();
        if (failure) return;
    }
}

}  // namespace Vantrel::Host
