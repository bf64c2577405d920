// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Motion.h"

#include <algorithm>
#include <cmath>

#include "Host/Software/Effects/BlendModes.h"
#include "Host/Software/Effects/Resample.h"

namespace Vantrel::Host::Software {
namespace {

constexpr double kSnap = 1.0 / 512.0;

struct Place {
    double u;
    double v;
};

double AspectOf(Vellum::PixelAspectRatio aspect) {
    return aspect.numerator > 0 && aspect.denominator > 0 ? aspect.Value() : 1.0;
}

/// Sine and cosine of an angle in degrees, exact at right angles.
void Turn(double degrees, double& sine, double& cosine) {
    const double quarters = degrees / 90.0;
    if (quarters == std::floor(quarters)) {
        const int quarter = static_cast<int>(std::fmod(std::fmod(quarters, 4.0) + 4.0, 4.0));
        constexpr double kSines[] = {0.0, 1.0, 0.0, -1.0};
        sine = kSines[quarter];
        cosine = kSines[(quarter + 1) % 4];
        return;
    }
    const double radians = degrees * 3.14159265358979323846 / 180.0;
    sine = std::sin(radians);
    cosine = std::cos(radians);
}

/// The affine map from target to layer: u = ux x + uy y + u0, v likewise.
struct Mapping {
    double ux, uy, u0;
    double vx, vy, v0;

    [[nodiscard]] Place At(double x, double y) const { return {ux * x + uy * y + u0, vx * x + vy * y + v0}; }
    [[nodiscard]] double FootprintU() const { return std::hypot(ux, uy); }
    [[nodiscard]] double FootprintV() const { return std::hypot(vx, vy); }
};

Mapping MapTargetToLayer(const Picture& layer, const LayerDrawing& drawing, const Picture& target) {
    double sine = 0.0;
    double cosine = 1.0;
    Turn(drawing.rotation, sine, cosine);
    const double across = static_cast<double>(drawing.scaleX) * AspectOf(drawing.layerAspect);
    const double down = drawing.scaleY;
    const double aspect = AspectOf(drawing.targetAspect);
    Mapping map{aspect * cosine / across, sine / across, 0.0, -aspect * sine / down, cosine / down, 0.0};
    const Place moved = map.At(static_cast<double>(drawing.positionX) * target.width,
                               static_cast<double>(drawing.positionY) * target.height);
    map.u0 = static_cast<double>(drawing.anchorX) * layer.width - moved.u;
    map.v0 = static_cast<double>(drawing.anchorY) * layer.height - moved.v;
    return map;
}

/// Moves an axis of the layer, `slope` * t + `start` over 0 to `size`, onto the target's pixel borders where it is
/// close.
void SnapAxis(double& slope, double& start, double size) {
    const auto snapped = [](double t) { return std::abs(t - std::round(t)) < kSnap ? std::round(t) : t; };
    const double low = snapped(-start / slope);
    const double high = snapped((size - start) / slope);
    if (low == high) return;
    slope = size / (high - low);
    start = -low * slope;
}

void Snap(Mapping& map, const Picture& layer) {
    if (map.uy == 0.0 && map.vx == 0.0) {
        SnapAxis(map.ux, map.u0, layer.width);
        SnapAxis(map.vy, map.v0, layer.height);
    } else if (map.ux == 0.0 && map.vy == 0.0) {
        SnapAxis(map.uy, map.u0, layer.width);
        SnapAxis(map.vx, map.v0, layer.height);
    }
}

/// Do the target's pixels coincide with the layer's?
bool IsPixelExact(const Mapping& map) {
    const auto whole = [](double value) { return value == std::round(value); };
    const bool upright = std::abs(map.ux) == 1.0 && std::abs(map.vy) == 1.0 && map.uy == 0.0 && map.vx == 0.0;
    const bool sideways = std::abs(map.uy) == 1.0 && std::abs(map.vx) == 1.0 && map.ux == 0.0 && map.vy == 0.0;
    return (upright || sideways) && whole(map.u0) && whole(map.v0);
}

double CoverageAlong(double place, double footprint, double size) {
    const double inside = std::min(place + footprint / 2.0, size) - std::max(place - footprint / 2.0, 0.0);
    return std::clamp(inside / footprint, 0.0, 1.0);
}

/// The mix of a replaced and a replacing pixel, colour weighed by alpha.
Pixel Replace(const Pixel& below, const Pixel& layer, double coverage) {
    if (coverage == 1.0) return layer;
    const double weightLayer = coverage * layer[3];
    const double weightBelow = (1.0 - coverage) * below[3];
    const double alpha = weightLayer + weightBelow;
    if (alpha <= 0.0) return {0.0, 0.0, 0.0, alpha};
    Pixel out;
    for (std::size_t c = 0; c < 3; ++c) out[c] = (weightLayer * layer[c] + weightBelow * below[c]) / alpha;
    out[3] = alpha;
    return out;
}

}  // namespace

void DrawLayer(const Picture& layer, const LayerDrawing& drawing, Picture& target) {
    if (drawing.scaleX == 0.0F || drawing.scaleY == 0.0F) return;
    Mapping map = MapTargetToLayer(layer, drawing, target);
    Snap(map, layer);
    const auto quality = IsPixelExact(map) ? Vellum::RenderQuality::kDraft : drawing.quality;
    const double opacity = std::clamp(static_cast<double>(drawing.opacity), 0.0, 1.0);
    for (int y = 0; y < target.height; ++y) {
        for (int x = 0; x < target.width; ++x) {
            const Place place = map.At(x + 0.5, y + 0.5);
            const double coverage = CoverageAlong(place.u, map.FootprintU(), layer.width) *
                                    CoverageAlong(place.v, map.FootprintV(), layer.height);
            if (coverage <= 0.0) continue;
            Pixel pixel = Sample(layer, place.u, place.v, map.FootprintU(), map.FootprintV(), quality);
            pixel[3] *= opacity;
            const Pixel below = target.Get(x, y);
            target.Set(x, y,
                       drawing.overDestination ? BlendOver(drawing.blendMode, below, pixel, coverage, x, y)
                                               : Replace(below, pixel, coverage));
        }
    }
}

}  // namespace Vantrel::Host::Software
