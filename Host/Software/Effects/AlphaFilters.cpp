// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <algorithm>

#include "Host/Software/Effects/PointwiseFilters.h"

namespace Vantrel::Host::Software {

void RunAlphaAdjust(const EffectContext& context, LayerPicture& layer) {
    const double opacity = context.Number(0) / 100.0;
    const bool ignores = context.Flag(1), inverts = context.Flag(2), maskOnly = context.Flag(3);
    ChangePixels(layer.picture, [&](Pixel p, int, int) {
        if (ignores) p[3] = 1.0;
        if (inverts) p[3] = 1.0 - p[3];
        if (maskOnly) p[0] = p[1] = p[2] = 1.0;
        p[3] *= opacity;
        return p;
    });
}

void RunEdgeFeather(const EffectContext& context, LayerPicture& layer) {
    const double reach = std::max(context.Number(0) * 4.0 / 3.0 + 0.5, 0.5);
    const auto share = [reach](int at, int size) {
        const double distance = std::min(at + 0.5, size - at - 0.5);
        return std::min(distance / reach, 1.0);
    };
    ChangePixels(layer.picture, [&](Pixel p, int x, int y) {
        p[3] *= share(x, layer.picture.width) * share(y, layer.picture.height);
        return p;
    });
}

}  // namespace Vantrel::Host::Software
