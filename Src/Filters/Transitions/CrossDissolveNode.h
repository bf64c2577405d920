// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/Transitions/TransitionBaseNode.h"

namespace Vantrel {

/// Four transitions that mix by the share that has elapsed, told apart by their match name.
///
/// - "XQVE Cross Dissolve" mixes display values, "XQVE Film Dissolve" the light that they stand for; the formulas are
///   those of Kiln::CrossDissolve. The mix is written over the outgoing clip's frame.
/// - "XQVE Dip To Black" and "XQVE Dip To White" dissolve to the opaque colour until the middle and from there to the
///   incoming clip; each half renders one clip only. Exactly in the middle the picture is the colour.
class CrossDissolveNode final : public TransitionBaseNode, public Ostrand::Allocated<CrossDissolveNode> {
public:
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    Status RenderDip(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                     float elapsed, bool black);
    /// Puts a frame of one colour into the frame slot.
    Status MakeColorFrame(const VideoFrameRef& like, const RenderToken& token, const RenderParams& params,
                          const RenderResultsRef& results, bool black);
    /// Mixes into the frame slot: `first` at fraction 1, `second` at 0.
    Status Mix(const VideoFrameRef& first, const VideoFrameRef& second, float fraction, bool film);
};

}  // namespace Vantrel
