// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/Operations/Placement.h"

#include <algorithm>
#include <cmath>

namespace Kiln {
namespace {

constexpr double kSnap = 1.0 / 512.0;

struct Direction {
    double sine;
    double cosine;
};

/// Exact at right angles.
Direction TurnedBy(double degrees) {
    const double turn = std::remainder(degrees, 360.0);
    if (turn == 0.0) return {0.0, 1.0};
    if (std::abs(turn) == 180.0) return {0.0, -1.0};
    if (std::abs(turn) == 90.0) return {turn / 90.0, 0.0};
    constexpr double kRadians = 3.14159265358979323846 / 180.0;
    return {std::sin(turn * kRadians), std::cos(turn * kRadians)};
}

double AspectOf(Vellum::PixelAspectRatio aspect) {
    return aspect.numerator > 0 && aspect.denominator > 0 ? aspect.Value() : 1.0;
}

double Snapped(double place) {
    const double whole = std::round(place);
    return std::abs(place - whole) < kSnap ? whole : place;
}

/// An axis from the layer's coordinate u = ux x + uy y + u0 of a target place (x, y).
LayerAxis MakeAxis(double ux, double uy, double u0, double size) {
    const double step = std::hypot(ux, uy);
    return {ux / step, uy / step, u0 / step, size / step, step};
}

/// Moves both edges of an axis that runs along the target's lines or columns.
void SnapEdges(LayerAxis& axis) {
    const double direction = axis.x + axis.y;  // one is 0, the other 1 or -1
    const double size = axis.length * axis.step;
    const double first = Snapped(-axis.start * direction);
    const double last = Snapped((axis.length - axis.start) * direction);
    if (first == last) return;
    axis.start = -first * direction;
    axis.length = std::abs(last - first);
    axis.step = size / axis.length;
}

struct Extent {
    double low;
    double high;
};

/// The bounds of the layer's corners along the target's x (or, with the axes' parts exchanged, y).
Extent ExtentOf(const Placement& placement, bool alongX) {
    const LayerAxis& a = placement.across;
    const LayerAxis& d = placement.down;
    const double determinant = a.x * d.y - a.y * d.x;
    Extent extent{HUGE_VAL, -HUGE_VAL};
    for (const double u : {-a.start, a.length - a.start}) {
        for (const double v : {-d.start, d.length - d.start}) {
            const double place = (alongX ? u * d.y - v * a.y : v * a.x - u * d.x) / determinant;
            extent = {std::min(extent.low, place), std::max(extent.high, place)};
        }
    }
    return extent;
}

/// Pixels that an extent touches, within 0 to `size`.
void CoverPixels(Extent extent, double margin, std::int32_t size, std::int32_t& first, std::int32_t& last) {
    first = static_cast<std::int32_t>(std::clamp(std::floor(extent.low - margin), 0.0, static_cast<double>(size)));
    last = static_cast<std::int32_t>(std::clamp(std::ceil(extent.high + margin), 0.0, static_cast<double>(size)));
}

bool IsWhole(double value) { return value == std::round(value); }

}  // namespace

std::optional<Placement> PlaceLayer(const LayerGeometry& geometry) {
    const double scaleAcross = static_cast<double>(geometry.scaleX) * AspectOf(geometry.sourceAspect);
    const double scaleDown = geometry.scaleY;
    if (scaleAcross == 0.0 || scaleDown == 0.0) return {};
    const double aspect = AspectOf(geometry.targetAspect);
    const Direction turn = TurnedBy(geometry.rotation);
    const double ux = aspect * turn.cosine / scaleAcross, uy = turn.sine / scaleAcross;
    const double vx = -aspect * turn.sine / scaleDown, vy = turn.cosine / scaleDown;
    const double placeX = static_cast<double>(geometry.positionX) * geometry.target.Width();
    const double placeY = static_cast<double>(geometry.positionY) * geometry.target.Height();
    const double u0 = static_cast<double>(geometry.anchorX) * geometry.source.Width() - ux * placeX - uy * placeY;
    const double v0 = static_cast<double>(geometry.anchorY) * geometry.source.Height() - vx * placeX - vy * placeY;

    Placement placement;
    placement.across = MakeAxis(ux, uy, u0, geometry.source.Width());
    placement.down = MakeAxis(vx, vy, v0, geometry.source.Height());
    const bool isStraight = turn.sine == 0.0 || turn.cosine == 0.0;
    if (isStraight) {
        SnapEdges(placement.across);
        SnapEdges(placement.down);
    }
    // The soft edge of a turned layer reaches half a pixel's width beyond it, in whatever direction.
    const double margin = isStraight ? 0.0 : 1.0;
    CoverPixels(ExtentOf(placement, true), margin, geometry.target.Width(), placement.box.left, placement.box.right);
    CoverPixels(ExtentOf(placement, false), margin, geometry.target.Height(), placement.box.top, placement.box.bottom);
    if (placement.box.Width() <= 0 || placement.box.Height() <= 0) return {};

    placement.isPixelExact = isStraight && placement.across.step == 1.0 && placement.down.step == 1.0 &&
                             IsWhole(placement.across.start) && IsWhole(placement.down.start);
    placement.isShift = placement.isPixelExact && placement.across.x == 1.0 && placement.down.y == 1.0;
    for (LayerAxis* axis : {&placement.across, &placement.down}) {
        axis->start += axis->x * (placement.box.left + 0.5) + axis->y * (placement.box.top + 0.5);
    }
    if (placement.isShift) {
        placement.first = {static_cast<std::int32_t>(std::floor(placement.across.start)),
                           static_cast<std::int32_t>(std::floor(placement.down.start))};
    }
    return placement;
}

}  // namespace Kiln
