// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Nodes/MultipleTimeInputBaseNode.h"

#include "Vellum/Time.h"

namespace Vantrel {

RenderParams MultipleTimeInputBaseNode::MakeParamsForTime(const RenderParams& params,
                                                          const SampleSet::value_type& sample) {
    const auto& [frameTime, fields] = sample;
    RenderParams moved = params;
    moved.clipTime = frameTime;
    moved.time = params.time - params.clipTime + frameTime;
    moved.fieldSelection = Vellum::kFieldSelection_Frame;
    if (fields.size() == 1) {
        Vellum::TickTime aligned(fields.front().time);
        aligned.AlignToFrame(Vellum::FrameRate::Create(params.frameTicks));
        moved.fieldSelection =
            aligned.GetTicks() == fields.front().time ? Vellum::kFieldSelection_First : Vellum::kFieldSelection_Second;
    }
    return moved;
}

template <class Visit>
Status MultipleTimeInputBaseNode::WalkTimes(const RenderParams& params, const Visit& visit) {
    SampleSet times;
    GetInputTimes(params, times, false);
    for (const auto& sample : times) {
        const Status status = visit(MakeParamsForTime(params, sample));
        if (Ostrand::Failed(status)) return status;
    }
    return Ostrand::kStatus_OK;
}

Status MultipleTimeInputBaseNode::WalkPhase(const RenderParams& params, const InputCall& call) {
    return WalkTimes(params, [&](const RenderParams& moved) { return RenderNodeBase::WalkPhase(moved, call); });
}

Status MultipleTimeInputBaseNode::RenderFrame(const RenderToken& token, const RenderParams& params,
                                              const RenderResultsRef& results, VideoFrameRef& frame) {
    return WalkTimes(
        params, [&](const RenderParams& moved) { return RenderNodeBase::RenderFrame(token, moved, results, frame); });
}

Status MultipleTimeInputBaseNode::EndFrame(const RenderToken& token, const RenderParams& params,
                                           const RenderResultsRef& results, std::uint32_t level) {
    return WalkTimes(params,
                     [&](const RenderParams& moved) { return FilterNode::EndFrame(token, moved, results, level); });
}

}  // namespace Vantrel
