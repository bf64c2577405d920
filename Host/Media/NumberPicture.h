// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstdint>

#include "Host/Media/HostPicture.h"

namespace Vantrel::Host {

/// Test pictures that show a number as 16 black or white squares, four in a row, the highest bit first: whatever
/// scaled, moved or mixed such a picture, its squares tell which frames are in it.
constexpr int kNumberBits = 16;

/// Draws the lower 16 bits of a number over a whole picture of 8-bit BGRA.
void DrawNumber(HostPicture& picture, std::uint32_t number);

/// The mean level, 0.0 to 1.0, of the middle of each square, highest bit first. Works on 8-bit BGRA.
[[nodiscard]] std::array<double, kNumberBits> ReadSquares(const HostPicture& picture);

/// The number, or -1 when a square is neither black nor white.
[[nodiscard]] std::int64_t ReadNumber(const HostPicture& picture);

}  // namespace Vantrel::Host
