// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Nodes/TransformRenderParamsBaseNode.h"

namespace Vantrel {

RenderParams TransformRenderParamsBaseNode::Transformed(const RenderParams& params) {
    RenderParams transformed = params;
    TransformParams(transformed, params);
    return transformed;
}

Status TransformRenderParamsBaseNode::RequestHostFrames(const RenderParams& params, const RenderResultsRef& results) {
    return RenderNodeBase::RequestHostFrames(Transformed(params), results);
}

Status TransformRenderParamsBaseNode::CancelHostFrames(const RenderParams& params, const RenderResultsRef& results) {
    return RenderNodeBase::CancelHostFrames(Transformed(params), results);
}

Status TransformRenderParamsBaseNode::BeginUpload(const RenderToken& token, const RenderParams& params,
                                                  const RenderResultsRef& results, bool blocking,
                                                  VideoFrameRef& frame) {
    return RenderNodeBase::BeginUpload(token, Transformed(params), results, blocking, frame);
}

Status TransformRenderParamsBaseNode::FetchHostFrame(const RenderToken& token, const RenderParams& params,
                                                     const RenderResultsRef& results, bool blocking,
                                                     VideoFrameRef& frame) {
    return RenderNodeBase::FetchHostFrame(token, Transformed(params), results, blocking, frame);
}

Status TransformRenderParamsBaseNode::RenderFrame(const RenderToken& token, const RenderParams& params,
                                                  const RenderResultsRef& results, VideoFrameRef& frame) {
    return FilterNode::RenderFrame(token, Transformed(params), results, frame);
}

Status TransformRenderParamsBaseNode::EndFrame(const RenderToken& token, const RenderParams& params,
                                               const RenderResultsRef& results, std::uint32_t level) {
    return FilterNode::EndFrame(token, Transformed(params), results, level);
}

Status TransformRenderParamsBaseNode::CollectHostFrames(const RenderParams& params, const RenderResultsRef& results,
                                                        const RenderResultsRef& previous) {
    return RenderNodeBase::CollectHostFrames(Transformed(params), results, previous);
}

Guid TransformRenderParamsBaseNode::GetFrameHash(const RenderParams& params, const RenderResultsRef& results) {
    return RenderNodeBase::GetFrameHash(Transformed(params), results);
}

}  // namespace Vantrel
