// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Transitions/CrossDissolveNode.h"

#include "Kiln/FrameOperations.h"
#include "Src/Filters/ScopedRenderTime.h"
#include "Src/Nodes/FrameBuffer.h"

namespace Vantrel {

Status CrossDissolveNode::Render(const RenderToken& token, const RenderParams& params,
                                 const RenderResultsRef& results) {
    if (!HasBothInputs()) return Ostrand::kStatus_Failure;
    const float elapsed = ElapsedFraction(*this, params);
    const WideString name = GetName();
    const bool black = name == u"XQVE Dip To Black";
    if (black || name == u"XQVE Dip To White") return RenderDip(token, params, results, elapsed, black);

    VideoFrameRef outgoing;
    VideoFrameRef incoming;
    const Status status = RenderSides(token, params, results, outgoing, incoming);
    if (Ostrand::Failed(status)) return status;
    mFrameSlot = outgoing;
    return Mix(incoming, outgoing, elapsed, name == u"XQVE Film Dissolve");
}

Status CrossDissolveNode::RenderDip(const RenderToken& token, const RenderParams& params,
                                    const RenderResultsRef& results, float elapsed, bool black) {
    const bool secondHalf = elapsed > 0.5F;
    const float fraction = 2.0F * (secondHalf ? elapsed - 0.5F : elapsed);
    VideoFrameRef side;
    Status status = RenderSide(secondHalf ? 1 : 0, token, params, results, side);
    if (!Ostrand::Failed(status) && side) status = MakeColorFrame(side, token, params, results, black);
    if (Ostrand::Failed(status)) return status;
    const VideoFrameRef color = mFrameSlot;
    return secondHalf ? Mix(side, color, fraction, false) : Mix(color, side, fraction, false);
}

Status CrossDissolveNode::MakeColorFrame(const VideoFrameRef& like, const RenderToken& token,
                                         const RenderParams& params, const RenderResultsRef& results, bool black) {
    const ScopedRenderTime timer(mDevice, mRenderTime);
    const Status status = MakeFrameLike(like, token, params, results);
    if (Ostrand::Failed(status)) return status;
    const FrameBuffer frame = FrameBuffer::Demand(mFrameSlot);
    const auto fill = black ? &Kiln::FillWithOpaqueBlack : &Kiln::FillWithOpaqueWhite;
    return fill(mDevice, frame.data, frame.rowBytes, frame.format, 0, 0, frame.Width(), frame.Height());
}

Status CrossDissolveNode::Mix(const VideoFrameRef& first, const VideoFrameRef& second, float fraction, bool film) {
    const ScopedRenderTime timer(mDevice, mRenderTime);
    FrameBuffer from;
    FrameBuffer to;
    FrameBuffer target;
    if (!FrameBuffer::Find(first, from) || !FrameBuffer::Find(second, to) || !FrameBuffer::Find(mFrameSlot, target) ||
        !Covers(first, mFrameSlot) || !Covers(second, mFrameSlot)) {
        return Ostrand::kStatus_Failure;
    }
    return Kiln::CrossDissolve(mDevice, from.data, from.rowBytes, to.data, to.rowBytes, target.data, target.rowBytes,
                               target.format, target.Width(), target.Height(), fraction, film);
}

}  // namespace Vantrel
