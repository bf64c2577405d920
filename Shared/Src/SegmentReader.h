// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Shared/Src/SegmentMap.h"
#include "Src/VideoNodes/VideoSegmentsHandle.h"

namespace Vantrel {

/// A range of a sequence, in the time of whoever asks for it, and how that maps to the sequence's own time: `in` is the
/// sequence's time `offset`.
struct SequenceRange {
    std::int64_t in = 0;
    std::int64_t out = 0;
    std::int64_t offset = 0;
};

/// Where a sequence's content goes. The top sequence has its maps; a nested one also reports to the record and to the
/// node that stand for it in the outer tree (which is empty for a sequence that is flattened).
struct SequenceTarget {
    bool top = true;
    SegmentInfo& parentInfo;
    RenderNodeRef parentTree;
};

/// Reads sequences into the maps of a timeline, segment by segment, and decides for each whether it stands as it was,
/// takes over a tree, or needs a new one. Works under the timeline's lock and calls the host.
class SegmentReader {
public:
    explicit SegmentReader(TimelineState& state)
        : mState(state), mRendered(state.renderMap), mMerged(state.mergedMap) {}

    /// Reads a range of a sequence; at the top, nothing when its hash hasn't changed, and nothing of one that is being
    /// read already, which contains itself: what stands for it there renders its default, black.
    /// @return 0, also when the host has no segment list; or the failure to learn the sequence's format.
    Status ReadSequence(std::uint32_t id, const SequenceRange& range, const SequenceTarget& target);

private:
    /// One entry of a segment list, clipped to the range that is read.
    struct Segment {
        std::int32_t index = 0;
        SequenceRange clipped;
        std::int64_t start = 0;  ///< the whole entry, in the sequence's own time
        std::int64_t end = 0;
        std::int64_t sourceStart = 0;  ///< the content's time at the whole entry's start
        Guid guid;
    };

    void ReadContent(const VideoSegmentsHandle& handle, std::int32_t count, const SequenceRange& range,
                     const SequenceTarget& target);
    std::int64_t AddSegments(const VideoSegmentsHandle& handle, std::int32_t count, const SequenceRange& range,
                             const SequenceTarget& target);
    void AddSegment(const VideoSegmentsHandle& handle, const Segment& segment, const SequenceTarget& target);
    void AddGap(std::int64_t from, std::int64_t to, bool top);
    void EnterSegment(SegmentInfo& info, bool host, bool ok, bool top, const RenderNodeRef& tree);

    [[nodiscard]] SegmentVerdict PlaceSegment(const VideoSegmentsHandle& handle, const Segment& segment, bool top);
    void TakeOverTree(const SegmentVerdict& verdict, SegmentInfo& info, bool top);
    [[nodiscard]] SegmentVerdict BuildTree(const VideoSegmentsHandle& handle, const Segment& segment, SegmentInfo& info,
                                           bool top);

    TimelineState& mState;
    SegmentCursor mRendered;
    SegmentCursor mMerged;
};

}  // namespace Vantrel
