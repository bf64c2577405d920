// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Time/TimeMap.h"

#include <algorithm>
#include <cmath>

#include "Host/Time/ExactTime.h"

namespace Vantrel::Host {
namespace {

double Cubic(double p0, double p1, double p2, double p3, double u) {
    const double v = 1.0 - u;
    return v * v * v * p0 + 3.0 * v * v * u * p1 + 3.0 * v * u * u * p2 + u * u * u * p3;
}

std::int64_t EvaluateCurve(const std::vector<RemapKey>& curve, std::int64_t time) {
    const auto next = std::upper_bound(curve.begin(), curve.end(), time,
                                       [](std::int64_t t, const RemapKey& key) { return t < key.time; });
    if (next == curve.begin()) return next->mediaTime;
    const RemapKey& from = *std::prev(next);
    if (next == curve.end() || from.interpolation == Interpolation::kHold) return from.mediaTime;
    const std::int64_t span = next->time - from.time;
    const std::int64_t rise = next->mediaTime - from.mediaTime;
    if (from.interpolation == Interpolation::kLinear) {
        return from.mediaTime + MultiplyTicks(rise, time - from.time, span);
    }
    const double fraction = static_cast<double>(time - from.time) / static_cast<double>(span);
    return from.mediaTime + ScaleTicks(rise, EvaluateBezier(0.0, {}, {}, 1.0, fraction));
}

}  // namespace

double EvaluateBezier(double from, const Handle& out, const Handle& in, double to, double fraction) {
    const double x1 = std::clamp(std::fabs(out.along), 0.0, 1.0);
    const double x2 = 1.0 - std::clamp(std::fabs(in.along), 0.0, 1.0);
    // Time rises along the cubic, so halving always finds the place.
    double low = 0.0;
    double high = 1.0;
    for (int i = 0; i < 60; ++i) {
        const double middle = 0.5 * (low + high);
        (Cubic(0.0, x1, x2, 1.0, middle) < fraction ? low : high) = middle;
    }
    return Cubic(from, from + out.by, to + in.by, to, 0.5 * (low + high));
}

std::int64_t TimeMap::MediaOffset() const { return motion == Motion::kForward ? -UnscaleTicks(in, speed) : 0; }

std::int64_t TimeMap::Transform(std::int64_t argument) const {
    switch (motion) {
        case Motion::kForward:
            return in + ScaleTicks(argument + MediaOffset(), speed);
        case Motion::kBackward:
            return in + ScaleTicks(duration - frameTicks - argument, -speed);
        case Motion::kRemap:
            return EvaluateCurve(curve, argument);
        case Motion::kFreeze:
        case Motion::kAdjustment:
            break;
    }
    return in + argument;
}

ItemTimes TimeMap::AtItemTime(std::int64_t itemTime) const {
    const std::int64_t running = Transform(itemTime - MediaOffset());
    if (motion != Motion::kFreeze) return {itemTime, running, running};
    return {itemTime, hold, holdFilters ? hold : running};
}

ItemTimes TimeMap::FromTransformed(std::int64_t transformed) const {
    switch (motion) {
        case Motion::kForward:
            return AtItemTime(UnscaleTicks(transformed - in, speed) - MediaOffset());
        case Motion::kBackward:
            return AtItemTime(duration - frameTicks - UnscaleTicks(transformed - in, -speed));
        case Motion::kRemap:
            return {0, transformed, transformed};
        case Motion::kFreeze:
        case Motion::kAdjustment:
            break;
    }
    return AtItemTime(transformed - in);
}

std::int64_t TimeMap::LaterTransformed(std::int64_t transformed, std::int64_t ticks) const {
    if (motion != Motion::kRemap) {
        const ItemTimes times = FromTransformed(transformed);
        return Transform(times.item + ticks);
    }
    for (std::int64_t t = 0; frameTicks > 0 && t < duration; t += frameTicks) {
        if (Transform(t) == transformed) return Transform(t + ticks);
    }
    return transformed;
}

double TimeMap::ClipSpeed() const {
    if (motion == Motion::kForward || motion == Motion::kBackward) return std::fabs(speed);
    if (motion != Motion::kRemap || duration <= 0) return 1.0;
    const double mean =
        static_cast<double>(EvaluateCurve(curve, duration) - EvaluateCurve(curve, 0)) / static_cast<double>(duration);
    return mean != 0 ? std::fabs(mean) : 1.0;
}

bool TimeMap::KeepsFrames() const {
    return motion == Motion::kFreeze || motion == Motion::kAdjustment || (motion == Motion::kForward && speed == 1.0);
}

}  // namespace Vantrel::Host
