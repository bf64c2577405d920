// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <memory>

namespace Kiln {

struct PagesDeleter {
    void operator()(void* block) const;
};
/// A block of ordinary memory for pictures. Large ones lie on huge pages where the system has them: first touching a
/// frame is five times as fast then.
using Pages = std::unique_ptr<void, PagesDeleter>;

/// Undefined contents, aligned to 256 at least; empty when there is no memory.
[[nodiscard]] Pages AllocatePages(std::uint64_t bytes);

/// Bytes of memory that the machine has.
[[nodiscard]] std::uint64_t GetMachineMemory();

}  // namespace Kiln
