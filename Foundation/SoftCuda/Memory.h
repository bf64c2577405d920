// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <mutex>
#include <optional>
#include <unordered_map>
#include <vector>

#include "SoftCuda/DriverApi.h"

namespace SoftCuda {

enum class MemoryKind { kDevice, kHost, kRegistered };

struct Block {
    std::uintptr_t base = 0;
    std::size_t bytes = 0;     ///< as asked for
    std::size_t reserved = 0;  ///< as taken from the system
    MemoryKind kind = MemoryKind::kDevice;
    int device = 0;
    CUcontext owner = nullptr;
    unsigned flags = 0;
};

/// All memory that the driver gave out or was told of, on every device. Device addresses are addresses of this process.
/// May be called from any thread; its lock is never held while another is taken.
class Memory {
public:
    void SetLimit(std::size_t bytesPerDevice);
    void SetFailEvery(unsigned n);

    /// Blocks of 2 MB and more begin on a huge page's boundary, ask for huge pages, and are kept for reuse when freed:
    /// a fresh frame costs more in page faults than a kernel takes to fill it.
    CUresult AllocateDevice(std::size_t bytes, int device, CUcontext owner, std::uintptr_t& address);
    CUresult AllocateHost(std::size_t bytes, CUcontext owner, unsigned flags, std::uintptr_t& address);
    CUresult Register(std::uintptr_t address, std::size_t bytes, CUcontext owner, unsigned flags);
    /// `address` is the block's first byte. The caller has seen to it that nothing uses the block.
    CUresult Free(std::uintptr_t address, MemoryKind kind);
    void FreeAllOf(CUcontext owner);

    /// The block around an address, of any kind.
    [[nodiscard]] std::optional<Block> Find(std::uintptr_t address) const;
    /// Does all of the range lie in one live block?
    [[nodiscard]] bool Contains(std::uintptr_t address, std::size_t bytes) const;
    [[nodiscard]] std::size_t GetLimit() const;
    [[nodiscard]] std::size_t GetUsed(int device) const;

private:
    bool Refuses();
    std::uintptr_t TakeLarge(std::size_t reserved);
    void GiveBack(const Block& block);

    mutable std::mutex mMutex;
    std::map<std::uintptr_t, Block> mBlocks;
    std::unordered_map<std::size_t, std::vector<std::uintptr_t>> mSpare;
    std::size_t mSpareBytes = 0;
    std::size_t mLimit = 0;
    std::size_t mUsed[4] = {};
    unsigned mFailEvery = 0;
    unsigned mUntilFailure = 0;
};

[[nodiscard]] Memory& GetMemory();

}  // namespace SoftCuda
