// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/DropShadow.h"

#include <utility>

#include "Host/Software/Effects/ColorMath.h"
#include "Host/Software/Effects/Selection.h"
#include "Vantrel/Effects/DropShadow.h"

namespace Vantrel::Host::Software {
namespace {

/// The picture's pixel there; transparent outside.
Pixel GetOrNothing(const Picture& picture, int x, int y) {
    return x >= 0 && x < picture.width && y >= 0 && y < picture.height ? picture.Get(x, y) : Pixel{};
}

Pixel Over(const Pixel& front, const Pixel& shadow) {
    const double alpha = Limit(front[3], 0.0, 1.0), behind = shadow[3] * (1.0 - alpha);
    if (!(behind > 0.0)) return front;
    Pixel result = shadow;
    result[3] = alpha + behind;
    for (std::size_t c = 0; c < 3 && alpha > 0.0; ++c) {
        result[c] = (front[c] * alpha + shadow[c] * behind) / result[3];
        if (std::isnan(result[c])) result[c] = front[c];
    }
    return result;
}

}  // namespace

void RunDropShadow(const EffectContext& context, LayerPicture& layer) {
    const bool shadowOnly = context.Flag(kDropShadow_ShadowOnly);
    const double opacity = context.Number(kDropShadow_Opacity) / 255.0;
    const Picture source = std::move(layer.picture);
    if (opacity == 0.0) {
        layer.picture = shadowOnly ? Picture(source.width, source.height) : source;
        return;
    }
    const auto single = [](double value) { return static_cast<float>(value); };
    const ShadowPlace place =
        PlaceShadow(source.width, source.height, single(context.Number(kDropShadow_Direction)),
                    single(context.Number(kDropShadow_Distance)), single(context.Number(kDropShadow_Softness)),
                    single(context.view.ScaleX()), single(context.view.ScaleY()));
    Mask mask{place.width, place.height, {}};
    for (int y = 0; y < place.height; ++y) {
        for (int x = 0; x < place.width; ++x) {
            mask.shares.push_back(Limit(GetOrNothing(source, x - place.shadowX, y - place.shadowY)[3], 0.0, 1.0));
        }
    }
    if (place.sigmaX > 0.0F && place.sigmaY > 0.0F) BlurMask(mask, double{place.sigmaX}, double{place.sigmaY});

    const std::array<double, 4> color = context.value(kDropShadow_Color);  // red first
    layer.picture = Picture(place.width, place.height);
    for (int y = 0; y < place.height; ++y) {
        for (int x = 0; x < place.width; ++x) {
            const Pixel front = shadowOnly ? Pixel{} : GetOrNothing(source, x - place.left, y - place.top);
            const double share = Limit(mask.At(x, y) * opacity, 0.0, 1.0);
            layer.picture.Set(x, y, Over(front, {color[2], color[1], color[0], share}));
        }
    }
    layer.origin = {layer.origin.x + place.left, layer.origin.y + place.top};
}

}  // namespace Vantrel::Host::Software
