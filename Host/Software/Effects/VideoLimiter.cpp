// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/VideoLimiter.h"

#include <algorithm>

#include "Host/Software/CorrectorControls.h"
#include "Vantrel/Effects/VideoLimiter.h"

namespace Vantrel::Host::Software {
namespace {

struct Limits {
    double low, high;
    [[nodiscard]] double Apply(double value) const { return std::min(std::max(value, low), high); }
};

Limits ReadLimits(const EffectContext& context, std::int32_t first) {
    return {context.Number(first) / 100.0, context.Number(first + 1) / 100.0};
}

double Chroma(const Pixel& p) {
    const double luma = Luma(p);
    return std::hypot(0.492111 * (p[0] - luma), 0.877283 * (p[2] - luma));
}

/// The pixel with another luma and another chroma.
Pixel WithSignal(const Pixel& p, double luma, double chroma) {
    const double old = Luma(p), scale = chroma == Chroma(p) ? 1.0 : chroma / Chroma(p);
    return {luma + scale * (p[0] - old), luma + scale * (p[1] - old), luma + scale * (p[2] - old), p[3]};
}

Pixel LimitPixel(const EffectContext& context, const Pixel& p) {
    double luma = Luma(p), chroma = Chroma(p);
    const std::int32_t axis = context.Integer(3);
    if (axis == kVideoLimiterAxis_Luma || axis == kVideoLimiterAxis_LumaAndChroma) {
        luma = ReadLimits(context, 4).Apply(luma);
    }
    if (axis == kVideoLimiterAxis_Chroma || axis == kVideoLimiterAxis_LumaAndChroma) {
        Limits limits = ReadLimits(context, 6);
        if (chroma <= 1.0 / 4096.0) limits.low = 0.0;
        chroma = std::max(limits.Apply(chroma), 0.0);
    }
    if (axis == kVideoLimiterAxis_Signal) {
        const Limits limits = ReadLimits(context, 8);
        luma = limits.Apply(luma);
        chroma = std::min(chroma, std::max(std::min(limits.high - luma, luma - limits.low), 0.0));
    }
    return WithSignal(p, luma, chroma);
}

double ReductionShare(const TonalShares& shares, std::int32_t method) {
    switch (method) {
        case kVideoLimiterMethod_Highlights:
            return shares.highlight;
        case kVideoLimiterMethod_Midtones:
            return shares.midtone;
        case kVideoLimiterMethod_Shadows:
            return shares.shadow;
        default:
            return 1.0;
    }
}

}  // namespace

void RunVideoLimiter(const EffectContext& context, LayerPicture& layer) {
    Corrector corrector;
    ReadSplitView(context, 0, corrector);
    for (std::int32_t i = 0; i < 4; ++i) {
        corrector.range[static_cast<std::size_t>(i)] = context.Number(13 + i) / 255.0;
    }
    RunCorrector(layer.picture, corrector, [&](const Pixel& p) {
        const double share = ReductionShare(ShareTones(Luma(p), corrector.range), context.Integer(10));
        const Pixel limited = LimitPixel(context, p);
        Pixel result = p;
        for (std::size_t c = 0; c < 3; ++c) result[c] += share * (limited[c] - p[c]);
        return result;
    });
}

}  // namespace Vantrel::Host::Software
