// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Selection.h"

#include "Host/Software/Effects/ColorMath.h"

namespace Vantrel::Host::Software {
namespace {

double Turn(double turns) { return turns - std::floor(turns); }

double HueOf(const Pixel& p, double high, double chroma) {
    if (!(chroma > 0.0)) return 0.0;
    double sixths = 0.0;
    if (p[2] == high) {
        sixths = (p[1] - p[0]) / chroma;
    } else if (p[1] == high) {
        sixths = (p[0] - p[2]) / chroma + 2.0;
    } else {
        sixths = (p[2] - p[1]) / chroma + 4.0;
    }
    return (sixths < 0.0 ? sixths + 6.0 : sixths) / 6.0;
}

double Ramp(double distance, double softness) {
    if (distance <= 0.0) return 1.0;
    return softness > 0.0 ? std::max(1.0 - distance / softness, 0.0) : 0.0;
}

double LinearShare(double value, const Selection::Range& range) {
    return std::min(Ramp(range.low - value, range.lowSoftness), Ramp(value - range.high, range.highSoftness));
}

double HueShare(double hue, const Selection& selection) {
    const Selection::Range& range = selection.hue;
    const auto wrapped = [&selection](double edge) {
        const double turned = edge - selection.hueCenter;
        return turned < 0.0 ? turned + 1.0 : turned;
    };
    const double low = wrapped(range.low), high = wrapped(range.high);
    const bool anyHue = low == 0.5 && high == 0.5 && range.lowSoftness == 0.0 && range.highSoftness == 0.0;
    const bool wholeTurn = low == high && range.high > range.low;
    const double width = high < low ? high - low + 1.0 : high - low;
    if (anyHue || wholeTurn || width >= 1.0) return 1.0;
    const double beyondLow = Turn(hue - low);
    return std::max(Ramp(beyondLow - width, range.highSoftness), Ramp(1.0 - beyondLow, range.lowSoftness));
}

double Thin(double share, double thinning) {
    if (thinning > 0.0) return thinning < 1.0 ? std::max((share - thinning) / (1.0 - thinning), 0.0) : share >= 1.0;
    if (thinning < 0.0) return thinning > -1.0 ? std::min(share / (1.0 + thinning), 1.0) : share > 0.0;
    return share;
}

double ShareOf(const Pixel& p, const Selection& selection) {
    const double high = std::max({p[0], p[1], p[2]});
    const double chroma = high - std::min({p[0], p[1], p[2]});
    const double saturation = high > 0.0 ? Limit(chroma / high, 0.0, 1.0) : 0.0;
    const double share = HueShare(HueOf(p, high, chroma), selection) * LinearShare(saturation, selection.saturation) *
                         LinearShare(Limit(Luma(p), 0.0, 1.0), selection.luma);
    const double thinned = Thin(share, selection.thinning);
    return selection.inverted ? 1.0 - thinned : thinned;
}

/// Blurs `count` numbers, `step` apart.
void BlurLine(double* line, std::size_t count, std::size_t step, double sigma) {
    const double w = 0.8448 / sigma;
    const double e1 = std::exp(-1.26 / sigma), e2 = std::exp(-2.52 / sigma);
    const double c = std::cos(w), n = std::sin(w), d = 1.0 - 2.0 * c * e1 + e2;
    const double k = 2.0 * (0.9629 * (1.0 - c * e1) / d + 1.942 * n * e1 / d) - 0.9629;
    const double a0 = 0.9629 / k, a1 = (1.942 / k * n - a0 * c) * e1;
    const double a2 = a1 + 2.0 * c * e1 * a0, a3 = -e2 * a0;
    const double b1 = 2.0 * c * e1, b2 = -e2;
    const std::vector<double> x = [&] {
        std::vector<double> values(count);
        for (std::size_t i = 0; i < count; ++i) values[i] = line[i * step];
        return values;
    }();
    double y1 = x.front() * (a0 + a1) / (1.0 - b1 - b2), y2 = y1, x1 = x.front();
    for (std::size_t i = 0; i < count; ++i) {
        const double y = a0 * x[i] + a1 * x1 + b1 * y1 + b2 * y2;
        x1 = x[i];
        y2 = y1;
        y1 = y;
        line[i * step] = y;
    }
    double x2 = x1 = x.back();
    y1 = y2 = x.back() * (a2 + a3) / (1.0 - b1 - b2);
    for (std::size_t i = count; i-- > 0;) {
        const double y = a2 * x1 + a3 * x2 + b1 * y1 + b2 * y2;
        x2 = x1;
        x1 = x[i];
        y2 = y1;
        y1 = y;
        line[i * step] += y;
    }
}

}  // namespace

Mask MakeMask(const Picture& picture, int width, int height, const Selection& selection) {
    Mask mask{width, height, {}};
    mask.shares.reserve(static_cast<std::size_t>(width) * static_cast<std::size_t>(height));
    for (int y = 0; y < height; ++y) {
        for (int x = 0; x < width; ++x) mask.shares.push_back(ShareOf(picture.Get(x, y), selection));
    }
    if (selection.blurX > 0.0 || selection.blurY > 0.0) BlurMask(mask, selection.blurX, selection.blurY);
    return mask;
}

void BlurMask(Mask& mask, double sigmaX, double sigmaY) {
    const auto width = static_cast<std::size_t>(mask.width), height = static_cast<std::size_t>(mask.height);
    for (std::size_t x = 0; x < width; ++x) BlurLine(mask.shares.data() + x, height, width, sigmaY);
    for (std::size_t y = 0; y < height; ++y) BlurLine(mask.shares.data() + y * width, width, 1, sigmaX);
}

}  // namespace Vantrel::Host::Software
