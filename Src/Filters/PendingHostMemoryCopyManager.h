// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <list>
#include <map>
#include <set>
#include <utility>
#include <vector>

#include <boost/function.hpp>
#include <boost/shared_ptr.hpp>
#include <boost/thread/condition_variable.hpp>
#include <boost/thread/mutex.hpp>

#include "Halden/Executor.h"
#include "Kiln/Device.h"
#include "Ostrand/CriticalSection.h"
#include "Vantrel/RenderResults.h"

namespace Vantrel {

/// Where the copies of host frames into upload-ready memory meet the requests that want them. A copy is made once per
/// fingerprint, whoever asks first, and handed to every request that asked meanwhile.
///
/// A frame is unknown, claimed (somebody will produce it), queued, running, or done (in the requests' stores and in the
/// host memory's frame cache). Whoever is told to produce a frame must call Complete for it, also when it fails.
///
/// Any thread. The two locks are never held together; the state mutex is taken before the locks of RenderResults. The
/// completion function of a RenderResults may run under the state mutex and must not come back here.
class PendingHostMemoryCopyManager {
public:
    using Copy = boost::function<void()>;

    PendingHostMemoryCopyManager() = default;
    PendingHostMemoryCopyManager(const PendingHostMemoryCopyManager&) = delete;
    PendingHostMemoryCopyManager& operator=(const PendingHostMemoryCopyManager&) = delete;

    /// The process's own.
    [[nodiscard]] static PendingHostMemoryCopyManager& Instance();

    /// @param blocking  wait for a frame that another thread is making; a copy that nobody has begun is done here
    /// instead.
    /// @param frame     the frame if it is at hand, else empty.
    /// @return true: the frame is there, or on its way, or its maker failed. False: the caller must produce it.
    [[nodiscard]] bool GetOrClaim(const Kiln::DeviceRef& device, const Guid& hash, bool blocking,
                                  const RenderResultsRef& results, VideoFrameRef& frame);

    /// Queues the copy of a claimed frame and posts a job for it. Any executor's job may run any copy of the queue.
    void QueueCopy(const boost::shared_ptr<Halden::threads::AsyncExecutor>& executor, const Guid& hash, Copy copy);

    /// Hands a frame, or an empty one after a failure, to everybody who waits for it.
    void Complete(const Kiln::DeviceRef& device, const Guid& hash, const VideoFrameRef& frame);

    /// Does a queued copy on the caller's thread, in the name of `results`. False when it isn't in the queue.
    /// Raises boost::bad_function_call for an entry without a function.
    bool ExecuteCopyImmediateIfNotStarted(const Guid& hash, const RenderResultsRef& results);

    /// A job's body: runs the first queued copy that is still wanted, if there is one.
    void ExecuteThreadCopy();

private:
    using Waiters = std::vector<RenderResultsRef>;

    /// Drops the entry when no request wants the copy any more, and then says false.
    [[nodiscard]] bool IsStillWanted(const Guid& hash);
    void WakeBlockedCallers(const Guid& hash);

    boost::mutex mStateMutex;
    boost::condition_variable mStateChanged;
    std::map<Guid, Waiters> mWaiters;
    /// What blocked callers wait for: one for each device that is rendering.
    std::multiset<Guid> mWaitedHashes;

    Ostrand::CriticalSection mQueueLock{"PendingHostMemoryCopyManager"};
    std::list<std::pair<Guid, Copy>> mQueue;
};

}  // namespace Vantrel
