// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Nodes/TransformRenderParamsBaseNode.h"

namespace Vantrel {

RenderParams TransformRenderParamsBaseNode::Transformed(const RenderParams& params) {
    RenderParams transformed = params;
    TransformParams(transformed, params);
    return transformed;
}

Status TransformRenderParamsBaseNode::WalkPhase(const RenderParams& params, const InputCall& call) {
    return RenderNodeBase::WalkPhase(Transformed(params), call);
}

Status TransformRenderParamsBaseNode::RenderFrame(const RenderToken& token, const RenderParams& params,
                                                  const RenderResultsRef& results, VideoFrameRef& frame) {
    return FilterNode::RenderFrame(token, Transformed(params), results, frame);
}

Status TransformRenderParamsBaseNode::EndFrame(const RenderToken& token, const RenderParams& params,
                                               const RenderResultsRef& results, std::uint32_t level) {
    return FilterNode::EndFrame(token, Transformed(params), results, level);
}

Guid TransformRenderParamsBaseNode::GetFrameHash(const RenderParams& params, const RenderResultsRef& results) {
    return RenderNodeBase::GetFrameHash(Transformed(params), results);
}

}  // namespace Vantrel
