// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vellum/Geometry.h"

namespace Marl {

/// The pixel aspect of a picture that was reduced from `streamRect` to `frameRect` by different factors in the two
/// directions, so that it shows in the same shape: aspect * (streamWidth / frameWidth) / (streamHeight / frameHeight),
/// reduced to lowest terms. An empty rectangle, or factors that agree, give `aspect` back.
[[nodiscard]] Vellum::PixelAspectRatio AdjustPixelAspectRatioForNonUniformDownsample(Vellum::PixelAspectRatio aspect,
                                                                                     const Vellum::Rect& streamRect,
                                                                                     const Vellum::Rect& frameRect);

}  // namespace Marl
