// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <vector>

#include "Ostrand/Allocated.h"
#include "Src/Filters/MulticamGrid.h"
#include "Src/Nodes/TransformIndividualInputRenderParamsBaseNode.h"

namespace Vantrel {

/// The multicam monitor: renders all cameras and tiles them, and tells the request which camera's picture is on air.
/// Has no store and no cache of its own: each camera keeps its picture. Each renders at the size of the whole monitor,
/// or of its half beside the programme; the tile is reached by scaling.
class MulticamNode final : public TransformIndividualInputRenderParamsBaseNode,
                           public Ostrand::Allocated<MulticamNode> {
public:
    static constexpr Guid kInterfaceID = kMulticamNodeID;

    MulticamNode() : TransformIndividualInputRenderParamsBaseNode(true, true) {}

    Status QueryInterface(const Guid& iid, void** out) override;
    Status Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) override;
    [[nodiscard]] WideString GetName() override { return u"MulticamRenderNode"; }
    Status RenderFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                       VideoFrameRef& frame) override;
    /// The work is RenderFrame's.
    Status Render(const RenderToken& /*token*/, const RenderParams& /*params*/,
                  const RenderResultsRef& /*results*/) override {
        return Ostrand::kStatus_OK;
    }
    /// The same for every camera.
    void TransformParamsForInput(RenderParams& out, const RenderParams& params, std::size_t index) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    using Frames = std::vector<VideoFrameRef>;

    Status RenderCameras(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                         Frames& cameras);
    /// An empty frame of the output; kStatus_OutOfMemory when it is refused twice.
    Status CreateOutput(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                        Vellum::PixelFormat format, VideoFrameRef& output);

    MulticamLook mLook;
};

}  // namespace Vantrel
