// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Ostrand/Allocated.h"

#include <new>

namespace Ostrand {

namespace {

std::atomic<std::int64_t> gLiveBlocks{0};

}  // namespace

void* Allocator::Allocate(std::size_t bytes) {
    void* block = ::operator new(bytes);
    gLiveBlocks.fetch_add(1, std::memory_order_relaxed);
    return block;
}

void Allocator::Dispose(void* block) noexcept {
    if (!block) return;
    ::operator delete(block);
    gLiveBlocks.fetch_sub(1, std::memory_order_relaxed);
}

std::int64_t Allocator::GetLiveBlocks() { return gLiveBlocks.load(std::memory_order_relaxed); }

}  // namespace Ostrand
