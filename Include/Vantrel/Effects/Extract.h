// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// Draws in white what lies between two levels of luma (BT.709), in black what doesn't, with a soft edge outside of
/// each level; inverted the other way round. With all numbers over 255 and s the softness, at least 1:
///
///     below = 1 + (Y - black_input) / s,  above = 1 + (white_input - Y) / s, both limited to 0..1
///     grey = min(below, above)
///
/// A black input at or below 0 takes in all that is darker, a white input at or above 255 all that is lighter. Alpha
/// stays.
[[nodiscard]] constexpr ParameterRow ExtractParameter(std::int32_t index, const char* name, double value) {
    return {index, name, ParameterType::kInt, "of 255", 0, 255, {value}, nullptr, ParameterConversion::kLevel};
}
inline constexpr ParameterRow kExtractParameters[] = {
    ExtractParameter(0, "black_input", 128),
    ExtractParameter(1, "white_input", 255),
    ExtractParameter(2, "softness", 32),
    {3, "invert", ParameterType::kBool, "", 0, 1, {0}},
};
inline constexpr EffectRow kExtractEffect =
    MakeEffectRow("KL.XQVE Extract", "Extract", "Draws a range of luma in white on black.", kExtractParameters);

}  // namespace Vantrel
