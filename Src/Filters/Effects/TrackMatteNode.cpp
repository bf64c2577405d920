// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/TrackMatteNode.h"

#include "Kiln/FrameOperations.h"
#include "Kiln/Frames.h"
#include "Ostrand/QueryTable.h"
#include "Src/Filters/Effects/OneKernelEffect.h"
#include "Src/Filters/IntrinsicNode.h"
#include "Src/Nodes/FindEffectNode.h"
#include "Src/Nodes/FrameBuffer.h"
#include "Src/VideoNodes/VideoMediaNode.h"
#include "Vantrel/Effects/TrackMatte.h"

namespace Vantrel {
namespace {

constexpr const char16_t* kMotion = u"TQ.XQVE Motion";
constexpr const char16_t* kOpacity = u"TQ.XQVE Opacity";

EffectKernel gTrackMatte{R"(..\..\Src\Filters\Effects\TrackMatteNode)", "TrackMatteKernel", {}};

void TrackMatteKernel(DeviceValue /*frame*/, std::int32_t /*pitch*/, std::int32_t /*width*/, std::int32_t /*height*/,
                      DeviceValue /*matte*/, std::int32_t /*mattePitch*/, std::int32_t /*matteWidth*/,
                      std::int32_t /*matteHeight*/, Vellum::PixelFormat /*format*/, bool /*byLuma*/, bool /*reverse*/) {
}

std::int32_t TrackOf(const RenderNodeRef& layer) {
    std::int32_t track = -1;
    const auto node = Ostrand::Query<RenderNodeBase>(layer);
    const VideoMediaNodeRef media = node ? node->GetMediaDescription() : VideoMediaNodeRef();
    if (media && media->GetParent()) {
        static_cast<void>(media->GetParent()->GetIntProperty("ClipNode::TrackID", track));
    }
    return track;
}

Status MakeBlackMatte(const Kiln::DeviceRef& device, const RenderParams& params, Vellum::PixelFormat format,
                      VideoFrameRef& matte) {
    if (Ostrand::Failed(Kiln::CreateGPUVideoFrame(matte, device, format, params.outputRect.Width(),
                                                  params.outputRect.Height(), params.pixelAspectRatio,
                                                  Vellum::kFieldType_Progressive, {0, 0}))) {
        return Ostrand::kStatus_OutOfMemory;
    }
    const FrameBuffer buffer = FrameBuffer::Demand(matte);
    return Kiln::FillWithOpaqueBlack(device, buffer.data, buffer.rowBytes, format, 0, 0, buffer.Width(),
                                     buffer.Height());
}

}  // namespace

Status TrackMatteNode::QueryInterface(const Guid& iid, void** out) {
    return Ostrand::QueryTable(this, iid, out).Answer<TrackMatteNode>().Otherwise<FilterNode>();
}

RenderNodeRef TrackMatteNode::FindTrackInput(const RenderToken& token, std::int32_t track) {
    const auto above = Ostrand::Query<RenderNodeBase>(token);
    for (std::size_t i = 0; above && i < above->GetInputCount(); ++i) {
        RenderNodeRef layer = above->GetInput(i);
        if (layer && TrackOf(layer) == track) return layer;
    }
    return {};
}

bool TrackMatteNode::IsBelow(const RenderNodeRef& node) const {
    const auto base = Ostrand::Query<RenderNodeBase>(node);
    if (!base) return false;
    if (base.Get() == this) return true;
    const auto matte = Ostrand::Query<TrackMatteNode>(node);
    if (matte && IsBelow(matte->mMatteNode)) return true;
    for (std::size_t i = 0; i < base->GetInputCount(); ++i) {
        if (IsBelow(base->GetInput(i))) return true;
    }
    return false;
}

void TrackMatteNode::ResolveMatte(const RenderToken& token, std::int32_t track) {
    mIsResolved = true;
    mMatteNode = FindTrackInput(token, track);
    // Tracks can be each other's mattes, or their own: what comes back here is none.
    if (IsBelow(mMatteNode)) mMatteNode.Reset();
    const FilterNodeRef layer = Ostrand::Query<FilterNode>(mMatteNode);
    if (layer && !FindEffectNode(layer, kMotion)) {
        const RenderNodeRef placed(new IntrinsicNode);
        bool host = false;
        placed->SetInput(0, mMatteNode);
        static_cast<void>(placed->Configure(layer->GetDescription(), GetRequirements(), host));
        mMatteNode = placed;
    }
}

// A compositor that has drawn the matte's layer before this one has turned that layer's motion and opacity off for the
// frame, because it does their work. Here nobody does it for them.
void TrackMatteNode::TurnOnMotion() {
    const FilterNodeRef matte = Ostrand::Query<FilterNode>(mMatteNode);
    if (!matte) return;
    if (const FilterNodeRef motion = FindEffectNode(matte, kMotion)) {
        // The upper one of the two does the work of both.
        const FilterNodeRef opacity = FindEffectNode(matte, kOpacity);
        (opacity && FindEffectNode(opacity, kMotion) ? opacity : motion)->ResumeCaching();
        return;
    }
    // The node that was put before the layer does the work of its opacity.
    const FilterNodeRef layer = Ostrand::Query<FilterNode>(matte->GetInput(0));
    const FilterNodeRef opacity = layer ? FindEffectNode(layer, kOpacity) : FilterNodeRef();
    if (opacity) opacity->SuppressCaching();
}

Status TrackMatteNode::RenderMatte(const RenderToken& token, const RenderParams& params,
                                   const RenderResultsRef& results, VideoFrameRef& matte) {
    TurnOnMotion();
    return TryWithPurge(token, params, results, [&] { return mMatteNode->RenderFrame(token, params, results, matte); });
}

Status TrackMatteNode::Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) {
    if (!mFrameSlot) throw Ostrand::NullInterfaceException();
    const KernelFrame frame(mFrameSlot);
    const std::int64_t time = GetNodeTime(params.clipTime, false);
    const std::int32_t track = mDescription->GetIntParam(kTrackMatte_Track, time);
    const bool byLuma = mDescription->GetIntParam(kTrackMatte_Using, time) != kTrackMatteUsing_Alpha;
    const bool reverse = mDescription->GetBoolParam(kTrackMatte_Reverse, time);
    if (!mIsResolved && track > 0) ResolveMatte(token, track);

    VideoFrameRef matte;
    if (mMatteNode) {
        RenderParams placed = params;
        placed.pixelAspectRatio = mFrameSlot->GetPixelAspectRatio();
        const Status status = RenderMatte(token, placed, results, matte);
        if (Ostrand::Failed(status)) return status;
    }
    if (!matte) {
        if (track <= 0 || byLuma == reverse) return Ostrand::kStatus_OK;
        const Status status = MakeBlackMatte(mDevice, params, frame.Format(), matte);
        if (Ostrand::Failed(status)) return status;
    }
    const KernelFrame mask(matte);
    // The kernel knows one format.
    if (mask.Format() != frame.Format()) return Ostrand::kStatus_Failure;
    const std::uint64_t kernel = gTrackMatte.Find(mDevice);
    if (kernel == 0) return Ostrand::kStatus_Failure;
    return Launch2D(mDevice, kernel, frame.Grid(), {}, TrackMatteKernel, frame.Data(), frame.Pitch(), frame.Width(),
                    frame.Height(), mask.Data(), mask.Pitch(), mask.Width(), mask.Height(), frame.Format(), byLuma,
                    reverse);
}

Status TrackMatteNode::EndFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                                std::uint32_t level) {
    if (mMatteNode) static_cast<void>(mMatteNode->EndFrame(token, params, results, level));
    return FilterNode::EndFrame(token, params, results, level);
}

}  // namespace Vantrel
