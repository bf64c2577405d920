// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// Raises each channel to a power: c' = c^(gamma / 10) where c is above 0, else c. As usual for this control a gamma
/// below 10 lightens the middle and one above darkens it; 0 and 1 stay. A power that isn't within 0..100 counts as 100.
/// Alpha stays. The default changes nothing.
inline constexpr ParameterRow kGammaCorrectionParameters[] = {
    {0, "gamma", ParameterType::kInt, "tenths", 1, 28, {10}},
};
inline constexpr EffectRow kGammaCorrectionEffect =
    MakeEffectRow("KL.XQVE Gamma Correction", "Gamma Correction", "Lightens or darkens the middle levels.",
                  kGammaCorrectionParameters);

}  // namespace Vantrel
