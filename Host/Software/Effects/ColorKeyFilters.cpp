// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cmath>

#include "Host/Software/Effects/ColorMath.h"
#include "Host/Software/Effects/PointwiseFilters.h"

namespace Vantrel::Host::Software {
namespace {

/// How near a colour is to the key colour, 0 to 1.
double KeyShare(const Pixel& p, const Pixel& key, double similarity) {
    constexpr double kSoftness = 1.0 / 16.0;
    const ColorDifference a = DifferenceOf(p), b = DifferenceOf(key);
    return 1.0 - SmoothRamp(similarity, similarity + kSoftness, std::hypot(a.cb - b.cb, a.cr - b.cr));
}

}  // namespace

void RunColorPass(const EffectContext& context, LayerPicture& layer) {
    const double similarity = context.Number(0) / 127.0;
    const bool reverses = context.Flag(1);
    const Pixel key = ReadColor(context, 2);
    ChangePixels(layer.picture, [&](const Pixel& p, int, int) {
        const double share = KeyShare(p, key, similarity), luma = Luma(p);
        return MixColor(p, {luma, luma, luma, p[3]}, reverses ? share : 1.0 - share);
    });
}

void RunColorReplace(const EffectContext& context, LayerPicture& layer) {
    const double similarity = context.Number(0) / 127.0;
    const bool solid = context.Flag(1);
    const Pixel target = ReadColor(context, 2), replacement = ReadColor(context, 3);
    const double change = Luma(replacement) - Luma(target);
    ChangePixels(layer.picture, [&](const Pixel& p, int, int) {
        Pixel moved = p;
        for (std::size_t c = 0; c < 3; ++c) moved[c] += replacement[c] - target[c] - change;
        return MixColor(p, solid ? replacement : moved, KeyShare(p, target, similarity));
    });
}

}  // namespace Vantrel::Host::Software
