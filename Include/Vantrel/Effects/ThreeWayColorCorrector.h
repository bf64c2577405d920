// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/CorrectorParameters.h"

namespace Vantrel {

/// Corrects colour balance, hue and saturation by tonal range, and levels in the whole picture. Levels come first, for
/// each channel; a gamma above 1 brightens the middle:
///
///     v1 = (v - black_in) / (white_in - black_in);  0 below and 1 from black_in on where the two are equal
///     v2 = v1^(1 / gamma) where v1 is above 0, else v1;  an inverse gamma not within 0..100 counts as 100
///     v3 = black_out + v2 (white_out - black_out)
///
/// The rest is done on the vectorscope (HueAngleParameter), so that the luma after the levels is the luma of the
/// result. Each range i has a complex factor f and a tint t, the master's angle and wheel included,
///
///     f_i = saturation_i (cos a + j sin a),  a = hue_angle_i + master_hue_angle
///     t_i = sqrt(1/2) (|amount_i gain_i| (cos w_i + j sin w_i) + the same of the master's wheel)
///
/// with w a wheel's angle, turned by half a circle for a negative amount. Weighed by the shares s, m, h that the luma
/// of the pixel before the levels has in the ranges, a colour c = Cb + j Cr becomes
///
///     c' = (s f_s + m f_m + h f_h) c + s t_s + m t_m + h t_h
///
/// Alpha stays. The defaults change nothing.
inline constexpr std::array<ParameterRow, 3> kThreeWaySaturationParameters = {
    {{25, "shadow_saturation", ParameterType::kDouble, "%", 0, 200, {100}},
     {26, "midtone_saturation", ParameterType::kDouble, "%", 0, 200, {100}},
     {27, "highlight_saturation", ParameterType::kDouble, "%", 0, 200, {100}}}};

inline constexpr std::array<ParameterRow, 5> kThreeWayLevelsParameters = {
    {LevelParameter(100, "input_black", 0, ""),
     {101, "input_gamma", ParameterType::kDouble, "", 0.1, 10, {1}},
     LevelParameter(102, "input_white", 255, ""),
     LevelParameter(103, "output_black", 0, ""),
     LevelParameter(104, "output_white", 255, "")}};

#define VANTREL_WHEEL(first, set) \
    WheelParameters(first, {set "_balance_amount", set "_balance_gain", set "_balance_angle"})
#define VANTREL_HUE_ANGLE(index, set) \
    std::array<ParameterRow, 1> { HueAngleParameter(index, set "_hue_angle") }

inline constexpr auto kThreeWayColorCorrectorParameters =
    JoinParameters(std::array<ParameterRow, 1>{CorrectorOutputParameter()}, SplitViewParameters(2),
                   std::array<ParameterRow, 1>{{{18,
                                                 "show_tonal_range",
                                                 ParameterType::kBool,
                                                 "",
                                                 0,
                                                 1,
                                                 {0},
                                                 nullptr,
                                                 ParameterConversion::kAsIs,
                                                 "goes before the output"}}},
                   TonalRangeParameters(19), kThreeWaySaturationParameters,
                   std::array<ParameterRow, 1>{ShowMaskParameter(32)}, SelectionParameters(37),
                   VANTREL_HUE_ANGLE(76, "shadow"), VANTREL_WHEEL(77, "shadow"), VANTREL_HUE_ANGLE(82, "midtone"),
                   VANTREL_WHEEL(83, "midtone"), VANTREL_HUE_ANGLE(88, "highlight"), VANTREL_WHEEL(89, "highlight"),
                   VANTREL_HUE_ANGLE(94, "master"), VANTREL_WHEEL(95, "master"), kThreeWayLevelsParameters);
#undef VANTREL_HUE_ANGLE
#undef VANTREL_WHEEL

inline constexpr EffectRow kThreeWayColorCorrectorEffect =
    MakeEffectRow("TQ.XQVE Three-Way Color Corrector", "Three-Way Color Corrector",
                  "Corrects colour balance, hue and saturation in all or in one tonal range, and levels.",
                  kThreeWayColorCorrectorParameters);

}  // namespace Vantrel
