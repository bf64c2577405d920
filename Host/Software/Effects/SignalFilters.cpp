// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cmath>
#include <complex>

#include "Host/Software/Effects/ColorMath.h"
#include "Host/Software/Effects/PointwiseFilters.h"
#include "Vantrel/Effects/FastColorCorrector.h"

namespace Vantrel::Host::Software {
namespace {

constexpr double kRadiansPerDegree = 3.14159265358979323846 / 180.0;

/// How much of a size a split view works on; cut in single precision, as the engine cuts it.
int SplitSize(int size, double percent) {
    const float share = static_cast<float>(percent) / 100.0F;
    return static_cast<int>(Limit(static_cast<float>(size) * share, 0.0, size));
}

/// The colour with its luma kept and its place on the vectorscope changed by a factor and a sum.
Pixel Turn(const Pixel& p, std::complex<double> factor, std::complex<double> tint) {
    const ColorDifference difference = DifferenceOf(p);
    const std::complex<double> turned = factor * std::complex<double>(difference.cb, difference.cr) + tint;
    return ColorOf(Luma(p), {turned.real(), turned.imag()}, p[3]);
}

/// What an 8-bit level is in the engine: a narrow interval shows how it was rounded.
double Level(const EffectContext& context, std::int32_t index) {
    return static_cast<float>(context.Number(index)) / 255.0F;
}

}  // namespace

void RunFastColorCorrector(const EffectContext& context, LayerPicture& layer) {
    const std::int32_t output = context.Integer(0);
    int columns = layer.picture.width, rows = layer.picture.height;
    if (context.Flag(1)) {
        int& split = context.Integer(2) == kSplitLayout_Columns ? columns : rows;
        split = SplitSize(split, context.Number(3));
    }
    const Levels levels = {Level(context, 21), Level(context, 23), 1.0F / static_cast<float>(context.Number(22)),
                           Level(context, 24), Level(context, 25)};
    const auto factor = std::polar(1.0, context.Number(6) * kRadiansPerDegree) * (context.Number(11) / 100.0);
    const double amount = context.Number(7) / 100.0;
    const auto direction = std::polar(std::sqrt(0.5), context.Number(9) * kRadiansPerDegree);
    const auto tint = direction * (amount * std::abs(context.Number(8) / 100.0));
    ChangePixels(layer.picture, [&](const Pixel& p, int x, int y) {
        if (x >= columns || y >= rows) return p;
        if (output == kFastCorrectorOutput_Mask) return Pixel{p[3], p[3], p[3], 1.0};
        Pixel levelled = p;
        for (std::size_t c = 0; c < 3; ++c) levelled[c] = LevelsChannel(p[c], levels);
        const double luma = Luma(levelled);
        return output == kFastCorrectorOutput_Luma ? Pixel{luma, luma, luma, p[3]} : Turn(levelled, factor, tint);
    });
}

void RunProcAmp(const EffectContext& context, LayerPicture& layer) {
    const double brightness = context.Number(0) / 100.0, contrast = context.Number(1) / 100.0;
    const auto factor = std::polar(1.0, context.Number(2) * kRadiansPerDegree) * (context.Number(3) / 100.0);
    const int columns = context.Flag(4) ? SplitSize(layer.picture.width, context.Number(5)) : layer.picture.width;
    ChangePixels(layer.picture, [&](const Pixel& p, int x, int) {
        if (x >= columns) return p;
        Pixel result = Turn(p, factor, 0.0);
        for (std::size_t c = 0; c < 3; ++c) result[c] = contrast * result[c] + brightness;
        return result;
    });
}

}  // namespace Vantrel::Host::Software
