// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Shared/Src/SegmentMap.h"

#include <iterator>

#include "Shared/Src/VerdictFolding.h"

namespace Vantrel {
namespace {

/// The first stretch that ends after a time.
SegmentMap::iterator FirstEndingAfter(SegmentMap& map, std::int64_t ticks) {
    auto it = map.upper_bound(ticks);
    if (it != map.begin() && std::prev(it)->second.out > ticks) --it;
    return it;
}

/// @param next  the first stretch that comes after it
void InsertStretch(SegmentMap& map, SegmentMap::iterator next, SegmentInfo segment, std::int64_t in, std::int64_t out) {
    segment.in = in;
    segment.out = out;
    map.emplace_hint(next, in, std::move(segment));
}

}  // namespace

const SegmentInfo* FindSegment(const SegmentMap& map, std::int64_t ticks) {
    const auto next = map.upper_bound(ticks);
    if (next == map.begin()) return nullptr;
    const SegmentInfo& candidate = std::prev(next)->second;
    return candidate.out > ticks ? &candidate : nullptr;
}

void EraseOverlap(SegmentMap& map, std::int64_t in, std::int64_t out) {
    const auto first = FirstEndingAfter(map, in);
    auto last = first;
    while (last != map.end() && last->first < out) ++last;
    map.erase(first, last);
}

void ReplaceSegment(SegmentMap& map, const SegmentInfo& segment) {
    // Mostly one stretch stands in the very place: its entry is written over instead of freed and made again.
    bool isPlaced = false;
    auto it = FirstEndingAfter(map, segment.in);
    while (it != map.end() && it->first < segment.out) {
        if (it->first == segment.in) {
            it->second = segment;
            isPlaced = true;
            ++it;
        } else {
            it = map.erase(it);
        }
    }
    if (!isPlaced) map.insert_or_assign(it, segment.in, segment);
}

void MergeSegment(SegmentMap& map, const SegmentInfo& segment) {
    std::int64_t reached = segment.in;
    auto it = FirstEndingAfter(map, segment.in);
    while (it != map.end() && it->first < segment.out) {
        SegmentInfo& entry = it->second;
        if (reached < entry.in) InsertStretch(map, it, segment, reached, entry.in);
        reached = entry.out;
        if (entry.out > segment.out) {
            InsertStretch(map, std::next(it), entry, segment.out, entry.out);
            entry.out = segment.out;
        }
        MergeStatistics(entry, segment);
        if (reached >= segment.out) return;
        ++it;
    }
    if (reached < segment.out) InsertStretch(map, it, segment, reached, segment.out);
}

}  // namespace Vantrel
