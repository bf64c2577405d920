// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/DirectionalBlur.h"

#include <cmath>

#include "Host/Software/Effects/GaussianBlur.h"
#include "Vantrel/Effects/DirectionalBlur.h"

namespace Vantrel::Host::Software {
namespace {

/// Shifts each line by as much as it lies off the middle; outside nothing lies.
Picture Shear(const Picture& picture, int width, int height, bool horizontal, double shear) {
    Picture result(width, height);
    for (int y = 0; y < height; ++y) {
        for (int x = 0; x < width; ++x) {
            const int place = horizontal ? y : x, lines = horizontal ? height : width;
            const int size = horizontal ? width : height, sourceSize = horizontal ? picture.width : picture.height;
            const double position =
                (horizontal ? x : y) + (sourceSize - size) / 2.0 - shear * (place + 0.5 - lines / 2.0);
            const double whole = std::floor(position);
            Pixel sum{};
            for (int tap = 0; tap < 2; ++tap) {
                const int along = static_cast<int>(whole) + tap;
                if (along < 0 || along >= sourceSize) continue;
                const Pixel p = horizontal ? picture.Get(along, y) : picture.Get(x, along);
                const double covered = p[3] * (tap == 0 ? 1.0 - (position - whole) : position - whole);
                if (!(covered > 0.0)) continue;
                for (std::size_t c = 0; c < 3; ++c) sum[c] += p[c] * covered;
                sum[3] += covered;
            }
            for (std::size_t c = 0; c < 3 && sum[3] > 0.0; ++c) sum[c] /= sum[3];
            result.Set(x, y, sum);
        }
    }
    return result;
}

}  // namespace

void RunDirectionalBlur(const EffectContext& context, LayerPicture& layer) {
    const auto single = [](double value) { return static_cast<float>(value); };
    const ShearPlan plan = MakeShearPlan(single(context.Number(kDirectionalBlur_Direction)),
                                         single(context.Number(kDirectionalBlur_Length)), single(context.view.ScaleX()),
                                         single(context.view.ScaleY()), single(layer.aspect.Value()));
    if (!(plan.sigma > 0.0F)) return;
    const bool horizontal = plan.horizontal != 0;
    const int width = layer.picture.width, height = layer.picture.height;
    const int padX = plan.GetPadX(), padY = plan.GetPadY();
    const Picture sheared =
        horizontal ? Shear(layer.picture, plan.GetShearedSize(width, height), height, true, double{plan.shear})
                   : Shear(layer.picture, width, plan.GetShearedSize(height, width), false, double{plan.shear});
    const auto sigma = double{plan.sigma};
    const Picture blurred =
        horizontal ? GaussianBlur(sheared, 0, sigma, 0, padY, false) : GaussianBlur(sheared, sigma, 0, padX, 0, false);
    layer.picture = Shear(blurred, width + 2 * padX, height + 2 * padY, horizontal, -double{plan.shear});
    layer.origin = {layer.origin.x + padX, layer.origin.y + padY};
}

}  // namespace Vantrel::Host::Software
