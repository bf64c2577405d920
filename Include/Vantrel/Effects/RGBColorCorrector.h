// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/CorrectorParameters.h"

namespace Vantrel {

/// Corrects red, green and blue as a lift, gamma, gain corrector does, in the whole picture and in each tonal range.
/// A range has a triple of controls for all channels and one for each channel. For a channel the two are taken
/// together: pedestals are added, gammas and gains multiplied,
///
///     p = p_all + p_channel,  g = g_all g_channel,  k = k_all k_channel
///
/// A channel v goes through the master set, and the result through one set whose controls lie between those of the
/// three ranges, by the shares s, m, h that the pixel's own luma has in them:
///
///     v1 = level(v + p0, 1 / g0) k0
///     v2 = level(v1 + s ps + m pm + h ph, s / gs + m / gm + h / gh) (s ks + m km + h kh)
///     level(v, e) = v^e where v is above 0, else v
///
/// A gamma below 0.01 counts as 0.01. Alpha stays. The defaults change nothing.
[[nodiscard]] constexpr std::array<ParameterRow, 3> LiftGammaGainParameters(std::int32_t first,
                                                                            const std::array<const char*, 3>& names) {
    using Type = ParameterType;
    return {{{first, names[0], Type::kDouble, "", 0.1, 10, {1}},
             {first + 1,
              names[1],
              Type::kDouble,
              "",
              -1,
              1,
              {0},
              nullptr,
              ParameterConversion::kAsIs,
              "added before gamma"},
             {first + 2, names[2], Type::kDouble, "", 0, 10, {1}}}};
}

#define VANTREL_LIFT_GAMMA_GAIN(first, set) LiftGammaGainParameters(first, {set "_gamma", set "_pedestal", set "_gain"})
#define VANTREL_LIFT_GAMMA_GAIN_RGB(first, set)                                                     \
    VANTREL_LIFT_GAMMA_GAIN(first, set "_red"), VANTREL_LIFT_GAMMA_GAIN((first) + 3, set "_green"), \
        VANTREL_LIFT_GAMMA_GAIN((first) + 6, set "_blue")

inline constexpr auto kRGBColorCorrectorParameters = JoinParameters(
    std::array<ParameterRow, 1>{CorrectorOutputParameter()}, SplitViewParameters(1), TonalRangeParameters(6),
    VANTREL_LIFT_GAMMA_GAIN(13, "master"), VANTREL_LIFT_GAMMA_GAIN(16, "shadow"),
    VANTREL_LIFT_GAMMA_GAIN(19, "midtone"), VANTREL_LIFT_GAMMA_GAIN(22, "highlight"),
    VANTREL_LIFT_GAMMA_GAIN_RGB(26, "master"), VANTREL_LIFT_GAMMA_GAIN_RGB(35, "shadow"),
    VANTREL_LIFT_GAMMA_GAIN_RGB(44, "midtone"), VANTREL_LIFT_GAMMA_GAIN_RGB(53, "highlight"),
    std::array<ParameterRow, 1>{ShowMaskParameter(65)}, SelectionParameters(70));
#undef VANTREL_LIFT_GAMMA_GAIN_RGB
#undef VANTREL_LIFT_GAMMA_GAIN

inline constexpr EffectRow kRGBColorCorrectorEffect = MakeEffectRow(
    "TQ.XQVE RGB Color Corrector", "RGB Color Corrector",
    "Corrects lift, gamma and gain of each channel in all or in one tonal range.", kRGBColorCorrectorParameters);

}  // namespace Vantrel
