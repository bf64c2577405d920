// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// A node that takes its picture from one node of its choice, with params of its choice. Without a choice Render gives
/// no frame and every other phase but EndFrame raises NullInterfaceException.
class SelectInputBaseNode : public FilterNode {
public:
    using FilterNode::FilterNode;

    Status CancelHostFrames(const RenderParams& params, const RenderResultsRef& results) override;
    Status EndFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                    std::uint32_t level) override;
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

    /// Reads only `params` and what Configure stored; any thread of any phase. `input` may stay empty.
    virtual void SelectInput(RenderParams& out, const RenderParams& params, RenderNodeRef& input) = 0;

protected:
    Status WalkPhase(const RenderParams& params, const InputCall& call) override;

private:
    struct Choice {
        RenderParams params;
        RenderNodeRef input;
    };
    [[nodiscard]] Choice Choose(const RenderParams& params);
};

}  // namespace Vantrel
