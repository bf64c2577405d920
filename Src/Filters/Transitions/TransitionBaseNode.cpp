// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Transitions/TransitionBaseNode.h"

#include "Kiln/Frames.h"
#include "Ostrand/QueryTable.h"
#include "Src/VideoNodes/VideoNode.h"

namespace Vantrel {

Status TransitionBaseNode::QueryInterface(const Guid& iid, void** out) {
    return Ostrand::QueryTable(this, iid, out).Answer<TransitionBaseNode>().Otherwise<FilterNode>();
}

Status TransitionBaseNode::RenderSide(std::size_t index, const RenderToken& token, const RenderParams& params,
                                      const RenderResultsRef& results, VideoFrameRef& frame) {
    const RenderNodeRef input = GetInput(index);
    if (!input) return Ostrand::kStatus_OK;
    const Status status =
        TryWithPurge(token, params, results, [&] { return input->RenderFrame(token, params, results, frame); });
    if (Ostrand::Failed(status)) mFrameSlot.Reset();
    return status;
}

Status TransitionBaseNode::RenderSides(const RenderToken& token, const RenderParams& params,
                                       const RenderResultsRef& results, VideoFrameRef& outgoing,
                                       VideoFrameRef& incoming) {
    if (const RenderNodeRef input = GetInput(0)) {
        const Status status = RenderInput(input, token, params, results, outgoing);
        if (Ostrand::Failed(status)) {
            mFrameSlot.Reset();
            return status;
        }
    }
    return RenderSide(1, token, params, results, incoming);
}

Status TransitionBaseNode::MakeFrameLike(const VideoFrameRef& frame, const RenderToken& token,
                                         const RenderParams& params, const RenderResultsRef& results) {
    const Vellum::Rect bounds = frame->GetBounds();
    const auto create = [&] {
        return Kiln::CreateGPUVideoFrame(mFrameSlot, mDevice, frame->GetPixelFormat(), bounds.Width(), bounds.Height(),
                                         frame->GetPixelAspectRatio(), Vellum::kFieldType_Progressive, {0, 0});
    };
    if (!Ostrand::Failed(create())) return Ostrand::kStatus_OK;
    Purge(token, params, results);
    if (!Ostrand::Failed(create())) return Ostrand::kStatus_OK;
    mFrameSlot.Reset();
    return Ostrand::kStatus_OutOfMemory;
}

float ElapsedFraction(const RenderNodeBase& node, const RenderParams& params) {
    std::int64_t duration = 0;
    if (const VideoNodeRef& description = node.GetDescription()) {
        static_cast<void>(description->GetInt64Property("TransitionNode::TransitionDuration", duration));
    }
    if (duration == 0) return 0.0F;
    return static_cast<float>(node.GetNodeTime(params.clipTime, false)) / static_cast<float>(duration);
}

bool Covers(const VideoFrameRef& source, const VideoFrameRef& target) {
    const Vellum::Rect from = source->GetBounds();
    const Vellum::Rect to = target->GetBounds();
    return from.Width() >= to.Width() && from.Height() >= to.Height() &&
           Vellum::BytesPerPixel(source->GetPixelFormat()) == Vellum::BytesPerPixel(target->GetPixelFormat());
}

}  // namespace Vantrel
