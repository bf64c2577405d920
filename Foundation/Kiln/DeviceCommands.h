// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>

#include <boost/shared_ptr.hpp>

#include "Ostrand/Status.h"

namespace Kiln {

/// A moment on the device's queue.
class TimingMark {
public:
    virtual ~TimingMark() = default;
    /// Device time from this mark to a later one, in milliseconds. Waits until the later one is reached; 0 on failure.
    [[nodiscard]] virtual float ElapsedMs(const TimingMark& later) const = 0;
    /// Has everything queued before the mark run? Doesn't wait. Any thread. A queue that failed counts as reached.
    [[nodiscard]] virtual bool IsReached() const = 0;
    /// Returns when the mark is reached. Any thread.
    virtual void Wait() const = 0;
};
using TimingMarkRef = boost::shared_ptr<TimingMark>;

/// The device's command object. Everything is queued in order and nothing waits, unless told. Called under the device's
/// exclusive access.
class DeviceCommands {
public:
    virtual ~DeviceCommands() = default;

    [[nodiscard]] virtual TimingMarkRef CreateMark() = 0;

    /// Starts a kernel, whose arguments have been set, as gridX by gridY blocks of blockX by blockY threads.
    /// @param kernel a CUfunction or cl_kernel.
    virtual Ostrand::Status Launch(std::uint64_t kernel, std::int32_t gridX, std::int32_t gridY, std::int32_t blockX,
                                   std::int32_t blockY, std::uint64_t reserved) = 0;

    /// Copies a host block into device memory. `host` must stay as it is until `*mark`, if asked for, is reached;
    /// pageable memory is taken before the call returns.
    virtual Ostrand::Status CopyHostToDevice(const void* host, std::uint64_t device, std::size_t bytes,
                                             TimingMarkRef* mark) = 0;
};

}  // namespace Kiln
