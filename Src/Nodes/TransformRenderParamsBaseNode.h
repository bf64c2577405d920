// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// A node that asks its inputs with other params, and is itself looked up by them.
///
/// Transforming transformed params again must change nothing, where the node has a fingerprint: a render transforms
/// once for its walk and once more for its lookup.
class TransformRenderParamsBaseNode : public FilterNode {
public:
    using FilterNode::FilterNode;

    Status RenderFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                       VideoFrameRef& frame) override;
    Status EndFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                    std::uint32_t level) override;
    Guid GetFrameHash(const RenderParams& params, const RenderResultsRef& results) override;

    /// Reads only `params` and what Configure stored; any thread of any phase.
    virtual void TransformParams(RenderParams& out, const RenderParams& params) = 0;

protected:
    Status WalkPhase(const RenderParams& params, const InputCall& call) override;

private:
    [[nodiscard]] RenderParams Transformed(const RenderParams& params);
};

}  // namespace Vantrel
