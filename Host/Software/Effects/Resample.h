// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Software/Picture.h"
#include "Vellum/Geometry.h"

namespace Vantrel::Host::Software {

/// The picture at a place (u, v), in pixels from its upper left corner; a pixel's centre lies at its index and a half.
/// Beyond the border the border's pixels go on. Colour is weighed by alpha, and alpha comes out between 0 and 1
/// whatever the filter does.
///
/// Filters by quality: the nearest pixel as it is (kDraft, kLow); the tent (kMedium); the Catmull-Rom cubic (kHigh,
/// kMaximum; Keys, "Cubic convolution interpolation for digital image processing", 1981, a = -1/2). The last two are
/// stretched where the footprint is wider than a pixel, the cubic by the footprint, the tent by half a pixel less (a
/// slight reduction it bears as it is), and normalised. The cubic's negative weights can cancel nearly all of an alpha
/// and leave colour over: where less than a quarter of alpha carries a colour beyond -2..2, the colour is brought back
/// between those of the pixels that took part.
/// @param footprintU,footprintV how much of the picture one pixel of the result covers in each direction, in pixels
[[nodiscard]] Pixel Sample(const Picture& picture, double u, double v, double footprintU, double footprintV,
                           Vellum::RenderQuality quality);

/// Resamples the whole source onto the whole target, upper left corners together.
/// @param scaleX,scaleY target pixels for a source pixel
void Resample(const Picture& source, Picture& target, double scaleX, double scaleY, Vellum::RenderQuality quality);

}  // namespace Vantrel::Host::Software
