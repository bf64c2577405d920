// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// Raises a pixel's difference to its four neighbours: c' = centre c + neighbour (n1 + n2 + n3 + n4), with
/// centre = 1 + amount / 16 and neighbour = (1 - centre) / 4, a discrete Laplacian taken from the picture (R. Gonzalez
/// and R. Woods, "Digital Image Processing", 3.6). A neighbour counts by its coverage, the rest of its weight falling
/// to the pixel itself, so that what is transparent leaves no trace. Beyond the edge the picture's outermost pixels go
/// on. Alpha stays, and nothing is clamped.
enum SharpenParameter : std::int32_t { kSharpen_Amount = 0 };

inline constexpr ParameterRow kSharpenParameters[] = {
    {kSharpen_Amount, "amount", ParameterType::kInt, "", 0, 100, {0}},
};
inline constexpr EffectRow kSharpenEffect =
    MakeEffectRow("TQ.XQVE Sharpen", "Sharpen", "Raises contrast between neighbouring pixels.", kSharpenParameters);

}  // namespace Vantrel
