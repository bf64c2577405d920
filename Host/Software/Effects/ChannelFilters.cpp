// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cmath>

#include "Host/Software/Effects/ColorMath.h"
#include "Host/Software/Effects/PointwiseFilters.h"

namespace Vantrel::Host::Software {
namespace {

template <class Change>
void ChangeChannels(Picture& picture, const Change& change) {
    ChangePixels(picture, [&](Pixel p, int, int) {
        for (std::size_t c = 0; c < 3; ++c) p[c] = change(p[c], c);
        return p;
    });
}

}  // namespace

void RunBrightnessContrast(const EffectContext& context, LayerPicture& layer) {
    // In single precision: next to full contrast the line is so steep that each rounding of the interval shows.
    const float b = static_cast<float>(context.Number(0)) / 255.0F, c = static_cast<float>(context.Number(1)) / 200.0F;
    const float inLow = c >= 0.0F ? c - b : 0.0F, inHigh = c >= 0.0F ? 1.0F - c - b : 1.0F;
    const double outLow = c >= 0.0F ? 0.0F : b - c, outHigh = c >= 0.0F ? 1.0F : c + 1.0F + b;
    const double interval = inHigh - inLow;
    ChangeChannels(layer.picture, [&](double v, std::size_t) {
        if (std::abs(interval) < 8e-6) return v < inLow ? outLow : outHigh;
        return outLow + (v - inLow) / interval * (outHigh - outLow);
    });
}

void RunColorBalance(const EffectContext& context, LayerPicture& layer) {
    const std::array<double, 3> gains = {context.Number(2) / 255.0, context.Number(1) / 255.0,
                                         context.Number(0) / 255.0};
    ChangeChannels(layer.picture, [&](double v, std::size_t c) { return v * gains.at(c); });
}

void RunGammaCorrection(const EffectContext& context, LayerPicture& layer) {
    const double power = context.Number(0) / 10.0;
    ChangeChannels(layer.picture, [exponent = power >= 0.0 && power <= 100.0 ? power : 100.0](double v, std::size_t) {
        return PowerLevel(v, exponent);
    });
}

}  // namespace Vantrel::Host::Software
