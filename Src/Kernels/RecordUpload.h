// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <memory>

#include "Kiln/Scratch.h"
#include "Src/Kernels/KernelLaunch.h"
#include "Src/Kernels/KernelTable.h"

namespace Vantrel {

/// A CUDA module's global, kept in static storage beside the kernels that read it.
struct ModuleSymbol {
    const char* moduleKey;
    const char* symbolName;
    SymbolTable table;
};

/// A record on its way to the device: a pinned block that is filled in place, copied to a module's global on CUDA and
/// to a scratch buffer on OpenCL, and given back to its pool behind the work that reads it. Lives until its kernels are
/// queued. Under the device's exclusive access.
class RecordUpload {
public:
    RecordUpload(const Kiln::DeviceRef& device, std::uint32_t bytes)
        : mDevice(device), mBytes(bytes), mBlock(device, bytes) {}

    /// Where the record is written; null when the pool refused.
    [[nodiscard]] void* GetBlock() const { return mBlock.GetBlock(); }

    /// Queues the copy. Without a block or a destination kStatus_OutOfMemory, else the copy's status.
    [[nodiscard]] Status Send(ModuleSymbol& symbol);

    /// What the kernel takes for the record: the buffer on OpenCL, 0 on CUDA.
    [[nodiscard]] DeviceValue GetArgument() const { return mBuffer ? mBuffer->GetHandle() : 0; }

    /// The mark behind the work that reads the block.
    void SetMark(const Kiln::TimingMarkRef& mark) { mBlock.GetMark() = mark; }

private:
    Kiln::DeviceRef mDevice;
    std::uint32_t mBytes;
    Kiln::ScopedRecordedHostMemory mBlock;
    std::unique_ptr<Kiln::DeviceScratchBuffer> mBuffer;
};

}  // namespace Vantrel
