// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Software/EffectContext.h"

/// The filters that make a pixel from one pixel. The formulas of each: the header of its name in Vantrel/Effects.
namespace Vantrel::Host::Software {

// AlphaFilters.cpp
void RunAlphaAdjust(const EffectContext& context, LayerPicture& layer);
void RunEdgeFeather(const EffectContext& context, LayerPicture& layer);
// LumaFilters.cpp
void RunBlackAndWhite(const EffectContext& context, LayerPicture& layer);
void RunExtract(const EffectContext& context, LayerPicture& layer);
void RunTint(const EffectContext& context, LayerPicture& layer);
// ChannelFilters.cpp
void RunBrightnessContrast(const EffectContext& context, LayerPicture& layer);
void RunColorBalance(const EffectContext& context, LayerPicture& layer);
void RunGammaCorrection(const EffectContext& context, LayerPicture& layer);
// ColorKeyFilters.cpp
void RunColorPass(const EffectContext& context, LayerPicture& layer);
void RunColorReplace(const EffectContext& context, LayerPicture& layer);
// SignalFilters.cpp
void RunFastColorCorrector(const EffectContext& context, LayerPicture& layer);
void RunProcAmp(const EffectContext& context, LayerPicture& layer);
// PlaceFilters.cpp
void RunHorizontalFlip(const EffectContext& context, LayerPicture& layer);
void RunVerticalFlip(const EffectContext& context, LayerPicture& layer);
void RunNoise(const EffectContext& context, LayerPicture& layer);

/// Puts `change(pixel, x, y)` in the place of each pixel.
template <class Change>
void ChangePixels(Picture& picture, const Change& change) {
    for (int y = 0; y < picture.height; ++y) {
        for (int x = 0; x < picture.width; ++x) picture.Set(x, y, change(picture.Get(x, y), x, y));
    }
}

/// Blue, green, red, alpha, as pixels have them.
[[nodiscard]] inline Pixel ReadColor(const EffectContext& context, std::int32_t index) {
    const std::array<double, 4> color = context.value(index);
    return {color[2], color[1], color[0], color[3]};
}

/// From p to q in colour, alpha staying.
[[nodiscard]] inline Pixel MixColor(Pixel p, const Pixel& q, double share) {
    for (std::size_t c = 0; c < 3; ++c) p[c] += share * (q[c] - p[c]);
    return p;
}

}  // namespace Vantrel::Host::Software
