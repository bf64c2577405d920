// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstdint>

#include "Host/Software/EffectContext.h"
#include "Vantrel/Effects/UltraKey.h"

namespace Vantrel::Host::Software {

/// A keyer's controls as fractions; formulas: Vantrel/Effects/UltraKey.h.
struct UltraKey {
    std::int32_t output = kUltraKeyOutput_Composite;
    Pixel key{};
    double transparency = 0.5, highlight = 0.0, shadow = 0.5, tolerance = 0.5, pedestal = 0.0;
    double contrast = 0.0, midPoint = 0.5;
    double desaturate = 0.0, range = 0.5, spill = 0.5, luma = 0.5;
    double saturation = 1.0, hueDegrees = 0.0, luminance = 1.0;
    /// In pixels, across and down; parts of a pixel are had by the one down.
    std::array<double, 2> chokeReach{}, softenReach{};
};

void ApplyUltraKey(Picture& picture, const UltraKey& controls);
void RunUltraKey(const EffectContext& context, LayerPicture& layer);

}  // namespace Vantrel::Host::Software
