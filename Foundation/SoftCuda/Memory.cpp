// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "SoftCuda/Memory.h"

#include <sys/mman.h>

#include <cstdlib>

#include "SoftCuda/Settings.h"

namespace SoftCuda {

namespace {

constexpr std::size_t kHugePage = std::size_t{2} << 20;
constexpr std::size_t kSmallAlignment = 512;
// Freed large blocks are kept up to this share of the memory; the rest goes back to the system.
constexpr std::size_t kSpareShare = 4;

std::size_t RoundUp(std::size_t value, std::size_t unit) { return (value + unit - 1) / unit * unit; }

std::uintptr_t MapHuge(std::size_t bytes) {
    // One huge page more than asked for, so that an aligned run can be cut out of it.
    void* mapped = mmap(nullptr, bytes + kHugePage, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (mapped == MAP_FAILED) return 0;
    const auto start = reinterpret_cast<std::uintptr_t>(mapped);
    const std::uintptr_t aligned = RoundUp(start, kHugePage);
    if (aligned != start) munmap(mapped, aligned - start);
    const std::size_t tail = start + kHugePage - aligned;
    if (tail != 0) munmap(reinterpret_cast<void*>(aligned + bytes), tail);
    madvise(reinterpret_cast<void*>(aligned), bytes, MADV_HUGEPAGE);
    return aligned;
}

}  // namespace

Memory& GetMemory() {
    // Never destroyed: threads of the program may still free memory while its static objects go.
    static Memory& memory = *new Memory;
    return memory;
}

void Memory::SetLimit(std::size_t bytesPerDevice) {
    const std::lock_guard<std::mutex> lock(mMutex);
    mLimit = bytesPerDevice;
}

void Memory::SetFailEvery(unsigned n) {
    const std::lock_guard<std::mutex> lock(mMutex);
    mFailEvery = mUntilFailure = n;
}

bool Memory::Refuses() {
    if (mFailEvery == 0 || --mUntilFailure != 0) return false;
    mUntilFailure = mFailEvery;
    return true;
}

std::uintptr_t Memory::TakeLarge(std::size_t reserved) {
    const auto spare = mSpare.find(reserved);
    if (spare == mSpare.end() || spare->second.empty()) return MapHuge(reserved);
    const std::uintptr_t address = spare->second.back();
    spare->second.pop_back();
    mSpareBytes -= reserved;
    return address;
}

CUresult Memory::AllocateDevice(std::size_t bytes, int device, CUcontext owner, std::uintptr_t& address) {
    if (bytes == 0) return CUDA_ERROR_INVALID_VALUE;
    const std::lock_guard<std::mutex> lock(mMutex);
    if (Refuses() || bytes > mLimit - mUsed[device]) {
        ++GetCounters().refusedAllocations;
        SetMessage("device memory: " + std::to_string(bytes) + " bytes asked for, " +
                   std::to_string(mLimit - mUsed[device]) + " free (or a failure was provoked)");
        return CUDA_ERROR_OUT_OF_MEMORY;
    }
    const bool large = bytes >= kHugePage;
    const std::size_t reserved = RoundUp(bytes, large ? kHugePage : kSmallAlignment);
    address =
        large ? TakeLarge(reserved) : reinterpret_cast<std::uintptr_t>(std::aligned_alloc(kSmallAlignment, reserved));
    if (address == 0) return CUDA_ERROR_OUT_OF_MEMORY;
    mBlocks[address] = {address, bytes, reserved, MemoryKind::kDevice, device, owner, 0};
    mUsed[device] += bytes;
    return CUDA_SUCCESS;
}

CUresult Memory::AllocateHost(std::size_t bytes, CUcontext owner, unsigned flags, std::uintptr_t& address) {
    if (bytes == 0) return CUDA_ERROR_INVALID_VALUE;
    const std::lock_guard<std::mutex> lock(mMutex);
    const bool large = bytes >= kHugePage;
    const std::size_t reserved = RoundUp(bytes, large ? kHugePage : kSmallAlignment);
    address =
        large ? TakeLarge(reserved) : reinterpret_cast<std::uintptr_t>(std::aligned_alloc(kSmallAlignment, reserved));
    if (address == 0) return CUDA_ERROR_OUT_OF_MEMORY;
    mBlocks[address] = {address, bytes, reserved, MemoryKind::kHost, 0, owner, flags};
    return CUDA_SUCCESS;
}

CUresult Memory::Register(std::uintptr_t address, std::size_t bytes, CUcontext owner, unsigned flags) {
    if (address == 0 || bytes == 0) return CUDA_ERROR_INVALID_VALUE;
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto above = mBlocks.lower_bound(address + bytes);
    if (above != mBlocks.begin() && std::prev(above)->second.base + std::prev(above)->second.bytes > address)
        return CUDA_ERROR_HOST_MEMORY_ALREADY_REGISTERED;
    mBlocks[address] = {address, bytes, 0, MemoryKind::kRegistered, 0, owner, flags};
    return CUDA_SUCCESS;
}

void Memory::GiveBack(const Block& block) {
    if (block.kind == MemoryKind::kDevice) mUsed[block.device] -= block.bytes;
    if (block.kind == MemoryKind::kRegistered) return;
    void* const address = reinterpret_cast<void*>(block.base);
    if (block.reserved < kHugePage) {
        std::free(address);
    } else if (mSpareBytes + block.reserved <= mLimit / kSpareShare) {
        mSpare[block.reserved].push_back(block.base);
        mSpareBytes += block.reserved;
    } else {
        munmap(address, block.reserved);
    }
}

CUresult Memory::Free(std::uintptr_t address, MemoryKind kind) {
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto found = mBlocks.find(address);
    if (found == mBlocks.end() || found->second.kind != kind)
        return kind == MemoryKind::kRegistered ? CUDA_ERROR_HOST_MEMORY_NOT_REGISTERED : CUDA_ERROR_INVALID_VALUE;
    const Block block = found->second;
    mBlocks.erase(found);
    GiveBack(block);
    return CUDA_SUCCESS;
}

void Memory::FreeAllOf(CUcontext owner) {
    const std::lock_guard<std::mutex> lock(mMutex);
    for (auto block = mBlocks.begin(); block != mBlocks.end();) {
        if (block->second.owner == owner) {
            GiveBack(block->second);
            block = mBlocks.erase(block);
        } else {
            ++block;
        }
    }
}

std::optional<Block> Memory::Find(std::uintptr_t address) const {
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto above = mBlocks.upper_bound(address);
    if (above == mBlocks.begin()) return std::nullopt;
    const Block& block = std::prev(above)->second;
    if (address - block.base >= block.bytes) return std::nullopt;
    return block;
}

bool Memory::Contains(std::uintptr_t address, std::size_t bytes) const {
    const std::optional<Block> block = Find(address);
    return block && bytes <= block->bytes - (address - block->base);
}

std::size_t Memory::GetLimit() const {
    const std::lock_guard<std::mutex> lock(mMutex);
    return mLimit;
}

std::size_t Memory::GetUsed(int device) const {
    const std::lock_guard<std::mutex> lock(mMutex);
    return mUsed[device];
}

}  // namespace SoftCuda
