// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <limits>

#include "Shared/Src/SegmentReader.h"
#include "Shared/Src/TreeBuilder.h"
#include "Shared/Src/VerdictFolding.h"
#include "Src/Filters/INestedTimelineNode.h"
#include "Src/VideoNodes/VideoClipNode.h"

// The part of TreeBuilder that builds media: streams, previews and nested sequences.
namespace Vantrel {
namespace {

using Ostrand::Failed;
using Ostrand::kStatus_OK;

using VideoClipNodeRef = boost::shared_ptr<VideoClipNode>;

VideoClipNodeRef ParentClipOf(const VideoMediaNode& media) {
    return boost::dynamic_pointer_cast<VideoClipNode>(media.GetParent());
}

std::uint32_t NestedSequenceOf(const VideoMediaNode& media) {
    const std::int32_t nested = media.GetNestedSequenceTimelineID();
    return static_cast<std::uint32_t>(nested != 0 ? nested : media.GetSelectedMulticamTrackTimelineID());
}

/// A multicam view shows a track that its source doesn't have.
bool IsTrackMissing(const VideoMediaNode& media) {
    std::int32_t track = 0;
    return !Failed(media.GetSelectedMulticamTrack(track)) && track >= media.GetInputCount();
}

bool PlaysPlainly(const VideoClipNode& clip) {
    return clip.GetClipSpeed() == 1.0 && !clip.GetTimeRemapping() && !clip.GetClipBackwards() && !clip.HasFrameHold();
}

/// A time of the outer sequence at a speed, rounded half up. Times that no sequence reaches stay within their type.
std::int64_t AtSpeed(double speed, std::int64_t ticks) {
    constexpr std::int64_t kFarthest = std::numeric_limits<std::int64_t>::max() / 2;
    constexpr auto kLimit = static_cast<double>(kFarthest);
    return static_cast<std::int64_t>(std::clamp(speed * static_cast<double>(ticks) + 0.5, -kLimit, kLimit));
}

}  // namespace

Status TreeBuilder::BuildPreview(const VideoMediaNodeRef& media, Branch& branch, Requirements requirements) {
    Branch preview(branch.info, branch.host);
    const Status status = BuildMedia(media, preview, requirements);
    branch.host = preview.host;
    if (Failed(status)) return status;
    branch.ok = preview.ok;
    if (!branch.ok) return kStatus_OK;
    branch.tree = preview.tree;
    branch.host = true;
    branch.info.isPreview = true;
    return kStatus_OK;
}

Status TreeBuilder::BuildMedia(const VideoMediaNodeRef& media, Branch& branch, Requirements requirements) {
    if (!media) return BuildBlack(branch, requirements);
    const std::uint32_t nested = NestedSequenceOf(*media);
    const bool trackMissing = nested == 0 && IsTrackMissing(*media);

    bool differs = false;
    if (const VideoClipNodeRef clip = ParentClipOf(*media)) {
        const bool sizeDiffers = media->GetStreamFrameRect() != requirements.frameRect;
        const bool rateDiffers = media->GetStreamFrameRate() != requirements.frameTicks ||
                                 media->GetClipSpeed() != 1.0 || clip->GetTimeRemapping();
        differs = sizeDiffers || rateDiffers;
        if (differs) ++branch.info.intrinsicCount;
    }
    if (trackMissing) return BuildBlack(branch, requirements);
    if (nested == 0) return BuildStream(media, branch, requirements);
    return BuildNested(media, nested, !differs, branch, requirements);
}

Status TreeBuilder::BuildStream(const VideoMediaNodeRef& media, Branch& branch, Requirements requirements) {
    branch.tree = mState.createNode(kKey_HostClip, media, requirements, branch.host);
    if (!branch.tree) {
        branch.ok = false;
        branch.host = true;
        return kStatus_OK;
    }
    SegmentInfo& info = branch.info;
    if (media->GetMediaIsOffline() || media->GetMediaIsPending()) {
        info.realTime = false;
        return kStatus_OK;
    }
    const auto subType = static_cast<std::uint32_t>(media->GetStreamFrameVidSubType());
    info.isPreview = media->IsPreview();
    info.realTime = info.realTime && mState.nativeSubTypes.count(subType) != 0;
    if (mState.hostSubTypes.count(subType) != 0) {
        info.hostPart = true;
        branch.host = true;
    }
    return kStatus_OK;
}

/// `matches`: the nested sequence has the size and rate of the outer one and plays at its speed.
Status TreeBuilder::BuildNested(const VideoMediaNodeRef& media, std::uint32_t sequenceID, bool matches, Branch& branch,
                                Requirements requirements) {
    bool scratch = false;
    const RenderNodeRef node = mState.createNode(kKey_NestedTimeline, media, requirements, scratch);
    // The creator may answer with a host render in its place, which has no use for trees.
    if (const auto nestedNode = Ostrand::Query<INestedTimelineNode>(node)) {
        branch.tree = node;
        branch.info.nested = true;
        nestedNode->SetDefaultTree(mState.blackTree);
        return ReadNested(media, sequenceID, branch);
    }
    const VideoClipNodeRef clip = ParentClipOf(*media);
    if (clip && !(matches && PlaysPlainly(*clip))) {
        branch.ok = false;
        branch.host = true;
        return kStatus_OK;
    }
    branch.info.flattened = true;
    return ReadNested(media, sequenceID, branch);
}

Status TreeBuilder::ReadNested(const VideoMediaNodeRef& media, std::uint32_t sequenceID, Branch& branch) {
    SegmentInfo& info = branch.info;
    const double speed = media->GetClipSpeed();
    const SequenceRange range{AtSpeed(speed, info.in), AtSpeed(speed, info.out),
                              AtSpeed(speed, info.offset - media->GetTimeOffset())};
    SegmentInfo sequence;
    const Status status = mReader.ReadSequence(sequenceID, range, {false, sequence, branch.tree});
    if (Failed(status)) return status;

    const VideoClipNodeRef clip = ParentClipOf(*media);
    if (speed != 1.0 || (clip && clip->GetTimeRemapping())) branch.host = true;
    FoldNestedSequence(info, sequence);
    return kStatus_OK;
}

}  // namespace Vantrel
