// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Kiln/Device.h"

namespace Kiln {

/// A block of device memory for a scope. Work queued within the scope may still use it afterwards: the pool hands it
/// out again in the queue's order.
class DeviceScratchBuffer {
public:
    DeviceScratchBuffer(DeviceRef device, std::uint64_t bytes);
    ~DeviceScratchBuffer();
    DeviceScratchBuffer(const DeviceScratchBuffer&) = delete;
    DeviceScratchBuffer& operator=(const DeviceScratchBuffer&) = delete;

    /// A CUdeviceptr or cl_mem; 0 when the pool refused.
    [[nodiscard]] std::uint64_t GetHandle() const { return mHandle; }
    [[nodiscard]] const DeviceRef& GetDevice() const { return mDevice; }

private:
    DeviceRef mDevice;
    std::uint64_t mHandle;
};

/// A block of host memory that the device reads fast, for a scope. It goes back to its pool with a mark, so that nobody
/// gets it while queued work reads it.
class ScopedRecordedHostMemory {
public:
    ScopedRecordedHostMemory(DeviceRef device, std::uint64_t bytes);
    ~ScopedRecordedHostMemory();
    ScopedRecordedHostMemory(const ScopedRecordedHostMemory&) = delete;
    ScopedRecordedHostMemory& operator=(const ScopedRecordedHostMemory&) = delete;

    /// The block's address; null when the pool refused. Its contents are undefined.
    [[nodiscard]] void* GetBlock() const { return mBlock; }
    [[nodiscard]] const DeviceRef& GetDevice() const { return mDevice; }
    /// The mark behind the last work that reads the block, empty at first: for DeviceCommands::CopyHostToDevice, which
    /// can set it. Left empty, all work queued at the end of the scope counts.
    [[nodiscard]] TimingMarkRef& GetMark() { return mMark; }

private:
    DeviceRef mDevice;
    TimingMarkRef mMark;
    void* mBlock;
};

}  // namespace Kiln
