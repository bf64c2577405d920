// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Shared/Src/TimelineState.h"

namespace Vantrel {

/// The stretch that covers a time, or null.
[[nodiscard]] const SegmentInfo* FindSegment(const SegmentMap& map, std::int64_t ticks);

/// Reads and writes a map of stretches, quickest in order of time: it remembers where it was, so that an update that
/// walks a whole sequence doesn't search for each of its segments. Nobody else may write to the map meanwhile.
class SegmentCursor {
public:
    explicit SegmentCursor(SegmentMap& map) : mMap(map), mAt(map.begin()) {}

    /// The stretch that covers a time, or null.
    [[nodiscard]] const SegmentInfo* Find(std::int64_t ticks);

    /// Erases every stretch that has a point in common with `in` up to `out`, whole.
    void Erase(std::int64_t in, std::int64_t out);

    /// Puts a stretch in the place of whatever overlaps it.
    void Replace(const SegmentInfo& segment);

    /// Lays a stretch over a map of statistics. Stretches that are there take up its cost and keep their own place and
    /// tree; what reaches beyond its end is cut off there and stays as it was; where nothing stood, copies of it fill
    /// the gaps.
    void Merge(const SegmentInfo& segment);

private:
    /// The first stretch that ends after a time.
    SegmentMap::iterator Seek(std::int64_t ticks);

    SegmentMap& mMap;
    SegmentMap::iterator mAt;  ///< of mMap, where the last call was
};

}  // namespace Vantrel
