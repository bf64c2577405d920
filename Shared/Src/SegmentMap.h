// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Shared/Src/TimelineState.h"

namespace Vantrel {

/// The stretch that covers a time, or null.
[[nodiscard]] const SegmentInfo* FindSegment(const SegmentMap& map, std::int64_t ticks);

/// Erases every stretch that has a point in common with `in` up to `out`, whole.
void EraseOverlap(SegmentMap& map, std::int64_t in, std::int64_t out);

/// Puts a stretch in the place of whatever overlaps it.
void ReplaceSegment(SegmentMap& map, const SegmentInfo& segment);

/// Lays a stretch over a map of statistics. Stretches that are there take up its cost and keep their own place and
/// tree; what reaches beyond its end is cut off there and stays as it was; where nothing stood, copies of it fill the
/// gaps.
void MergeSegment(SegmentMap& map, const SegmentInfo& segment);

}  // namespace Vantrel
