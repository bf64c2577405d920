// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// Moves black, white and the middle: first of all channels, then of each. A channel's levels are
///
///     v1 = (v - black_in) / (white_in - black_in);  0 below and 1 from black_in on where the two are equal
///     v2 = v1^(100 / gamma) where v1 is above 0, else v1;  a power not within 0..100 counts as 100
///     v3 = black_out + v2 (white_out - black_out)
///
/// with levels of an 8-bit signal, 0 to 255 for 0.0 to 1.0. A gamma above 100 brightens the middle; white below black
/// turns a channel round. Levels beyond black and white aren't clamped. Alpha stays. The defaults change nothing.
[[nodiscard]] constexpr ParameterRow LevelsParameter(std::int32_t index, const char* name, double value) {
    return {index, name, ParameterType::kInt, "of 255", 0, 255, {value}, nullptr, ParameterConversion::kLevel};
}

[[nodiscard]] constexpr std::array<ParameterRow, 5> LevelsGroup(std::int32_t first,
                                                                const std::array<const char*, 5>& names) {
    return {{LevelsParameter(first, names[0], 0),
             LevelsParameter(first + 1, names[1], 255),
             LevelsParameter(first + 2, names[2], 0),
             LevelsParameter(first + 3, names[3], 255),
             {first + 4, names[4], ParameterType::kInt, "%", 20, 1000, {100}}}};
}

#define VANTREL_LEVELS_NAMES(set) \
    { set "_black_in", set "_white_in", set "_black_out", set "_white_out", set "_gamma" }

inline constexpr auto kLevelsParameters =
    JoinParameters(LevelsGroup(0, VANTREL_LEVELS_NAMES("rgb")), LevelsGroup(5, VANTREL_LEVELS_NAMES("red")),
                   LevelsGroup(10, VANTREL_LEVELS_NAMES("green")), LevelsGroup(15, VANTREL_LEVELS_NAMES("blue")));
#undef VANTREL_LEVELS_NAMES

inline constexpr EffectRow kLevelsEffect = MakeEffectRow(
    "KL.XQVE Levels", "Levels", "Moves black, white and the middle of all channels and of each.", kLevelsParameters);

}  // namespace Vantrel
