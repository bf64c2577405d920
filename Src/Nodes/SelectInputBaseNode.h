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
    Status RenderFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                       VideoFrameRef& frame) override;
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

    /// The end that this node has passed on last. Input 0 is ended twice where it is the choice; without this, a choice
    /// below a choice would be ended four times, and so on down. Render thread only.
    struct EndedFrame {
        const RenderResults* results = nullptr;
        std::int64_t time = 0;
        std::int64_t clipTime = 0;
        std::uint32_t fieldSelection = 0;
        std::uint32_t level = 0;
    };
    EndedFrame mEnded;
};

}  // namespace Vantrel
