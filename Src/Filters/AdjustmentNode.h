// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/LayerMotion.h"
#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// A layer whose effects apply to all that lies below it. Input 0 is the picture below, input 1 that picture after the
/// layer's effects, input 2 the layer's matte, if it has one; without one the layer covers the whole frame.
///
/// The processed picture takes the place of the one below as far as the matte covers it, so that nothing of that
/// remains under full coverage, and so that a picture with transparent parts keeps them. With k = the matte's alpha
/// times the layer's opacity, taken between 0 and 1, b and s the pictures below and processed, and B the layer's blend
/// mode (Docs/blend-modes.md):
///
///     a = (1 - k) ab + k as,   c = ((1 - k) ab b + k as ((1 - ab) s + ab B(b, s))) / a
///
/// The layer's motion moves the matte only: the processed picture's pixels stay where those below are.
class AdjustmentNode final : public FilterNode, public Ostrand::Allocated<AdjustmentNode> {
public:
    AdjustmentNode();

    [[nodiscard]] WideString GetName() override { return u"AdjustmentNode"; }
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    /// The layer's own pictures. The copy of the one below is in the frame slot.
    struct Layer {
        LayerMotion motion;
        VideoFrameRef processed;
        VideoFrameRef matte;
    };

    Status RenderInputs(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                        Layer& layer);
    Status CopyBelow(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                     const VideoFrameRef& below);
    Status MakeWholeMatte(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                          VideoFrameRef& matte);
    /// The frame at its place in the output; with a second try after a purge. Empty on failure.
    [[nodiscard]] VideoFrameRef Place(const RenderToken& token, const RenderParams& params,
                                      const RenderResultsRef& results, const LayerMotion& motion,
                                      const VideoFrameRef& frame);
    [[nodiscard]] Status Blend(const Layer& layer) const;
};

}  // namespace Vantrel
