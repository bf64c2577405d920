// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <condition_variable>
#include <deque>
#include <exception>
#include <mutex>
#include <thread>

#include "Host/Output/FrameWriter.h"
#include "Host/Render/FrameLoop.h"

namespace Vantrel::Host {

/// Writes frames on a thread of its own, so that the device doesn't wait for an encoder. Used by one thread.
class OutputQueue {
public:
    /// The writer outlives the queue.
    explicit OutputQueue(FrameWriter& writer);
    /// Drops what hasn't been written.
    ~OutputQueue();
    OutputQueue(const OutputQueue&) = delete;
    OutputQueue& operator=(const OutputQueue&) = delete;

    /// Waits while the queue is full. Throws what the writer threw.
    void Push(RenderedFrame frame);
    /// Returns when all has been written. Throws what the writer threw.
    void Finish();

private:
    void Work();
    void ThrowFailure();

    FrameWriter& mWriter;
    std::mutex mMutex;
    std::condition_variable mChanged;
    std::deque<RenderedFrame> mFrames;
    bool mBusy = false;
    bool mStopping = false;
    std::exception_ptr mFailure;
    std::thread mThread;
};

}  // namespace Vantrel::Host
