// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Curves.h"

#include <algorithm>

#include "Host/Software/CorrectorControls.h"
#include "Vantrel/Effects/Curves.h"

namespace Vantrel::Host::Software {
namespace {

double ReadLevel(const EffectContext& context, std::int32_t index) {
    const auto whole = static_cast<std::int64_t>(context.Number(index));
    return static_cast<double>(static_cast<float>(whole & 0xFF) / 255.0F);
}

Curve ReadCurve(const EffectContext& context, std::int32_t first) {
    std::vector<Curve::Point> points;
    std::size_t count = 0;
    for (std::size_t i = 0; i < kCurvePoints; ++i) {
        const std::int32_t index = first + 2 * static_cast<std::int32_t>(i);
        points.push_back({ReadLevel(context, index), ReadLevel(context, index + 1)});
        if (points.back().x != 0.0 || points.back().y != 0.0) count = i + 1;
    }
    points.resize(count);
    return Curve(points);
}

}  // namespace

Curve::Curve(const std::vector<Point>& points) {
    for (const Point& point : points) {
        if (mKnots.empty() || point.x > mKnots.back().x) mKnots.push_back({point.x, point.y, 0.0});
    }
    // The equations of the inner knots by relaxation: the diagonal outweighs the rest by two, so each round halves the
    // error at least.
    constexpr int kRounds = 80;
    for (int round = 0; round < kRounds; ++round) {
        for (std::size_t i = 1; i + 1 < mKnots.size(); ++i) {
            const Knot &a = mKnots[i - 1], &b = mKnots[i + 1];
            Knot& k = mKnots[i];
            const double turn = (b.y - k.y) / (b.x - k.x) - (k.y - a.y) / (k.x - a.x);
            k.bend = (6.0 * turn - (k.x - a.x) * a.bend - (b.x - k.x) * b.bend) / (2.0 * (b.x - a.x));
        }
    }
}

double Curve::At(double value) const {
    if (mKnots.empty()) return value;
    const Knot &first = mKnots.front(), &last = mKnots.back();
    if (!(value > first.x)) return value + (first.y - first.x);
    if (value >= last.x) return value + (last.y - last.x);
    const auto right = std::find_if(mKnots.begin(), mKnots.end(), [&](const Knot& knot) { return knot.x > value; });
    const Knot &a = *(right - 1), &b = *right;
    const double h = b.x - a.x, p = (b.x - value) / h, q = (value - a.x) / h;
    return p * a.y + q * b.y + ((p * p * p - p) * a.bend + (q * q * q - q) * b.bend) * h * h / 6.0;
}

void RunLumaCurve(const EffectContext& context, LayerPicture& layer) {
    const Curve curve = ReadCurve(context, 5);
    RunCorrector(layer.picture, ReadCorrector(context, layer, {40, 45}), [&](Pixel p) {
        const double luma = Luma(p);
        const double change = curve.At(luma) - luma;
        for (std::size_t c = 0; c < 3; ++c) p[c] += change;
        return p;
    });
}

void RunRGBCurves(const EffectContext& context, LayerPicture& layer) {
    const Curve master = ReadCurve(context, 5);
    const std::array<Curve, 3> channels = {ReadCurve(context, 101), ReadCurve(context, 69), ReadCurve(context, 37)};
    RunCorrector(layer.picture, ReadCorrector(context, layer, {136, 141}), [&](Pixel p) {
        for (std::size_t c = 0; c < 3; ++c) p[c] = channels[c].At(master.At(p[c]));
        return p;
    });
}

}  // namespace Vantrel::Host::Software
