// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Nodes/TransformIndividualInputRenderParamsBaseNode.h"

namespace Vantrel {

using Base = TransformIndividualInputRenderParamsBaseNode;

RenderParams Base::Transformed(const RenderParams& params, std::size_t index) {
    RenderParams transformed = params;
    TransformParamsForInput(transformed, params, index);
    return transformed;
}

Status Base::RequestHostFrames(const RenderParams& params, const RenderResultsRef& results) {
    return WalkInputs([&](IRenderNode& input, std::size_t index) {
        return input.RequestHostFrames(Transformed(params, index), results);
    });
}

Status Base::CancelHostFrames(const RenderParams& params, const RenderResultsRef& results) {
    VisitInputs(
        [&](IRenderNode& input, std::size_t index) { input.CancelHostFrames(Transformed(params, index), results); });
    return Ostrand::kStatus_OK;
}

Status Base::BeginUpload(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                         bool blocking, VideoFrameRef& frame) {
    return WalkInputs([&](IRenderNode& input, std::size_t index) {
        return input.BeginUpload(token, Transformed(params, index), results, blocking, frame);
    });
}

Status Base::FetchHostFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                            bool blocking, VideoFrameRef& frame) {
    return WalkInputs([&](IRenderNode& input, std::size_t index) {
        return input.FetchHostFrame(token, Transformed(params, index), results, blocking, frame);
    });
}

Status Base::RenderFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                         VideoFrameRef& frame) {
    return WalkInputs([&](IRenderNode& input, std::size_t index) {
        return input.RenderFrame(token, Transformed(params, index), results, frame);
    });
}

Status Base::EndFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                      std::uint32_t level) {
    VisitInputs([&](IRenderNode& input, std::size_t index) {
        input.EndFrame(token, Transformed(params, index), results, level);
    });
    return Ostrand::kStatus_OK;
}

Status Base::CollectHostFrames(const RenderParams& params, const RenderResultsRef& results,
                               const RenderResultsRef& previous) {
    return WalkInputs([&](IRenderNode& input, std::size_t index) {
        return input.CollectHostFrames(Transformed(params, index), results, previous);
    });
}

}  // namespace Vantrel
