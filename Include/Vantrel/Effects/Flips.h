// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// Mirrors the picture: x' = width - 1 - x. No parameters.
inline constexpr EffectRow kHorizontalFlipEffect = {"KL.XQVE Horizontal Flip", "Horizontal Flip",
                                                    "Mirrors the picture from left to right.", nullptr, 0};

/// Mirrors the picture: y' = height - 1 - y. No parameters.
inline constexpr EffectRow kVerticalFlipEffect = {"KL.XQVE Vertical Flip", "Vertical Flip",
                                                  "Mirrors the picture from top to bottom.", nullptr, 0};

}  // namespace Vantrel
