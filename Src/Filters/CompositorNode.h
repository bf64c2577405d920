// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <vector>

#include "Ostrand/Allocated.h"
#include "Src/Filters/LayerMotion.h"
#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// Stacks the tracks of a segment: each input is a layer, input 0 at the bottom. A layer's motion, opacity and blend
/// mode are read from its own chain and applied while it is drawn, so that they cost no picture of their own. A single
/// layer that fills the frame untouched is handed on as it is.
class CompositorNode final : public FilterNode, public Ostrand::Allocated<CompositorNode> {
public:
    CompositorNode();

    [[nodiscard]] WideString GetName() override { return u"LayerBlendNode"; }
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    [[nodiscard]] std::vector<RenderNodeRef> GetActiveLayers() const;
    /// Makes the output that the bottom layer is drawn into.
    Status CreateOutput(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                        const LayerPlacement& bottom);
    Status DrawTimed(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                     const LayerMotion& motion, const VideoFrameRef& layer);
};

}  // namespace Vantrel
