// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <algorithm>

#include "Host/Software/Effects/ColorMath.h"
#include "Host/Software/Effects/PointwiseFilters.h"

namespace Vantrel::Host::Software {

void RunBlackAndWhite(const EffectContext& /*context*/, LayerPicture& layer) {
    ChangePixels(layer.picture, [](const Pixel& p, int, int) {
        const double luma = Luma(p);
        return Pixel{luma, luma, luma, p[3]};
    });
}

void RunExtract(const EffectContext& context, LayerPicture& layer) {
    const double black = context.Number(0) / 255.0, white = context.Number(1) / 255.0;
    const double softness = std::max(context.Number(2) / 255.0, 1.0 / 255.0);
    const bool inverts = context.Flag(3);
    ChangePixels(layer.picture, [&](const Pixel& p, int, int) {
        const double luma = Luma(p);
        const double below = black > 0.0 ? Limit(1.0 + (luma - black) / softness, 0.0, 1.0) : 1.0;
        const double above = white < 1.0 ? Limit(1.0 + (white - luma) / softness, 0.0, 1.0) : 1.0;
        const double share = std::min(below, above);
        const double grey = inverts ? 1.0 - share : share;
        return Pixel{grey, grey, grey, p[3]};
    });
}

void RunTint(const EffectContext& context, LayerPicture& layer) {
    const Pixel black = ReadColor(context, 0), white = ReadColor(context, 1);
    const double amount = context.Number(2) / 100.0;
    ChangePixels(layer.picture,
                 [&](const Pixel& p, int, int) { return MixColor(p, MixColor(black, white, Luma(p)), amount); });
}

}  // namespace Vantrel::Host::Software
