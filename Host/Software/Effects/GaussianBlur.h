// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Software/EffectContext.h"

namespace Vantrel::Host::Software {

/// Convolves with sampled Gaussians, colour weighed by alpha. A sigma of 0 leaves its direction alone.
/// @param padX,padY  what the picture grows by on each side
/// @param clamped    outside the picture its edge pixels go on; else nothing lies there
[[nodiscard]] Picture GaussianBlur(const Picture& picture, double sigmaX, double sigmaY, int padX, int padY,
                                   bool clamped);

/// The effects "Gaussian Blur" and "Fast Blur": Vantrel/Effects/GaussianBlur.h.
void RunGaussianBlur(const EffectContext& context, LayerPicture& layer);

}  // namespace Vantrel::Host::Software
