// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Shared/Src/SegmentMap.h"

#include <iterator>

#include "Shared/Src/VerdictFolding.h"

namespace Vantrel {
namespace {

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

SegmentMap::iterator SegmentCursor::Seek(std::int64_t ticks) {
    constexpr int kSteps = 3;
    for (int step = 0; step < kSteps; ++step) {
        if (mAt != mMap.end() && mAt->second.out <= ticks) {
            ++mAt;
        } else if (mAt == mMap.begin() || std::prev(mAt)->second.out <= ticks) {
            return mAt;
        } else {
            break;
        }
    }
    mAt = mMap.upper_bound(ticks);
    if (mAt != mMap.begin() && std::prev(mAt)->second.out > ticks) --mAt;
    return mAt;
}

const SegmentInfo* SegmentCursor::Find(std::int64_t ticks) {
    const auto it = Seek(ticks);
    return it != mMap.end() && it->first <= ticks ? &it->second : nullptr;
}

void SegmentCursor::Erase(std::int64_t in, std::int64_t out) {
    const auto first = Seek(in);
    auto last = first;
    while (last != mMap.end() && last->first < out) ++last;
    mAt = mMap.erase(first, last);
}

void SegmentCursor::Replace(const SegmentInfo& segment) {
    // Mostly one stretch stands in the very place: its entry is written over instead of freed and made again.
    auto placed = mMap.end();
    auto it = Seek(segment.in);
    while (it != mMap.end() && it->first < segment.out) {
        if (it->first == segment.in) {
            it->second = segment;
            placed = it++;
        } else {
            it = mMap.erase(it);
        }
    }
    mAt = placed != mMap.end() ? placed : mMap.insert_or_assign(it, segment.in, segment);
}

void SegmentCursor::Merge(const SegmentInfo& segment) {
    std::int64_t reached = segment.in;
    auto it = Seek(segment.in);
    for (; it != mMap.end() && it->first < segment.out; ++it) {
        SegmentInfo& entry = it->second;
        if (reached < entry.in) InsertStretch(mMap, it, segment, reached, entry.in);
        reached = entry.out;
        if (entry.out > segment.out) {
            InsertStretch(mMap, std::next(it), entry, segment.out, entry.out);
            entry.out = segment.out;
        }
        MergeStatistics(entry, segment);
        mAt = it;
        if (reached >= segment.out) return;
    }
    if (reached < segment.out) InsertStretch(mMap, it, segment, reached, segment.out);
    mAt = it;
}

}  // namespace Vantrel
