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

Status Base::WalkPhase(const RenderParams& params, const InputCall& call) {
    return WalkInputs([&](IRenderNode& input, std::size_t index) { return call(input, Transformed(params, index)); });
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

}  // namespace Vantrel
