// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// What transitions share: exactly two inputs, the outgoing clip (0) and the incoming one (1), which arrive in the
/// frame's size with their motion and opacity done, and which the node renders itself.
class TransitionBaseNode : public FilterNode {
public:
    static constexpr Guid kInterfaceID = kTransitionBaseNodeID;

    Status QueryInterface(const Guid& iid, void** out) override;

protected:
    TransitionBaseNode() : FilterNode(true, true) {}

    [[nodiscard]] bool HasBothInputs() const { return GetInputCount() == 2; }
    /// Renders one input, which gets a second try after a purge. An empty input leaves `frame` as it is. A failure
    /// empties the frame slot.
    Status RenderSide(std::size_t index, const RenderToken& token, const RenderParams& params,
                      const RenderResultsRef& results, VideoFrameRef& frame);
    /// Renders both. The outgoing one can be released by purges while the incoming one renders.
    Status RenderSides(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                       VideoFrameRef& outgoing, VideoFrameRef& incoming);
    /// Puts a new frame of a frame's size, format and aspect into the frame slot, with a second try after a purge.
    /// @return 0 or kStatus_OutOfMemory, and then the slot is empty.
    Status MakeFrameLike(const VideoFrameRef& frame, const RenderToken& token, const RenderParams& params,
                         const RenderResultsRef& results);
};

/// How much of the transition has gone by at the params' time: 0 at its beginning, 1 at its end. Not clamped. A
/// transition without a duration is at its beginning.
[[nodiscard]] float ElapsedFraction(const RenderNodeBase& node, const RenderParams& params);

/// Can pixels of `source` stand for those of `target`, place by place? The inputs of a transition have the frame's size
/// and format, but no kernel should find out that one doesn't.
[[nodiscard]] bool Covers(const VideoFrameRef& source, const VideoFrameRef& target);

}  // namespace Vantrel
