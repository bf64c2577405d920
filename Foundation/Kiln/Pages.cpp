// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/Pages.h"

#include <sys/mman.h>
#include <unistd.h>

#include <cstdlib>

namespace Kiln {
namespace {
constexpr std::uint64_t kHugePage = 2U << 20;
constexpr std::uint64_t kSmallAlignment = 4096;
}  // namespace

void PagesDeleter::operator()(void* block) const { std::free(block); }

Pages AllocatePages(std::uint64_t bytes) {
    const bool isLarge = bytes >= kHugePage;
    void* block = nullptr;
    if (posix_memalign(&block, isLarge ? kHugePage : kSmallAlignment, bytes) != 0) return nullptr;
    // Advice only: without huge pages the block is slower to touch and otherwise the same.
    if (isLarge) madvise(block, bytes & ~(kHugePage - 1), MADV_HUGEPAGE);
    return Pages(block);
}

std::uint64_t GetMachineMemory() {
    const long pages = sysconf(_SC_PHYS_PAGES);
    const long pageBytes = sysconf(_SC_PAGESIZE);
    return pages > 0 && pageBytes > 0 ? static_cast<std::uint64_t>(pages) * static_cast<std::uint64_t>(pageBytes) : 0;
}

}  // namespace Kiln
