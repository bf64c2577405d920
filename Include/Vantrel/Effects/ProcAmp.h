// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// The controls of a processing amplifier for video: contrast is the gain of the whole signal, brightness is added to
/// it, hue turns the colours on the vectorscope and saturation is the gain of chroma. With Cb = (B - Y) / 1.8556 to the
/// right and Cr = (R - Y) / 1.5748 up (BT.709) and c = Cb + j Cr:
///
///     Y' = contrast Y + brightness,  c' = contrast saturation (cos hue + j sin hue) c
///
/// The split view changes the left part of the picture only. Alpha stays. The defaults change nothing.
inline constexpr ParameterRow kProcAmpParameters[] = {
    {0, "brightness", ParameterType::kFloat, "%", -100, 100, {0}, nullptr, ParameterConversion::kPercent},
    {1, "contrast", ParameterType::kFloat, "%", 0, 200, {100}, nullptr, ParameterConversion::kPercent},
    {2, "hue", ParameterType::kFloat, "degrees", -180, 180, {0}},
    {3, "saturation", ParameterType::kFloat, "%", 0, 200, {100}, nullptr, ParameterConversion::kPercent},
    {4, "split_view", ParameterType::kBool, "", 0, 1, {0}},
    {5, "split_percent", ParameterType::kFloat, "%", 0, 100, {50}, nullptr, ParameterConversion::kPercent},
};
inline constexpr EffectRow kProcAmpEffect = MakeEffectRow(
    "TQ.XQVE ProcAmp", "ProcAmp", "Brightness, contrast, hue and saturation of the signal.", kProcAmpParameters);

}  // namespace Vantrel
