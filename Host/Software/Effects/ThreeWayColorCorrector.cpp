// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/ThreeWayColorCorrector.h"

#include <complex>

#include "Host/Software/CorrectorControls.h"

namespace Vantrel::Host::Software {
namespace {

using Complex = std::complex<double>;

Complex Direction(double degrees) { return std::polar(1.0, degrees * 3.14159265358979323846 / 180.0); }

Levels ReadLevels(const EffectContext& context) {
    return {context.Number(100) / 255.0, context.Number(102) / 255.0, 1.0 / context.Number(101),
            context.Number(103) / 255.0, context.Number(104) / 255.0};
}

/// A wheel's three parameters.
Complex ReadTint(const EffectContext& context, std::int32_t first) {
    const double amount = context.Number(first) / 100.0, gain = context.Number(first + 1) / 100.0;
    return std::sqrt(0.5) * amount * std::abs(gain) * Direction(context.Number(first + 2));
}

/// What becomes of the colour in one tonal range.
struct RangeControls {
    Complex turn, tint;
};

RangeControls ReadRangeControls(const EffectContext& context, std::int32_t range) {
    const std::int32_t hueAngle = 76 + 6 * range;
    return {context.Number(25 + range) / 100.0 * Direction(context.Number(hueAngle) + context.Number(94)),
            ReadTint(context, hueAngle + 1) + ReadTint(context, 95)};
}

}  // namespace

void RunThreeWayColorCorrector(const EffectContext& context, LayerPicture& layer) {
    const Corrector corrector = ReadCorrector(context, layer, {32, 37, 19, 2, 18});
    const Levels levels = ReadLevels(context);
    const std::array<RangeControls, 3> ranges = {ReadRangeControls(context, 0), ReadRangeControls(context, 1),
                                                 ReadRangeControls(context, 2)};
    RunCorrector(layer.picture, corrector, [&](const Pixel& p) {
        const TonalShares shares = ShareTones(Luma(p), corrector.range);
        Pixel levelled = p;
        for (std::size_t c = 0; c < 3; ++c) levelled[c] = LevelsChannel(p[c], levels);
        const ColorDifference from = DifferenceOf(levelled);
        const Complex turn =
            shares.shadow * ranges[0].turn + shares.midtone * ranges[1].turn + shares.highlight * ranges[2].turn;
        const Complex tint =
            shares.shadow * ranges[0].tint + shares.midtone * ranges[1].tint + shares.highlight * ranges[2].tint;
        const Complex to = turn * Complex(from.cb, from.cr) + tint;
        return ColorOf(Luma(levelled), {to.real(), to.imag()}, p[3]);
    });
}

}  // namespace Vantrel::Host::Software
