// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

#include <boost/function.hpp>
#include <boost/shared_ptr.hpp>

namespace Halden::threads {

/// Runs posted functions one at a time, in the order posted. Destroying the last reference waits for nothing: functions
/// already posted still run, at the latest while the process ends normally, which waits for them. A function posted
/// after that is dropped. A function that throws ends the process, as an uncaught exception on any thread does.
class AsyncExecutor {
public:
    virtual ~AsyncExecutor() = default;

    /// Queues `work` and returns at once. Any thread. `flags` is reserved, pass 0.
    virtual void Post(boost::function<void()> work, std::uint32_t flags) = 0;

    /// Returns when everything posted before the call has run. Not from within a posted function.
    virtual void Drain() = 0;
};

/// An executor with one thread of its own, named `threadName` (at most 15 characters are shown by the system).
[[nodiscard]] boost::shared_ptr<AsyncExecutor> CreateThreadExecutor(const std::string& threadName);

/// An executor for short processor-bound work. It has no thread of its own: all such executors share one small pool, so
/// that every node of a long timeline can own one.
[[nodiscard]] boost::shared_ptr<AsyncExecutor> CreateCPUBoundExecutor();

/// Returns when no executor of the pool has work left, what that work held included. Not from within such work.
void DrainCPUBoundExecutors();

}  // namespace Halden::threads
