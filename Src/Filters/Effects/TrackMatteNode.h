// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// Masks its input, in place, with the picture of another track; formulas: Vantrel/Effects/TrackMatte.h. That picture
/// isn't an input: the node looks for the track among the layers of the compositor above it, which it knows as its
/// token, once in its life, and renders it a second time with its motion and opacity.
class TrackMatteNode final : public FilterNode, public Ostrand::Allocated<TrackMatteNode> {
public:
    static constexpr Guid kInterfaceID{0x8D572F02, 0x6C6F, 0x4346, {0x8A, 0x5A, 0xA9, 0xE6, 0x36, 0x92, 0x7E, 0x4F}};

    TrackMatteNode() : FilterNode(false, false) {}

    Status QueryInterface(const Guid& iid, void** out) override;
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;
    /// Also ends the matte.
    Status EndFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                    std::uint32_t level) override;

    /// The first input of the node in the token that lies on a track; empty if there is none.
    [[nodiscard]] static RenderNodeRef FindTrackInput(const RenderToken& token, std::int32_t track);

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    void ResolveMatte(const RenderToken& token, std::int32_t track);
    /// Is this node in a tree, or a matte of it?
    [[nodiscard]] bool IsBelow(const RenderNodeRef& node) const;
    /// Leaves `matte` empty where there is no matte node.
    [[nodiscard]] Status RenderMatte(const RenderToken& token, const RenderParams& params,
                                     const RenderResultsRef& results, VideoFrameRef& matte);
    void TurnOnMotion();

    bool mIsResolved = false;
    RenderNodeRef mMatteNode;
};

}  // namespace Vantrel
