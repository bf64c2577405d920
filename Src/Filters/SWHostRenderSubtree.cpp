// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/SWHostRenderSubtree.h"

#include "Ostrand/QueryTable.h"
#include "Src/Nodes/RenderDescription.h"
#include "Src/Outside/Suites.h"
#include "Src/VideoNodes/VideoEffectNode.h"

namespace Vantrel {

Status SWHostRenderSubtree::QueryInterface(const Guid& iid, void** out) {
    return Ostrand::QueryTable(this, iid, out)
        .Answer<SWHostRenderSubtree>()
        .Otherwise<SWHostVideoSegmentRenderSuiteNode>();
}

Status SWHostRenderSubtree::RequestHostRender(const RenderParams& params, VantrelRenderCallback callback, void* context,
                                              std::uint32_t& requestID) {
    if (!mDescription) return Ostrand::kStatus_Failure;
    const RenderDescription wanted(params);
    const CorvaneVideoSegmentRenderSuite& suite = VideoSegmentRenderSuite();
    const Vellum::PixelAspectRatio aspect = params.pixelAspectRatio;
    const std::int32_t width = params.sequenceRect.Width();
    const std::int32_t height = params.sequenceRect.Height();

    VantrelHostStatus status = Ostrand::kStatus_Failure;
    const auto effect = boost::dynamic_pointer_cast<VideoEffectNode>(mDescription);
    if (effect && effect->GetParent()) {
        status = suite.RenderOperators(params.sequenceID, effect->GetParent()->GetNodeID(), 0,
                                       effect->GetOperatorIndex() + 1, params.time, GetNodeTime(params.clipTime, true),
                                       params.sequenceFrameTicks, width, height, aspect.numerator, aspect.denominator,
                                       0, wanted.Get(), callback, context, &requestID);
    } else {
        status = suite.RenderNode(params.sequenceID, mDescription->GetNodeID(), params.time,
                                  GetNodeTime(params.clipTime, false), params.sequenceFrameTicks, width, height,
                                  aspect.numerator, aspect.denominator, wanted.Get(), callback, context, &requestID);
    }
    return Ostrand::Failed(status) ? Ostrand::kStatus_Failure : Ostrand::kStatus_OK;
}

}  // namespace Vantrel
