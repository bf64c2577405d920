// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include "Kiln/DeviceCommands.h"
#include "Kiln/Modules.h"

namespace Kiln {

/// What a device says of itself. Fixed for its life.
struct DeviceFacts {
    std::string name;
    std::string description;         ///< one line: framework, driver, version, kind
    std::uint64_t memoryBytes = 0;   ///< of the device's own memory, what Kiln may take
    std::uint64_t largestBlock = 0;  ///< bytes of the largest single allocation; 0 when only memoryBytes bounds it
    bool isCPU = false;              ///< device memory is the machine's own
};

/// Rows within device blocks or host memory. Offsets and distances in bytes.
struct RowLayout {
    std::uint64_t offset = 0;
    std::uint64_t rowBytes = 0;
};

/// Blocks of threads: gridX by gridY blocks of blockX by blockY.
struct LaunchShape {
    std::int32_t gridX = 1;
    std::int32_t gridY = 1;
    std::int32_t blockX = 16;
    std::int32_t blockY = 16;
};

/// A kernel's argument values, packed once for both frameworks: each is aligned to its own size, as CUDA lays out
/// parameters, and stays addressable by index, as OpenCL takes them.
class KernelArguments {
public:
    static constexpr std::size_t kMaxArguments = 64;
    static constexpr std::size_t kMaxBytes = 512;

    /// `size` is 4, 8 or 16.
    void Add(const void* value, std::uint32_t size) {
        const std::uint32_t offset = (mBytesUsed + size - 1) & ~(size - 1);
        if (mCount == kMaxArguments || offset + size > kMaxBytes) {
            mOverflow = true;
            return;
        }
        std::memcpy(&mBytes[offset], value, size);
        mEntries[mCount++] = {offset, size};
        mBytesUsed = offset + size;
    }

    [[nodiscard]] std::uint32_t GetCount() const { return mCount; }
    [[nodiscard]] const void* GetValue(std::uint32_t index) const { return &mBytes[mEntries[index].offset]; }
    [[nodiscard]] std::uint32_t GetSize(std::uint32_t index) const { return mEntries[index].size; }
    /// The whole list in CUDA's layout; the total isn't rounded beyond the last argument.
    [[nodiscard]] const void* GetBytes() const { return mBytes.data(); }
    [[nodiscard]] std::uint32_t GetByteCount() const { return mBytesUsed; }
    /// More was added than fits: the list can't be launched.
    [[nodiscard]] bool IsOverfull() const { return mOverflow; }

private:
    struct Entry {
        std::uint32_t offset;
        std::uint32_t size;
    };
    alignas(16) std::array<std::byte, kMaxBytes> mBytes;
    std::array<Entry, kMaxArguments> mEntries;
    std::uint32_t mCount = 0;
    std::uint32_t mBytesUsed = 0;
    bool mOverflow = false;
};

/// One framework's way to one device: a context and one in-order queue. All that differs between frameworks lies behind
/// this class; what is common (pools, bounds, staging, lookup) lies above it, and a backend trusts its caller.
///
/// All calls are allowed from any thread, except those on one kernel or one module, which are made under the device's
/// exclusive access. Queued work runs in the order of the calls.
class Backend : public std::enable_shared_from_this<Backend> {
public:
    virtual ~Backend() = default;

    [[nodiscard]] virtual const DeviceFacts& GetFacts() const = 0;
    /// A CUstream or cl_command_queue.
    [[nodiscard]] virtual std::uint64_t GetQueueHandle() const = 0;

    /// For callers that use the framework's own entries between the two calls. They nest.
    virtual void Enter() = 0;
    virtual void Leave() = 0;

    /// Device memory: a CUdeviceptr or cl_mem, 0 when refused.
    [[nodiscard]] virtual std::uint64_t AllocateDevice(std::uint64_t bytes) = 0;
    /// Work that is queued may still use the block.
    virtual void FreeDevice(std::uint64_t block) = 0;
    /// Host memory that the device reads fast; null when refused.
    [[nodiscard]] virtual void* AllocateHost(std::uint64_t bytes) = 0;
    /// Nothing queued may still use the block.
    virtual void FreeHost(void* block) = 0;

    /// Queues a copy of host memory that stays as it is until the copy has run: a block of AllocateHost.
    virtual Ostrand::Status CopyToDevice(std::uint64_t target, std::uint64_t targetOffset, const void* source,
                                         std::uint64_t bytes) = 0;
    /// Copies rows into host memory; waits for the queue.
    virtual Ostrand::Status CopyRowsToHost(void* target, std::uint64_t targetRowBytes, std::uint64_t source,
                                           const RowLayout& sourceLayout, std::uint64_t widthBytes,
                                           std::uint64_t rows) = 0;
    /// Queues a copy of rows between device blocks that don't overlap.
    virtual Ostrand::Status CopyRows(std::uint64_t target, const RowLayout& targetLayout, std::uint64_t source,
                                     const RowLayout& sourceLayout, std::uint64_t widthBytes, std::uint64_t rows) = 0;
    /// Queues a fill with a 32-bit pattern; offset and size in bytes, multiples of 4.
    virtual Ostrand::Status Fill(std::uint64_t target, std::uint64_t offset, std::uint32_t pattern,
                                 std::uint64_t bytes) = 0;

    /// A CUmodule or cl_program made of whatever form of the image the device takes; 0 and a reason on failure.
    [[nodiscard]] virtual std::uint64_t LoadModule(const ModuleImage& image, std::string& message) = 0;
    virtual void UnloadModule(std::uint64_t module) = 0;
    /// A CUfunction or cl_kernel, which the caller gives back with ReleaseKernel before it unloads the module; 0 when
    /// the module has none of that name.
    [[nodiscard]] virtual std::uint64_t GetKernel(std::uint64_t module, const char* name) = 0;
    virtual void ReleaseKernel(std::uint64_t kernel) = 0;

    /// Hands a kernel its arguments.
    virtual Ostrand::Status SetArguments(std::uint64_t kernel, const KernelArguments& arguments) = 0;
    /// Queues a kernel whose arguments have been set.
    virtual Ostrand::Status Launch(std::uint64_t kernel, const LaunchShape& shape) = 0;

    /// Marks this moment of the queue; empty on failure.
    [[nodiscard]] virtual TimingMarkRef RecordMark() = 0;
    /// Waits until the queue is empty.
    virtual Ostrand::Status Synchronize() = 0;
};

/// The devices of one framework, at most kMaxDevices of them; with none, `message` tells why.
struct BackendList {
    std::vector<std::shared_ptr<Backend>> backends;
    std::string message;
};
constexpr std::size_t kMaxDevices = 4;

}  // namespace Kiln
