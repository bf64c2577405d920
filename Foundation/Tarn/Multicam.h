// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Vellum/Geometry.h"

/// How the tiles of a multicam monitor share its picture: in a square grid, row by row from the upper left.
namespace Tarn {

/// The tiles in a row of the grid: the smallest side whose square has room for `inputCount` cameras, at least 1.
[[nodiscard]] std::int32_t GetMulticamDownsampleFactor(std::int32_t inputCount);

/// The rectangle of a tile, in pixels of a picture of that width and height. The rectangles of all `factor` * `factor`
/// tiles cover the picture without gaps or overlap; where it can't be shared evenly their sizes differ by a pixel, and
/// where it has fewer pixels than the grid has tiles some are empty.
/// @param index  from 0 up; one that the grid doesn't have gets an empty rectangle
/// @param factor tiles in a row, at least 1
[[nodiscard]] Vellum::Rect GetMulticamBoundsBoundsForTrackIndex(std::int32_t index, std::int32_t width,
                                                                std::int32_t height, std::int32_t factor);

}  // namespace Tarn
