// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// Changes alpha alone. In this order: an ignored alpha counts as 1; an inverted one becomes 1 - a; then it is
/// multiplied by the opacity. Mask only puts white in place of the colours, so that what shows is the mask itself. The
/// defaults change nothing.
inline constexpr ParameterRow kAlphaAdjustParameters[] = {
    {0, "opacity", ParameterType::kFloat, "%", 0, 100, {100}, nullptr, ParameterConversion::kPercent},
    {1, "ignore_alpha", ParameterType::kBool, "", 0, 1, {0}},
    {2, "invert_alpha", ParameterType::kBool, "", 0, 1, {0}},
    {3, "mask_only", ParameterType::kBool, "", 0, 1, {0}},
};
inline constexpr EffectRow kAlphaAdjustEffect =
    MakeEffectRow("TQ.XQVE Alpha Adjust", "Alpha Adjust", "Changes opacity; ignores or inverts alpha, or shows it.",
                  kAlphaAdjustParameters);

}  // namespace Vantrel
