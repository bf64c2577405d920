// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/NestedTimelineSource.h"

#include "Src/VideoNodes/VideoMediaNode.h"

namespace Vantrel {

namespace {

/// From this height on only the highest quality is worth a full-size inner picture.
constexpr std::int32_t kLargeHeight = 1500;

}  // namespace

Status NestedTimelineSource::Configure(const VideoNodeRef& description, const RenderRequirements& requirements,
                                       bool& host) {
    const auto* media = dynamic_cast<const VideoMediaNode*>(description.get());
    if (!media) return Ostrand::kStatus_Failure;
    mInnerRect = media->GetStreamFrameRect();
    mScanlineOffset = media->GetScanlineOffsetToImproveVerticalCentering();
    std::int32_t inner = media->GetNestedSequenceTimelineID();
    if (inner == 0) inner = media->GetSelectedMulticamTrackTimelineID();
    mInnerSequenceID = static_cast<std::uint32_t>(inner);
    return FilterNode::Configure(description, requirements, host);
}

void NestedTimelineSource::AddSegmentTree(const RenderNodeRef& tree, std::int64_t start, std::int64_t sourceStart,
                                          std::int64_t end) {
    mSegments.try_emplace(start, SegmentEntry{WrapInput(tree), start, sourceStart, end});
}

const NestedTimelineSource::SegmentEntry* NestedTimelineSource::FindSegment(std::int64_t time) const {
    auto next = mSegments.upper_bound(time);
    if (next == mSegments.begin()) return nullptr;
    const SegmentEntry& entry = std::prev(next)->second;
    return time < entry.end ? &entry : nullptr;
}

void NestedTimelineSource::SelectInput(RenderParams& out, const RenderParams& params, RenderNodeRef& input) {
    const SegmentEntry* entry = FindSegment(params.clipTime);
    input = entry && entry->tree ? entry->tree : mDefaultTree;
    out = params;
    out.sequenceID = mInnerSequenceID;
    out.time = params.clipTime;
    if (entry) out.clipTime = params.clipTime - entry->start + entry->sourceStart;
    out.sequenceRect = mInnerRect;
    out.sequenceFrameTicks = params.frameTicks;
    out.sequenceFieldType = params.fieldType;
    if (params.quality == 4 || (params.quality == 3 && mInnerRect.Height() < kLargeHeight)) {
        out.outputRect = mInnerRect;
        out.scaleX = 1.0F;
        out.scaleY = 1.0F;
    }
}

Status NestedTimelineSource::Render(const RenderToken& token, const RenderParams& params,
                                    const RenderResultsRef& results) {
    const Status status = SelectInputBaseNode::Render(token, params, results);
    if (Ostrand::Failed(status) || mScanlineOffset == 0) return status;
    Vellum::Point origin = mFrameSlot->GetOrigin();
    origin.y += mScanlineOffset;
    mFrameSlot->SetOrigin(origin);
    return status;
}

}  // namespace Vantrel
