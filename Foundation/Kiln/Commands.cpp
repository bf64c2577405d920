// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/Commands.h"

#include <cstring>

namespace Kiln {

Ostrand::Status Commands::Launch(std::uint64_t kernel, std::int32_t gridX, std::int32_t gridY, std::int32_t blockX,
                                 std::int32_t blockY, std::uint64_t /*reserved*/) {
    if (kernel == 0 || gridX <= 0 || gridY <= 0 || blockX <= 0 || blockY <= 0) return Ostrand::kStatus_Failure;
    return mBackend->Launch(kernel, {gridX, gridY, blockX, blockY});
}

Ostrand::Status Commands::CopyHostToDevice(const void* host, std::uint64_t device, std::size_t bytes,
                                           TimingMarkRef* mark) {
    if (!host || device == 0) return Ostrand::kStatus_Failure;
    if (bytes == 0) return Ostrand::kStatus_OK;
    std::uint64_t staged = 0;
    // Pageable memory may change as soon as this returns: it is taken now, into memory that the queue can read later.
    if (!mHostMemory->Owns(reinterpret_cast<std::uint64_t>(host))) {
        staged = mHostMemory->Allocate(bytes);
        if (staged == 0) return Ostrand::kStatus_OutOfMemory;
        std::memcpy(reinterpret_cast<void*>(staged), host, bytes);
        host = reinterpret_cast<const void*>(staged);
    }
    const Ostrand::Status status = mBackend->CopyToDevice(device, 0, host, bytes);
    if (mark) *mark = mBackend->RecordMark();
    if (staged != 0) mHostMemory->Free(staged, mark ? *mark : TimingMarkRef());
    return status;
}

}  // namespace Kiln
