// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/CorrectorParameters.h"

namespace Vantrel {

/// What the fast colour corrector shows.
enum FastCorrectorOutput : std::int32_t {
    kFastCorrectorOutput_Composite = 0,
    kFastCorrectorOutput_Luma = 1,  ///< of the corrected picture, as grey
    kFastCorrectorOutput_Mask = 2,  ///< alpha as grey, opaque
    kFastCorrectorOutput_Count
};

[[nodiscard]] inline const char* GetFastCorrectorOutputName(std::int32_t output) {
    constexpr const char* kNames[kFastCorrectorOutput_Count] = {"composite", "luma", "mask"};
    return output >= 0 && output < kFastCorrectorOutput_Count ? kNames[output] : nullptr;
}

/// Corrects levels, hue, saturation and balance of the whole picture. Levels come first, for each channel; a gamma
/// above 1 brightens the middle:
///
///     v1 = (v - input_black) / (input_white - input_black);  where these are equal 0 below and 1 from there on
///     v2 = v1^(1 / gamma) where v1 is above 0, else v1;  an inverse gamma that isn't within 0..100 counts as 100
///     v3 = output_black + v2 (output_white - output_black)
///
/// The rest is done on the vectorscope (BT.709: Cb = (B - Y) / 1.8556 to the right, Cr = (R - Y) / 1.5748 up) and keeps
/// luma: a colour c = Cb + j Cr becomes
///
///     c' = saturation (cos h + j sin h) c + sqrt(1/2) |balance_amount balance_gain| (cos w + j sin w)
///
/// with h the hue angle and w the balance's, which a negative amount turns by half a circle. Alpha stays, but for the
/// output that shows it. The part beyond the split view stays as it was. The defaults change nothing.
inline constexpr auto kFastColorCorrectorParameters = JoinParameters(
    std::array<ParameterRow, 1>{{{0,
                                  "output",
                                  ParameterType::kInt,
                                  "",
                                  0,
                                  kFastCorrectorOutput_Count - 1,
                                  {kFastCorrectorOutput_Composite},
                                  &GetFastCorrectorOutputName}}},
    SplitViewParameters(1),
    std::array<ParameterRow, 5>{
        {{6, "hue_angle", ParameterType::kFloat, "degrees", -180, 180, {0}},
         {7, "balance_amount", ParameterType::kDouble, "%", 0, 100, {0}, nullptr, ParameterConversion::kPercent},
         {8, "balance_gain", ParameterType::kDouble, "%", 0, 100, {20}, nullptr, ParameterConversion::kPercent},
         {9, "balance_angle", ParameterType::kFloat, "degrees", -360, 360, {0}},
         {11, "saturation", ParameterType::kDouble, "%", 0, 200, {100}}}},
    std::array<ParameterRow, 5>{{LevelParameter(21, "input_black", 0, ""),
                                 {22, "input_gamma", ParameterType::kDouble, "", 0.1, 10, {1}},
                                 LevelParameter(23, "input_white", 255, ""),
                                 LevelParameter(24, "output_black", 0, ""),
                                 LevelParameter(25, "output_white", 255, "")}});
inline constexpr EffectRow kFastColorCorrectorEffect =
    MakeEffectRow("TQ.XQVE Fast Color Corrector", "Fast Color Corrector",
                  "Corrects levels, hue, saturation and balance.", kFastColorCorrectorParameters);

}  // namespace Vantrel
