// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <utility>

#include "Kiln/Backend.h"
#include "Kiln/DeviceCommands.h"
#include "Kiln/MemoryManager.h"

namespace Kiln {

/// The command object of any device.
class Commands final : public DeviceCommands {
public:
    Commands(std::shared_ptr<Backend> backend, boost::shared_ptr<MemoryManager> hostMemory)
        : mBackend(std::move(backend)), mHostMemory(std::move(hostMemory)) {}

    TimingMarkRef CreateMark() override { return mBackend->RecordMark(); }
    Ostrand::Status Launch(std::uint64_t kernel, std::int32_t gridX, std::int32_t gridY, std::int32_t blockX,
                           std::int32_t blockY, std::uint64_t reserved) override;
    Ostrand::Status CopyHostToDevice(const void* host, std::uint64_t device, std::size_t bytes,
                                     TimingMarkRef* mark) override;

private:
    const std::shared_ptr<Backend> mBackend;
    const boost::shared_ptr<MemoryManager> mHostMemory;
};

}  // namespace Kiln
