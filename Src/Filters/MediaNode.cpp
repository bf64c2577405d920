// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/MediaNode.h"

#include "Src/Filters/FieldTime.h"
#include "Src/Filters/HostRenderSubtreeNode.h"
#include "Src/Filters/Source/DeinterlaceSource.h"
#include "Src/Filters/Source/FieldReverseSource.h"
#include "Src/Filters/Source/InterlaceConsecutiveFramesSource.h"
#include "Src/Filters/Source/InvertAlphaSource.h"
#include "Src/Filters/Source/RemoveFlickerSource.h"
#include "Src/Filters/Source/ReverseFieldDominanceSource.h"
#include "Src/Filters/Source/ScaleSource.h"
#include "Src/Filters/Source/TimeSampleSource.h"
#include "Src/Filters/UploadNode.h"
#include "Src/Nodes/FrameSizeLimit.h"
#include "Src/Nodes/ProxyNode.h"
#include "Src/Outside/Suites.h"
#include "Src/VideoNodes/VideoClipNode.h"

namespace Vantrel {

namespace {

/// What the host is asked when a clip's native format is wanted.
constexpr VantrelClipRecord kNativeFormatRequest{0, 1, 1, 1, 1, Vellum::kFieldType_SeparateFields, 1};

std::uint32_t OtherOrder(std::uint32_t fieldType) {
    return fieldType == Vellum::kFieldType_UpperFirst ? Vellum::kFieldType_LowerFirst : Vellum::kFieldType_UpperFirst;
}

}  // namespace

/// Which sources the media needs, in the chain's order.
struct MediaNode::ChainPlan {
    bool timeSample = false;
    bool interlaceConsecutive = false;
    bool removeFlicker = false;
    bool deinterlace = false;
    bool reverseDominance = false;
    bool fieldReverse = false;
    bool invertAlpha = false;

    ChainPlan(const MediaNode& node, const VideoMediaNode& media, const RenderRequirements& requirements);

private:
    [[nodiscard]] static bool TimeDiffers(const MediaNode& node, const VideoMediaNode& media,
                                          const RenderRequirements& requirements);
    void PlanFields(const MediaNode& node, const VideoMediaNode& media, const RenderRequirements& requirements);
};

MediaNode::ChainPlan::ChainPlan(const MediaNode& node, const VideoMediaNode& media,
                                const RenderRequirements& requirements) {
    const bool moves = !node.mStill;
    const bool frameBlend = moves && media.GetStreamFrameBlend();
    const bool merges = node.mStreamFieldType == Vellum::kFieldType_SeparateFields ||
                        (IsInterlaced(node.mStreamFieldType) && !IsInterlaced(requirements.fieldType) && frameBlend);
    const bool deinterlaceAlways = moves && media.GetDeinterlaceAlways();
    interlaceConsecutive = moves && media.GetInterlaceConsecutiveFrames();
    timeSample =
        (moves && TimeDiffers(node, media, requirements)) || merges || interlaceConsecutive || deinterlaceAlways;
    removeFlicker = media.GetRemoveFlicker();
    deinterlace = deinterlaceAlways;

    const bool removePulldown = moves && media.GetStreamRemovePulldown() && media.GetStreamPullDownCadence() != 0;
    if (!removePulldown && IsInterlaced(node.mStreamFieldType)) {
        PlanFields(node, media, requirements);
    } else {
        deinterlace = false;
    }
    invertAlpha = !media.GetStreamIgnoreAlpha() && media.GetStreamInvertAlpha();
}

bool MediaNode::ChainPlan::TimeDiffers(const MediaNode& node, const VideoMediaNode& media,
                                       const RenderRequirements& requirements) {
    if (requirements.frameTicks != node.mStreamFrameTicks || media.GetClipBackwards()) return true;
    if (media.GetClipSpeed() != 1.0) return true;
    const auto clip = boost::dynamic_pointer_cast<VideoClipNode>(media.GetParent());
    return clip && clip->GetTimeRemapping();
}

void MediaNode::ChainPlan::PlanFields(const MediaNode& node, const VideoMediaNode& media,
                                      const RenderRequirements& requirements) {
    std::uint32_t fieldType = node.mStreamFieldType;
    if (media.GetStreamReverseFieldDominance() != media.GetClipBackwards()) {
        reverseDominance = true;
        fieldType = OtherOrder(fieldType);
    }
    // A picture that is reduced is resampled anyway, which leaves nothing of its lines.
    const bool reduced = node.mStream.scalePolicy != 0 && requirements.frameRect.Height() < node.mStream.rect.Height();
    fieldReverse = fieldType != requirements.fieldType && IsInterlaced(requirements.fieldType) && !reduced;
}

MediaNode::MediaNode() : SelectInputBaseNode(true, false) {}

void MediaNode::ReadStream(const VideoMediaNode& media) {
    mStream = StreamGeometry::Read(media);
    mStreamFrameTicks = media.GetStreamFrameRate();
    mStill = media.IsStill();
    mStreamFieldType = mStill ? Vellum::kFieldType_Progressive : static_cast<std::uint32_t>(media.GetStreamFieldType());
    mContinuousTime = media.GetStreamIsContinuousTime();
    mContentStart = media.GetContentStart();
    const auto clip = boost::dynamic_pointer_cast<VideoClipNode>(media.GetParent());
    mFrameHold = clip ? clip->GetFrameHoldAtTime() : Vellum::kTime_Max;
}

Status MediaNode::Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) {
    mMedia = boost::dynamic_pointer_cast<VideoMediaNode>(description);
    if (!mMedia) return Ostrand::kStatus_Failure;
    ReadStream(*mMedia);
    MakeHostScaledInput(*mMedia, requirements, host);
    if (ExceedsDeviceMemory(mStream.rect, *requirements.device)) return Ostrand::kStatus_Failure;

    const ChainPlan plan(*this, *mMedia, requirements);
    mHasTimeSource = plan.timeSample;
    const Status status = BuildChain(plan, requirements, host);
    if (Ostrand::Failed(status)) return status;
    return FilterNode::Configure(description, requirements, host);
}

