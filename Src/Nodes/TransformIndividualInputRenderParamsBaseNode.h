// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// A node that asks each input with params of its own. Its RenderFrame is the plain walk, without a cache; a subclass
/// that makes a frame replaces it.
class TransformIndividualInputRenderParamsBaseNode : public FilterNode {
public:
    using FilterNode::FilterNode;

    Status RenderFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                       VideoFrameRef& frame) override;
    Status EndFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                    std::uint32_t level) override;

    /// Reads only `params` and what Configure stored; any thread of any phase.
    virtual void TransformParamsForInput(RenderParams& out, const RenderParams& params, std::size_t index) = 0;

protected:
    Status WalkPhase(const RenderParams& params, const InputCall& call) override;

private:
    [[nodiscard]] RenderParams Transformed(const RenderParams& params, std::size_t index);
};

}  // namespace Vantrel
