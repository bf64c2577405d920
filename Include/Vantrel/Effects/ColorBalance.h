// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// A gain for each channel: c' = c gain / 255. 255 leaves a channel alone, 0 takes it away, 510 doubles it. Alpha
/// stays. The defaults change nothing.
[[nodiscard]] constexpr ParameterRow ColorGainParameter(std::int32_t index, const char* name) {
    return {index, name, ParameterType::kInt, "of 255", 0, 510, {255}, nullptr, ParameterConversion::kLevel};
}
inline constexpr ParameterRow kColorBalanceParameters[] = {
    ColorGainParameter(0, "red"),
    ColorGainParameter(1, "green"),
    ColorGainParameter(2, "blue"),
};
inline constexpr EffectRow kColorBalanceEffect = MakeEffectRow(
    "KL.XQVE Color Balance", "Color Balance", "A gain for each of red, green and blue.", kColorBalanceParameters);

}  // namespace Vantrel
