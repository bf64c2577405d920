// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/CorrectorParameters.h"

namespace Vantrel {

/// Corrects luma (BT.709: Y = 0.2126 R + 0.7152 G + 0.0722 B) and keeps the colour differences: every channel moves by
/// as much as luma does. Y goes through the master set, and the result through the sets of the three tonal ranges, each
/// counted by the share that the pixel's own luma has in that range:
///
///     Y1 = master(Y),  Y2 = Y1 + s (shadow(Y1) - Y1) + m (midtone(Y1) - Y1) + h (highlight(Y1) - Y1)
///     c' = c + Y2 - Y
///
/// A set does what its controls say, in the order of a lift, gamma, gain corrector:
///
///     a = v + brightness
///     b = a + contrast (a - level)
///     d = b + pedestal
///     e = d^(1 / gamma) where d is above 0, else d
///     set(v) = e gain
///
/// A gamma below 0.01 counts as 0.01. Alpha stays. The defaults change nothing.
[[nodiscard]] constexpr std::array<ParameterRow, 6> LumaSetParameters(std::int32_t first,
                                                                      const std::array<const char*, 6>& names) {
    using Type = ParameterType;
    using Conversion = ParameterConversion;
    return {
        {{first, names[0], Type::kDouble, "of 255", -255, 255, {0}, nullptr, Conversion::kLevel, "added"},
         {first + 1, names[1], Type::kDouble, "%", -100, 100, {0}, nullptr, Conversion::kPercent, "about the level"},
         {first + 2, names[2], Type::kDouble, "", 0, 1, {0.5}, nullptr, Conversion::kAsIs, "stays under contrast"},
         {first + 3, names[3], Type::kDouble, "", 0.1, 10, {1}},
         {first + 4, names[4], Type::kDouble, "", -1, 1, {0}, nullptr, Conversion::kAsIs, "added before gamma"},
         {first + 5, names[5], Type::kDouble, "", 0, 10, {1}}}};
}

#define VANTREL_LUMA_SET_NAMES(set) \
    { set "_brightness", set "_contrast", set "_contrast_level", set "_gamma", set "_pedestal", set "_gain" }

inline constexpr auto kLumaCorrectorParameters = JoinParameters(
    std::array<ParameterRow, 1>{CorrectorOutputParameter()}, SplitViewParameters(1), TonalRangeParameters(6),
    LumaSetParameters(13, VANTREL_LUMA_SET_NAMES("master")), LumaSetParameters(19, VANTREL_LUMA_SET_NAMES("shadow")),
    LumaSetParameters(25, VANTREL_LUMA_SET_NAMES("midtone")),
    LumaSetParameters(31, VANTREL_LUMA_SET_NAMES("highlight")), std::array<ParameterRow, 1>{ShowMaskParameter(39)},
    SelectionParameters(44));
#undef VANTREL_LUMA_SET_NAMES

inline constexpr EffectRow kLumaCorrectorEffect =
    MakeEffectRow("TQ.XQVE Luma Corrector", "Luma Corrector",
                  "Corrects brightness, contrast and gamma of luma in all or in one tonal range, colour kept.",
                  kLumaCorrectorParameters);

}  // namespace Vantrel
