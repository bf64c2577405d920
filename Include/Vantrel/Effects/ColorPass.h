// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// How near a pixel's colour is to a key colour, light or dark: the distance d of the two in Cb = (B - Y) / 1.8556 and
/// Cr = (R - Y) / 1.5748 (BT.709), where opposite primaries are about 1.2 apart. With s = similarity / 127,
///
///     share = 1 - ramp(s, s + 1/16, d),  ramp(a, b, d) = u u (3 - 2 u),  u = (d - a) / (b - a) limited to 0..1
[[nodiscard]] constexpr ParameterRow SimilarityParameter(std::int32_t index) {
    return {index, "similarity", ParameterType::kInt, "of 127", 0, 127, {10}};
}

/// Keeps one colour and turns the others into their luma: c' = c + (1 - share) (Y - c). Reversed it turns that colour
/// into its luma and keeps the others. Alpha stays.
inline constexpr ParameterRow kColorPassParameters[] = {
    SimilarityParameter(0),
    {1, "reverse", ParameterType::kInt, "", 0, 1, {0}},
    {2, "color", ParameterType::kColor, "", 0, 1, {1, 0, 0, 1}},
};
inline constexpr EffectRow kColorPassEffect = MakeEffectRow(
    "KL.XQVE Color Pass", "Color Pass", "Keeps one colour and takes it from all others.", kColorPassParameters);

}  // namespace Vantrel
