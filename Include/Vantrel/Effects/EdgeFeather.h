// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// Lets the picture's border fade out. With w = amount 4/3 + 1/2, at least 1/2, in pixels of the frame, and x and y the
/// distances of a pixel's centre from the nearer upright and level edge: a' = a min(x / w, 1) min(y / w, 1). Colour
/// stays. The default changes nothing.
inline constexpr ParameterRow kEdgeFeatherParameters[] = {
    {0, "amount", ParameterType::kInt, "", 0, 100, {0}},
};
inline constexpr EffectRow kEdgeFeatherEffect =
    MakeEffectRow("KL.XQVE Edge Feather", "Edge Feather", "Lets the border fade out.", kEdgeFeatherParameters);

}  // namespace Vantrel
