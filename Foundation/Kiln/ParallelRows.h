// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <functional>

namespace Kiln {

/// Calls `work(first, last)` for bands of rows that together are 0 to `rows`, on this thread and, where the picture is
/// large enough for it to pay, on those of the processor's executors that have time. Returns when all rows are done.
/// @param rowCost     bytes that the work on one row touches.
/// @param fewestRows  of a band, where each has a cost of its own.
void ForEachBand(std::int32_t rows, std::uint64_t rowCost, std::int32_t fewestRows,
                 const std::function<void(std::int32_t first, std::int32_t last)>& work);

}  // namespace Kiln
