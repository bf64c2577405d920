// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>

namespace Ostrand {

/// The foundation's allocator. It counts, so that tests can tell that nothing leaked.
class Allocator {
public:
    /// Aligned for any object; throws std::bad_alloc.
    [[nodiscard]] static void* Allocate(std::size_t bytes);
    static void Dispose(void* block) noexcept;
    /// Blocks allocated and not yet disposed of, in the whole process.
    [[nodiscard]] static std::int64_t GetLiveBlocks();
};

/// Gives a concrete class its reference counter and its allocation from Allocator.
template <class T>
class Allocated {
public:
    static void* operator new(std::size_t bytes) {
        static_assert(alignof(T) <= alignof(std::max_align_t), "the allocator knows no wider alignment");
        return Allocator::Allocate(bytes);
    }
    static void operator delete(void* block) noexcept { Allocator::Dispose(block); }

protected:
    Allocated() = default;
    ~Allocated() = default;

    std::atomic<std::int32_t> mRefCount{0};
};

}  // namespace Ostrand
