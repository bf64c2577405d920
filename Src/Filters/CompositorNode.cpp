// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/CompositorNode.h"

#include "Src/Filters/ScopedRenderTime.h"
#include "Src/Nodes/WorkingFormat.h"

namespace Vantrel {

CompositorNode::CompositorNode() : FilterNode(true, false) {}

std::vector<RenderNodeRef> CompositorNode::GetActiveLayers() const {
    std::vector<RenderNodeRef> layers;
    for (const RenderNodeRef& input : mInputs) {
        if (!input) continue;
        const auto filter = Ostrand::Query<FilterNode>(input);
        const bool disabled =
            filter && filter->GetDescription() && filter->GetDescription()->GetNodeType() == NodeType::kDisabled;
        if (!disabled) layers.push_back(input);
    }
    return layers;
}

Status CompositorNode::Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) {
    const std::vector<RenderNodeRef> layers = GetActiveLayers();
    const RenderToken self(this);
    for (std::size_t i = 0; i < layers.size(); ++i) {
        LayerMotion motion;
        motion.overDestination = i != 0;
        if (const auto filter = Ostrand::Query<FilterNode>(layers[i])) {
            ReadLayerMotion(motion, *filter, params, results, true, true);
        }
        VideoFrameRef layer;
        Status status = RenderInput(layers[i], self, params, results, layer);
        if (Ostrand::Failed(status)) {
            mFrameSlot.Reset();
            return status;
        }
        if (i == 0) {
            const LayerPlacement placement(motion, layer, params);
            if (placement.IsIdentity() && layers.size() == 1) {
                mFrameSlot = layer;
                return Ostrand::kStatus_OK;
            }
            status = CreateOutput(token, params, results, placement);
            if (Ostrand::Failed(status)) return status;
        }
        status = DrawTimed(token, params, results, motion, layer);
        if (Ostrand::Failed(status)) return status;
    }
    return mFrameSlot ? Ostrand::kStatus_OK : Ostrand::kStatus_Failure;
}

Status CompositorNode::CreateOutput(const RenderToken& token, const RenderParams& params,
                                    const RenderResultsRef& results, const LayerPlacement& bottom) {
    const Vellum::PixelFormat format = GetWorkingPixelFormat(params, *mDevice);
    const Status status =
        TryWithPurge(token, params, results, [&] { return CreateLayerTarget(mDevice, format, params, mFrameSlot); });
    if (Ostrand::Failed(status)) {
        mFrameSlot.Reset();
        return status;
    }
    return ClearUnlessCovered(mDevice, bottom, mFrameSlot);
}

Status CompositorNode::DrawTimed(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                                 const LayerMotion& motion, const VideoFrameRef& layer) {
    const Vellum::RenderQuality quality = Vellum::ToRenderQuality(params.quality);
    const ScopedRenderTime timer(mDevice, mRenderTime);
    return TryWithPurge(token, params, results, [&] { return DrawLayer(mDevice, motion, layer, mFrameSlot, quality); });
}

}  // namespace Vantrel
