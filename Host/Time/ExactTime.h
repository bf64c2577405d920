// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>

#include "Vellum/Time.h"

/// Arithmetic on times that never leaves integers: no drift, and the same answer wherever a time is worked out anew.
/// Rounding is half up, floor(x + 1/2). Results beyond +-Vellum::kTime_Max stay at that limit.
namespace Vantrel::Host {

/// A frame or sample rate as an exact fraction, in units a second.
struct Rate {
    std::int64_t numerator = 0;
    std::int64_t denominator = 1;
};

/// The exact rate behind a number in a file. A number that isn't whole and lies within 0.01 of 24, 30, 48, 60 or 120
/// times 1000/1001 is that fraction; another one is the simplest fraction that gives the same number.
/// @return empty for numbers that aren't above 0 and at most 10 million
[[nodiscard]] std::optional<Rate> SnapRate(double rate);

[[nodiscard]] std::int64_t TicksPerFrame(Rate rate);

/// The time of `value` units at a rate. `value` may be a fraction, as in files that count in seconds.
[[nodiscard]] std::int64_t ToTicks(double value, Rate rate);

/// factor * ticks, taking the factor for exactly the number that it holds.
[[nodiscard]] std::int64_t ScaleTicks(std::int64_t ticks, double factor);

/// ticks / factor. The factor's magnitude lies in 1e-5 .. 1e5.
[[nodiscard]] std::int64_t UnscaleTicks(std::int64_t ticks, double factor);

/// ticks * numerator / denominator, rounded. The denominator is above 0.
[[nodiscard]] std::int64_t MultiplyTicks(std::int64_t ticks, std::int64_t numerator, std::int64_t denominator);

/// Containers round the times of frames: a time up to this much before a frame counts as in it.
constexpr std::int64_t kFrameTolerance = Vellum::kTicksPerSecond / 1000000;

/// The number of the frame that lies at a time: floor((time + tolerance) / ticksPerFrame), not clamped to any media.
[[nodiscard]] std::int64_t FrameNumberAt(std::int64_t time, std::int64_t ticksPerFrame);

}  // namespace Vantrel::Host
