// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/TrackMatte.h"

#include <algorithm>
#include <cmath>

#include "Host/Software/Effects/ColorMath.h"
#include "Vantrel/Effects/TrackMatte.h"

namespace Vantrel::Host::Software {
namespace {

double Share(const Picture& matte, int x, int y, bool byLuma) {
    const Pixel p = matte.Get(std::clamp(x, 0, matte.width - 1), std::clamp(y, 0, matte.height - 1));
    const double alpha = std::clamp(p[3], 0.0, 1.0);
    return byLuma ? alpha * std::clamp(Luma(p), 0.0, 1.0) : alpha;
}

double ShareBetween(const Picture& matte, double u, double v, bool byLuma) {
    const double left = std::floor(u), upper = std::floor(v);
    const auto row = [&](int y) {
        const int x = static_cast<int>(left);
        return Share(matte, x, y, byLuma) * (1.0 - (u - left)) + Share(matte, x + 1, y, byLuma) * (u - left);
    };
    const int y = static_cast<int>(upper);
    return row(y) * (1.0 - (v - upper)) + row(y + 1) * (v - upper);
}

}  // namespace

void ApplyTrackMatte(const Picture& matte, bool byLuma, bool reverse, Picture& picture) {
    const double stepX = static_cast<double>(matte.width) / picture.width;
    const double stepY = static_cast<double>(matte.height) / picture.height;
    for (int y = 0; y < picture.height; ++y) {
        for (int x = 0; x < picture.width; ++x) {
            Pixel p = picture.Get(x, y);
            const double share = ShareBetween(matte, (x + 0.5) * stepX - 0.5, (y + 0.5) * stepY - 0.5, byLuma);
            p[3] *= reverse ? 1.0 - share : share;
            picture.Set(x, y, p);
        }
    }
}

void RunTrackMatte(const EffectContext& context, LayerPicture& layer) {
    if (context.Integer(kTrackMatte_Track) <= 0) return;
    const bool byLuma = context.Integer(kTrackMatte_Using) != kTrackMatteUsing_Alpha;
    const bool reverse = context.Flag(kTrackMatte_Reverse);
    if (context.matte) {
        ApplyTrackMatte(context.matte(), byLuma, reverse, layer.picture);
    } else if (byLuma != reverse) {
        Picture black(1, 1);
        black.Set(0, 0, {0, 0, 0, 1});
        ApplyTrackMatte(black, byLuma, reverse, layer.picture);
    }
}

}  // namespace Vantrel::Host::Software
