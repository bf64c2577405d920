// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// Maps luma (BT.709) onto the line between two colours: c' = c + amount (black + Y (white - black) - c). Alpha stays.
/// The defaults change nothing.
inline constexpr ParameterRow kTintParameters[] = {
    {0, "map_black", ParameterType::kColor, "", 0, 1, {0, 0, 0, 1}},
    {1, "map_white", ParameterType::kColor, "", 0, 1, {1, 1, 1, 1}},
    {2, "amount", ParameterType::kFloat, "%", 0, 100, {0}, nullptr, ParameterConversion::kPercent},
};
inline constexpr EffectRow kTintEffect =
    MakeEffectRow("TQ.XQVE Tint", "Tint", "Maps luma onto the line between two colours.", kTintParameters);

}  // namespace Vantrel
