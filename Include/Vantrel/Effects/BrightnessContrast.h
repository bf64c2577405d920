// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// Maps levels along a straight line, each channel for itself, with b = brightness / 255 and c = contrast / 200:
///
///     contrast from 0 up:  (c - b)..(1 - c - b) becomes 0..1
///     contrast below 0:    0..1 becomes (b - c)..(1 + c + b)
///
/// so that contrast turns the line about mid-grey and brightness moves it along. The line goes on beyond both ends;
/// nothing is clamped. Where the first interval is empty, at a contrast of 100, levels below it become 0 and the others
/// 1. Alpha stays. The defaults change nothing.
inline constexpr ParameterRow kBrightnessContrastParameters[] = {
    {0, "brightness", ParameterType::kFloat, "of 255", -255, 255, {0}},
    {1, "contrast", ParameterType::kFloat, "", -100, 100, {0}},
};
inline constexpr EffectRow kBrightnessContrastEffect =
    MakeEffectRow("TQ.XQVE Brightness & Contrast 2", "Brightness & Contrast", "Moves levels and spreads them.",
                  kBrightnessContrastParameters);

}  // namespace Vantrel
