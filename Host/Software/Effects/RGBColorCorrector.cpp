// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/RGBColorCorrector.h"

#include "Host/Software/CorrectorControls.h"

namespace Vantrel::Host::Software {
namespace {

struct Controls {
    double pedestal, exponent, gain;
};

double Apply(const Controls& controls, double v) {
    return PowerLevel(v + controls.pedestal, controls.exponent) * controls.gain;
}

/// A range's controls of one channel (0 blue, 1 green, 2 red), those for all channels included.
Controls ReadControls(const EffectContext& context, std::int32_t range, std::int32_t channel) {
    const std::int32_t all = 13 + range * 3, own = 26 + range * 9 + (2 - channel) * 3;
    const auto number = [&context](std::int32_t index) { return context.Number(index); };
    return {number(all + 1) + number(own + 1), 1.0 / std::max(number(all) * number(own), 0.01),
            number(all + 2) * number(own + 2)};
}

Controls Between(const TonalShares& shares, const std::array<Controls, 4>& ranges) {
    const auto mix = [&](double Controls::*field) {
        return shares.shadow * ranges[1].*field + shares.midtone * ranges[2].*field +
               shares.highlight * ranges[3].*field;
    };
    return {mix(&Controls::pedestal), mix(&Controls::exponent), mix(&Controls::gain)};
}

}  // namespace

void RunRGBColorCorrector(const EffectContext& context, LayerPicture& layer) {
    const Corrector corrector = ReadCorrector(context, layer, {65, 70, 6});
    std::array<std::array<Controls, 4>, 3> controls{};
    for (std::int32_t channel = 0; channel < 3; ++channel) {
        for (std::int32_t range = 0; range < 4; ++range) {
            controls[static_cast<std::size_t>(channel)][static_cast<std::size_t>(range)] =
                ReadControls(context, range, channel);
        }
    }
    RunCorrector(layer.picture, corrector, [&](const Pixel& p) {
        const TonalShares shares = ShareTones(Luma(p), corrector.range);
        Pixel result = p;
        for (std::size_t c = 0; c < 3; ++c)
            result[c] = Apply(Between(shares, controls[c]), Apply(controls[c][0], p[c]));
        return result;
    });
}

}  // namespace Vantrel::Host::Software
