// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/MulticamNode.h"

#include <algorithm>

#include "Ostrand/QueryTable.h"
#include "Src/Filters/LayerMotion.h"
#include "Src/Filters/ScopedRenderTime.h"
#include "Src/Nodes/WorkingFormat.h"
#include "Src/VideoNodes/VideoStructureNodes.h"
#include "Tarn/Multicam.h"

namespace Vantrel {

Status MulticamNode::QueryInterface(const Guid& iid, void** out) {
    return Ostrand::QueryTable(this, iid, out)
        .Answer<MulticamNode>()
        .Otherwise<TransformIndividualInputRenderParamsBaseNode>();
}

Status MulticamNode::Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) {
    if (const auto* multicam = dynamic_cast<const VideoMultiCamNode*>(description.get())) {
        multicam->GetSelectedTrack(mLook.selected);
        mLook.showProgram = multicam->GetShowProgram();
        mLook.recording = multicam->GetRecording();
        mLook.isNonMulticam = multicam->GetIsNonMultiCam();
    }
    return FilterNode::Configure(description, requirements, host);
}

void MulticamNode::TransformParamsForInput(RenderParams& out, const RenderParams& params, std::size_t /*index*/) {
    out = params;
    out.sequenceRect = mFrameRect;
    out.pixelAspectRatio = mPixelAspectRatio;
    if (mLook.showProgram) out.sequenceRect.right = mFrameRect.left + mFrameRect.Width() / 2;
    const auto scaled = [](std::int32_t length, float scale) {
        return static_cast<std::int32_t>(static_cast<float>(length) / scale);
    };
    out.outputRect = mFrameRect;
    out.outputRect.right = mFrameRect.left + scaled(out.sequenceRect.Width(), params.scaleX);
    out.outputRect.bottom = mFrameRect.top + scaled(out.sequenceRect.Height(), params.scaleY);
}

Status MulticamNode::RenderFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                                 VideoFrameRef& frame) {
    Frames cameras(GetInputCount());
    Status status = RenderCameras(token, params, results, cameras);
    if (Ostrand::Failed(status)) return status;

    const Vellum::PixelFormat working = GetWorkingPixelFormat(params, *mDevice);
    const auto shown = std::find_if(cameras.begin(), cameras.end(), [](const VideoFrameRef& c) { return bool(c); });
    const Vellum::PixelFormat format = shown == cameras.end() ? working : (*shown)->GetPixelFormat();
    const std::int32_t factor = Tarn::GetMulticamDownsampleFactor(static_cast<std::int32_t>(cameras.size()));
    cameras.resize(std::max(cameras.size(), static_cast<std::size_t>(factor) * static_cast<std::size_t>(factor)));

    mRenderTime = 0.0F;
    const ScopedRenderTime timer(mDevice, mRenderTime);
    VideoFrameRef output;
    status = CreateOutput(token, params, results, format, output);
    if (Ostrand::Failed(status)) return status;
    status = DrawMulticamGrid(mDevice, cameras, output, mLook, Vellum::ToRenderQuality(params.quality));
    if (Ostrand::Failed(status)) return status;
    cameras.clear();
    if (format != working) {
        const VideoFrameRef drawn = output;
        status = CreateOutput(token, params, results, working, output);
        if (!Ostrand::Failed(status)) status = Kiln::ConvertFrame(drawn, output);
        if (Ostrand::Failed(status)) return status;
    }
    frame = output;
    return Ostrand::kStatus_OK;
}

Status MulticamNode::RenderCameras(const RenderToken& token, const RenderParams& params,
                                   const RenderResultsRef& results, Frames& cameras) {
    for (std::size_t i = 0; i < cameras.size(); ++i) {
        if (const RenderNodeRef input = GetInput(i)) {
            RenderParams transformed;
            TransformParamsForInput(transformed, params, i);
            const Status status = RenderInput(input, token, transformed, results, cameras[i]);
            if (Ostrand::Failed(status)) return status;
        }
        const bool onAir = mLook.selected >= 0 && i == static_cast<std::size_t>(mLook.selected);
        if (results && (onAir || mLook.isNonMulticam)) results->SetSelectedFrame(cameras[i]);
    }
    return Ostrand::kStatus_OK;
}

Status MulticamNode::CreateOutput(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                                  Vellum::PixelFormat format, VideoFrameRef& output) {
    if (!Ostrand::Failed(CreateLayerTarget(mDevice, format, params, output))) return Ostrand::kStatus_OK;
    Purge(token, params, results);
    const bool refused = Ostrand::Failed(CreateLayerTarget(mDevice, format, params, output));
    return refused ? Ostrand::kStatus_OutOfMemory : Ostrand::kStatus_OK;
}

}  // namespace Vantrel
