// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/Scratch.h"

#include <utility>

namespace Kiln {

DeviceScratchBuffer::DeviceScratchBuffer(DeviceRef device, std::uint64_t bytes)
    : mDevice(std::move(device)), mHandle(mDevice ? mDevice->GetDeviceMemory()->Allocate(bytes) : 0) {}

DeviceScratchBuffer::~DeviceScratchBuffer() {
    if (mHandle != 0) mDevice->GetDeviceMemory()->Free(mHandle);
}

ScopedRecordedHostMemory::ScopedRecordedHostMemory(DeviceRef device, std::uint64_t bytes)
    : mDevice(std::move(device)),
      mBlock(mDevice ? reinterpret_cast<void*>(mDevice->GetHostMemory()->Allocate(bytes)) : nullptr) {}

ScopedRecordedHostMemory::~ScopedRecordedHostMemory() {
    if (mBlock) mDevice->GetHostMemory()->Free(reinterpret_cast<std::uint64_t>(mBlock), mMark);
}

}  // namespace Kiln
