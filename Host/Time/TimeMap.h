// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <vector>

#include "Vellum/Time.h"

namespace Vantrel::Host {

enum class Interpolation { kHold, kLinear, kBezier };

/// How a cubic between two keys bends: `along` in fractions of the span (its sign doesn't matter), `by` in values.
struct Handle {
    double along = 1.0 / 3.0;
    double by = 0;
};

/// Where the cubic from (0, from) to (1, to) stands at `fraction`. The control points are (out.along, from + out.by)
/// and (1 - |in.along|, to + in.by).
[[nodiscard]] double EvaluateBezier(double from, const Handle& out, const Handle& in, double to, double fraction);

/// One point of a curve that turns time into time.
struct RemapKey {
    std::int64_t time = 0;
    std::int64_t mediaTime = 0;
    /// Rules up to the next key.
    Interpolation interpolation = Interpolation::kLinear;
};

/// One instant as an item, its media and its effects know it.
struct ItemTimes {
    std::int64_t item = 0;
    std::int64_t media = 0;
    /// The time at which parameters are read: media time, and for a frozen picture, unless told otherwise, the media
    /// time as if it ran on.
    std::int64_t parameters = 0;
};

enum class Motion { kForward, kFreeze, kBackward, kRemap, kAdjustment };

/// How the time of an item on a track becomes the time of its media. Everything is in ticks.
///
/// Three times occur. *Item time* t counts from the item's start on the track. *Media time* counts from the media's
/// first frame. The *argument* x is what the engine hands in when it asks: t for the item itself, t - MediaOffset() for
/// the media below it. An item's in-point thus stands in the media's offset, because the engine maps the ranges of
/// nested sequences with that offset alone.
struct TimeMap {
    Motion motion = Motion::kForward;
    /// Media time at the start of the trimmed range.
    std::int64_t in = 0;
    /// Length on the track.
    std::int64_t duration = 0;
    /// One frame of the sequence.
    std::int64_t frameTicks = 0;
    /// Product of the item's speeds; never 0, negative only for kBackward.
    double speed = 1.0;
    /// kFreeze: the media time shown.
    std::int64_t hold = 0;
    /// kFreeze: effects stand still with the picture.
    bool holdFilters = false;
    /// kRemap: sorted by time, counted from the item's start; at least one.
    std::vector<RemapKey> curve;

    /// Offset of the media below the item: never above 0 for an in-point at or after the media's start.
    [[nodiscard]] std::int64_t MediaOffset() const;
    /// What the engine's question for an item's own time is answered with.
    [[nodiscard]] std::int64_t Transform(std::int64_t argument) const;
    /// The times that hold at an item time.
    [[nodiscard]] ItemTimes AtItemTime(std::int64_t itemTime) const;
    /// The same, from the answer that Transform(t) gave: all that the host's renderer is told of an item. A remapped
    /// item's own time can't be had back, and nothing reads it.
    [[nodiscard]] ItemTimes FromTransformed(std::int64_t transformed) const;

    /// Transform(t + ticks), from Transform(t). On a remapped item the first frame with that answer stands for t.
    [[nodiscard]] std::int64_t LaterTransformed(std::int64_t transformed, std::int64_t ticks) const;

    /// Speed without its sign; the mean one of a remapped item.
    [[nodiscard]] double ClipSpeed() const;
    [[nodiscard]] bool IsBackward() const { return motion == Motion::kBackward; }
    /// Whether media at the sequence's rate is shown frame by frame.
    [[nodiscard]] bool KeepsFrames() const;
};

}  // namespace Vantrel::Host
