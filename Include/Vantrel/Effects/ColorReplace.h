// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/ColorPass.h"

namespace Vantrel {

/// Puts one colour in another's place, by the pixel's share in the target colour (SimilarityParameter):
///
///     c' = c + share ((replace - Y(replace)) - (target - Y(target)))
///
/// which moves the colour differences and keeps luma, and so light and shade; with solid colours
/// c' = c + share (replace - c). Alpha stays. The defaults change nothing.
inline constexpr ParameterRow kColorReplaceParameters[] = {
    SimilarityParameter(0),
    {1, "solid_colors", ParameterType::kInt, "", 0, 1, {0}},
    {2, "target_color", ParameterType::kColor, "", 0, 1, {1, 0, 0, 1}},
    {3, "replace_color", ParameterType::kColor, "", 0, 1, {1, 0, 0, 1}},
};
inline constexpr EffectRow kColorReplaceEffect = MakeEffectRow(
    "KL.XQVE Color Replace", "Color Replace", "Puts one colour in another's place.", kColorReplaceParameters);

}  // namespace Vantrel
