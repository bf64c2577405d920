// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <vector>

#include "Host/Software/Picture.h"

namespace Vantrel::Host::Software {

/// A selection by colour, as its controls give it: Vantrel/Effects/CorrectorParameters.h. Edges and softness in turns
/// (hue) or in 0..1.
struct Selection {
    struct Range {
        double low, lowSoftness, high, highSoftness;
    };
    double hueCenter = 0.0;
    Range hue{0.5, 0.0, 0.5, 0.0};
    Range saturation{0.0, 0.0, 1.0, 0.0};
    Range luma{0.0, 0.0, 1.0, 0.0};
    double blurX = 0.0;  ///< Gaussian, in pixels
    double blurY = 0.0;
    double thinning = 0.0;
    bool inverted = false;
};

/// One number a pixel, in rows without gaps.
struct Mask {
    int width = 0;
    int height = 0;
    std::vector<double> shares;

    [[nodiscard]] double At(int x, int y) const {
        return shares[static_cast<std::size_t>(y) * static_cast<std::size_t>(width) + static_cast<std::size_t>(x)];
    }
};

/// The share of each pixel of the picture's first `width` columns and `height` rows that is selected.
[[nodiscard]] Mask MakeMask(const Picture& picture, int width, int height, const Selection& selection);

/// The recursive Gaussian of the device, second order; R. Deriche, "Recursively implementing the Gaussian and its
/// derivatives", INRIA 1993. Both sigmas above 0.
void BlurMask(Mask& mask, double sigmaX, double sigmaY);

}  // namespace Vantrel::Host::Software
