// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Shared/Src/SegmentReader.h"

#include <algorithm>
#include <string>

#include <boost/make_shared.hpp>

#include "Halden/Trace.h"
#include "Shared/Src/SegmentMap.h"
#include "Shared/Src/TreeBuilder.h"
#include "Shared/Src/VerdictFolding.h"
#include "Src/Filters/INestedTimelineNode.h"
#include "Src/VideoNodes/VideoNodeFactory.h"

namespace Vantrel {
namespace {

constexpr const char* kTraceCategory = "Timeline.AddSegments";
constexpr int kTraceLevel = 10;

/// Keeps a sequence's format on the stacks while it is read. The top one's stays behind when the scope ends.
class FormatScope {
public:
    FormatScope(TimelineState& state, const SequenceInfo& format, bool top) : mState(state), mTop(top) {
        if (top && !state.rectStack.empty()) Pop();
        state.rectStack.push_back(format.rect);
        state.mRealTimeFileFPS.push_back(format.rate);
        state.aspectStack.push_back(format.aspect);
        state.fieldStack.push_back(format.fieldType);
        if (top) boost::atomic_store(&state.topFormat, boost::make_shared<const SequenceInfo>(format));
    }
    ~FormatScope() {
        if (!mTop) Pop();
    }
    FormatScope(const FormatScope&) = delete;
    FormatScope& operator=(const FormatScope&) = delete;

private:
    void Pop() {
        mState.rectStack.pop_back();
        mState.mRealTimeFileFPS.pop_back();
        mState.aspectStack.pop_back();
        mState.fieldStack.pop_back();
    }

    TimelineState& mState;
    bool mTop;
};

/// The cache that a running update fills. When it ends it becomes the timeline's; cut short by an exception it is lost.
class CacheGeneration {
public:
    explicit CacheGeneration(TimelineState& state) : mState(state) { state.buildingCache = &mCache; }
    ~CacheGeneration() { mState.buildingCache = nullptr; }
    CacheGeneration(const CacheGeneration&) = delete;
    CacheGeneration& operator=(const CacheGeneration&) = delete;