void MediaNode::MakeHostScaledInput(const VideoMediaNode& media, const RenderRequirements& requirements, bool& host) {
    const auto clipID = static_cast<std::uint32_t>(media.GetClipID());
    if (clipID == 0) return;
    VantrelClipRecord native{};
    if (Ostrand::Failed(VideoSegmentRenderSuite().GetClipFormat(clipID, 0, &kNativeFormatRequest, &native))) return;
    if (native.width != mStream.rect.Width() || native.height != mStream.rect.Height()) return;

    const RenderNodeRef input(new ProxyNode<UploadNode, HostRenderSubtreeNode>());
    if (!Ostrand::Failed(input->Configure(mMedia, requirements, host))) mHostScaledInput = input;
}

Status MediaNode::BuildChain(const ChainPlan& plan, const RenderRequirements& requirements, bool& host) {
    Status status = Ostrand::kStatus_OK;
    const auto add = [&](bool wanted, auto adder) {
        if (wanted && !Ostrand::Failed(status)) status = (this->*adder)(requirements, host);
    };
    add(plan.timeSample, &MediaNode::AddSource<TimeSampleSource>);
    add(true, &MediaNode::AddSource<ScaleSource>);
    add(plan.interlaceConsecutive, &MediaNode::AddSource<InterlaceConsecutiveFramesSource>);
    add(plan.removeFlicker, &MediaNode::AddSource<RemoveFlickerSource>);
    add(plan.deinterlace, &MediaNode::AddSource<DeinterlaceSource>);
    add(plan.reverseDominance, &MediaNode::AddSource<ReverseFieldDominanceSource>);
    add(plan.fieldReverse, &MediaNode::AddSource<FieldReverseSource>);
    add(plan.invertAlpha, &MediaNode::AddSource<InvertAlphaSource>);
    return status;
}

template <class Source>
Status MediaNode::AddSource(const RenderRequirements& requirements, bool& host) {
    const RenderNodeRef source(static_cast<FilterNode*>(new Source()));
    const Status status = source->Configure(mMedia, requirements, host);
    if (Ostrand::Failed(status)) return status;
    if (mChainTail) {
        mChainTail->SetInput(0, source);
    } else {
        mProducer = GetInput(0);
        // Not the virtual one: a proxy hands its inputs to the producer.
        FilterNode::SetInput(0, source);
    }
    source->SetInput(0, mProducer);
    mChainTail = source;
    return Ostrand::kStatus_OK;
}

bool MediaNode::UsesHostScaledInput(const RenderParams& params) const {
    return mHostScaledInput && params.quality < 3 &&
           (mStream.scalePolicy != 0 || params.scaleX > 1.0F || params.scaleY > 1.0F) &&
           (mStream.rect.Width() > 2 * params.outputRect.Width() ||
            mStream.rect.Height() > 2 * params.outputRect.Height());
}

void MediaNode::SelectInput(RenderParams& out, const RenderParams& params, RenderNodeRef& input) {
    out = params;
    if (UsesHostScaledInput(params)) {
        input = mHostScaledInput;
        return;
    }
    const Vellum::Point size = mStream.GetRenderSize(params);
    out.outputRect.right = out.outputRect.left + size.x;
    out.outputRect.bottom = out.outputRect.top + size.y;
    out.scaleX = static_cast<float>(mStream.rect.Width()) / static_cast<float>(size.x);
    out.scaleY = static_cast<float>(mStream.rect.Height()) / static_cast<float>(size.y);
    out.pixelAspectRatio = mStream.aspect;
    out.fieldType = mStreamFieldType;
    out.frameTicks = mStreamFrameTicks;
    MapTime(out, params);
    input = GetInput(0);
}

void MediaNode::MapTime(RenderParams& out, const RenderParams& params) {
    const std::int64_t fieldTicks = Vellum::HalfFrameTicks(mStreamFrameTicks);
    if (mStreamFieldType == Vellum::kFieldType_SeparateFields && !mContinuousTime) out.frameTicks = fieldTicks;
    if (mStill) {
        out.clipTime = 0;
        return;
    }
    if (mHasTimeSource) return;
    if (mFrameHold != Vellum::kTime_Max) {
        out.time = mFrameHold;
        out.clipTime = mFrameHold;
        out.fieldSelection = FrameParity(mFrameHold, fieldTicks);
    } else {
        out.clipTime = GetNodeTime(params.clipTime, false);
    }
    out.clipTime += mContentStart;
}

Status MediaNode::RenderFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                              VideoFrameRef& frame) {
    if (UsesHostScaledInput(params)) return mHostScaledInput->RenderFrame(token, params, results, frame);
    return FilterNode::RenderFrame(token, params, results, frame);
}

Status MediaNode::Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) {
    const Status status = SelectInputBaseNode::Render(token, params, results);
    if (Ostrand::Failed(status)) return status;
    const Vellum::Rect bounds = mFrameSlot->GetBounds();
    Vellum::Point origin = mFrameSlot->GetOrigin();
    origin.x += (bounds.Width() - ScaleLength(params.sequenceRect.Width(), params.scaleX)) / 2;
    origin.y += (bounds.Height() - ScaleLength(params.sequenceRect.Height(), params.scaleY)) / 2;
    mFrameSlot->SetOrigin(origin);
    return status;
}

}  // namespace Vantrel
