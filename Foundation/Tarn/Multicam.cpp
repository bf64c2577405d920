// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tarn/Multicam.h"

namespace Tarn {

namespace {

/// Where the tile of that place begins, and the one before it ends.
std::int32_t EdgeAt(std::int32_t place, std::int32_t length, std::int32_t factor) {
    return static_cast<std::int32_t>(std::int64_t{length} * place / factor);
}

}  // namespace

std::int32_t GetMulticamDownsampleFactor(std::int32_t inputCount) {
    std::int32_t factor = 1;
    while (std::int64_t{factor} * factor < inputCount) ++factor;
    return factor;
}

Vellum::Rect GetMulticamBoundsBoundsForTrackIndex(std::int32_t index, std::int32_t width, std::int32_t height,
                                                  std::int32_t factor) {
    if (index < 0 || factor < 1 || index / factor >= factor) return {};
    const std::int32_t column = index % factor;
    const std::int32_t row = index / factor;
    return {EdgeAt(column, width, factor), EdgeAt(row, height, factor), EdgeAt(column + 1, width, factor),
            EdgeAt(row + 1, height, factor)};
}

}  // namespace Tarn