    void Commit() { mState.treeCache.swap(mCache); }

private:
    TimelineState& mState;
    TreeCache mCache;
};

/// Notes that a sequence is being read.
class SequenceScope {
public:
    SequenceScope(TimelineState& state, std::uint32_t id) : mStack(state.sequenceStack) { mStack.push_back(id); }
    ~SequenceScope() { mStack.pop_back(); }
    SequenceScope(const SequenceScope&) = delete;
    SequenceScope& operator=(const SequenceScope&) = delete;

private:
    std::deque<std::uint32_t>& mStack;
};

bool IsBeingRead(const TimelineState& state, std::uint32_t id) {
    return std::find(state.sequenceStack.begin(), state.sequenceStack.end(), id) != state.sequenceStack.end();
}

void TraceSelfContained(std::uint32_t id) {
    static Halden::debug::TraceGate gate(kTraceCategory, kTraceLevel);
    if (gate.IsOpen()) gate.Write("Sequence " + std::to_string(id) + " contains itself and stays black there.");
}

SegmentsMode ModeOf(const TimelineState& state, bool top) {
    if (!state.usePreviews) return SegmentsMode::kPlain;
    return top ? SegmentsMode::kPreviews : SegmentsMode::kNestedPreviews;
}

/// The verdict of a tree that may be taken over, or null.
const SegmentVerdict* FindReusable(const TreeCache& cache, const Guid& guid) {
    const auto it = cache.find(guid);
    return it != cache.end() && !it->second.nested ? &it->second : nullptr;
}

void TraceSecondOccurrence(const Guid& guid) {
    static Halden::debug::TraceGate gate(kTraceCategory, kTraceLevel);
    if (gate.IsOpen()) gate.Write("Add segment......, GUID: " + guid.ToString());
}

void TraceReuse(const SegmentInfo& info) {
    static Halden::debug::TraceGate gate(kTraceCategory, kTraceLevel);
    if (!gate.IsOpen()) return;
    gate.Write("Add segment, reusing tree (new seg)..., GUID: " + info.guid.ToString() +
               ", in: " + std::to_string(info.in) + ", out: " + std::to_string(info.out) +
               ", offset: " + std::to_string(info.offset));
}

}  // namespace

Status SegmentReader::ReadSequence(std::uint32_t id, const SequenceRange& range, const SequenceTarget& target) {
    // However deep, it would never end.
    if (IsBeingRead(mState, id)) {
        TraceSelfContained(id);
        return Ostrand::kStatus_OK;
    }
    const SequenceScope reading(mState, id);
    const VideoSegmentsHandle handle(id, ModeOf(mState, target.top), mState.previewSpec);
    if (!handle.IsValid()) return Ostrand::kStatus_OK;
    if (target.top) {
        Guid hash;
        if (!Ostrand::Failed(handle.GetSegmentsHash(hash))) {
            if (hash == mState.lastHash) return Ostrand::kStatus_OK;
            mState.lastHash = hash;
        }
    }
    const std::int32_t count = handle.GetSegmentCount();
    SequenceInfo format;
    const Status status = GetSequenceInfo(id, format);
    if (Ostrand::Failed(status)) return status;

    const FormatScope scope(mState, format, target.top);
    if (!target.top) {
        ReadContent(handle, count, range, target);
        return Ostrand::kStatus_OK;
    }
    CacheGeneration generation(mState);
    if (!mState.blackTree) mState.blackTree = TreeBuilder(mState, *this).BuildBlackTree();
    ReadContent(handle, count, range, target);
    generation.Commit();
    return Ostrand::kStatus_OK;
}

void SegmentReader::ReadContent(const VideoSegmentsHandle& handle, std::int32_t count, const SequenceRange& range,
                                const SequenceTarget& target) {
    const std::int64_t reached = AddSegments(handle, count, range, target);
    if (reached < range.out) AddGap(reached, range.out, target.top);
}

std::int64_t SegmentReader::AddSegments(const VideoSegmentsHandle& handle, std::int32_t count,
                                        const SequenceRange& range, const SequenceTarget& target) {
    std::int64_t reached = range.in;
    for (std::int32_t index = 0; index < count; ++index) {
        VideoSegment entry;
        if (!Ostrand::Failed(handle.GetSegmentInfo(index, entry))) {
            Segment segment;
            segment.index = index;
            segment.guid = entry.hash;
            segment.start = entry.start;
            segment.end = entry.end;
            segment.sourceStart = entry.offset;
            const std::int64_t mappedStart = entry.start + range.in - range.offset;
            segment.clipped.in = std::max(range.in, mappedStart);
            segment.clipped.out = std::min(range.out, entry.end + range.in - range.offset);
            segment.clipped.offset = entry.offset + segment.clipped.in - mappedStart;
            if (reached < segment.clipped.in) {
                AddGap(reached, segment.clipped.in, target.top);
                reached = segment.clipped.in;
            }
            if (reached < segment.clipped.out) {
                AddSegment(handle, segment, target);
                reached = segment.clipped.out;
            }
        }
        if (reached >= range.out) break;
    }
    return reached;
}

void SegmentReader::AddGap(std::int64_t from, std::int64_t to, bool top) {
    SegmentInfo gap;
    gap.in = from;
    gap.out = to;
    EnterSegment(gap, false, true, top, mState.blackTree);
}

void SegmentReader::AddSegment(const VideoSegmentsHandle& handle, const Segment& segment,
                               const SequenceTarget& target) {
    const SequenceRange& place = segment.clipped;
    const SegmentInfo* const standing = mRendered.Find(place.in);
    const bool unchanged = standing && !standing->nested && standing->guid == segment.guid &&
                           standing->in == place.in && standing->out == place.out && standing->offset == place.offset;
    const auto nestedNode = Ostrand::Query<INestedTimelineNode>(target.parentTree);
    // Most segments of most updates: nobody asks for the verdict, and the tree isn't touched.
    if (unchanged && !nestedNode) return;
    const SegmentVerdict verdict = unchanged ? VerdictOf(*standing) : PlaceSegment(handle, segment, target.top);
    if (!nestedNode) return;
    FoldSegmentIntoNested(target.parentInfo, verdict);
    nestedNode->AddSegmentTree(verdict.tree, segment.start, segment.sourceStart, segment.end);
}

SegmentVerdict SegmentReader::PlaceSegment(const VideoSegmentsHandle& handle, const Segment& segment, bool top) {
    const SequenceRange& place = segment.clipped;
    if (top && place.in <= place.out) {
        mMerged.Erase(place.in, place.out);
        mRendered.Erase(place.in, place.out);
    }
    SegmentInfo info;
    info.in = place.in;
    info.out = place.out;
    info.offset = place.offset;
    info.guid = segment.guid;

    if (const SegmentVerdict* const known = FindReusable(*mState.buildingCache, segment.guid)) {
        TraceSecondOccurrence(segment.guid);
        SegmentVerdict verdict = *known;
        TakeOverTree(verdict, info, top);
        TraceReuse(info);
        return verdict;
    }
    SegmentVerdict verdict;
    if (const SegmentVerdict* const known = FindReusable(mState.treeCache, segment.guid)) {
        verdict = *known;
        TakeOverTree(verdict, info, top);
    } else {
        verdict = BuildTree(handle, segment, info, top);
    }
    if (verdict.tree) (*mState.buildingCache)[segment.guid] = verdict;
    return verdict;
}

void SegmentReader::TakeOverTree(const SegmentVerdict& verdict, SegmentInfo& info, bool top) {
    ApplyVerdict(info, verdict);
    EnterSegment(info, verdict.host, verdict.ok, top, verdict.tree);
}

SegmentVerdict SegmentReader::BuildTree(const VideoSegmentsHandle& handle, const Segment& segment, SegmentInfo& info,
                                        bool top) {
    Branch branch(info);
    const Status status = TreeBuilder(mState, *this).BuildSegmentTree(AcquireRootNode(handle, segment.index), branch);
    // A segment that couldn't be read has no entry in the maps; the others go on.
    if (Ostrand::Failed(status)) return {};
    EnterSegment(info, branch.host, branch.ok, top, branch.tree);
    // Remembered by the record, which also knows of branches that went to the host as a whole.
    SegmentVerdict verdict = VerdictOf(info);
    verdict.tree = branch.tree;
    return verdict;
}

void SegmentReader::EnterSegment(SegmentInfo& info, bool host, bool ok, bool top, const RenderNodeRef& tree) {
    // What it stands for went into the maps piece by piece.
    if (info.flattened) return;
    if (!info.isPreview || top || !ok) {
        info.accelerated = info.accelerated && ok && !host;
    } else {
        info.realTime = false;
    }
    info.tree = tree;
    // With a node of its own, nested content renders through that and only counts in the statistics.
    const bool isRendered = top || !mState.isRegistered(kKey_NestedTimeline);
    if (isRendered) mRendered.Replace(info);
    mMerged.Merge(info);
}

}  // namespace Vantrel
