// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Nodes/SelectInputBaseNode.h"

namespace Vantrel {

SelectInputBaseNode::Choice SelectInputBaseNode::Choose(const RenderParams& params) {
    Choice choice{params, {}};
    SelectInput(choice.params, params, choice.input);
    return choice;
}

Status SelectInputBaseNode::WalkPhase(const RenderParams& params, const InputCall& call) {
    const Choice choice = Choose(params);
    return call(*choice.input, choice.params);
}

Status SelectInputBaseNode::CancelHostFrames(const RenderParams& params, const RenderResultsRef& results) {
    const Choice choice = Choose(params);
    return choice.input->CancelHostFrames(choice.params, results);
}

Status SelectInputBaseNode::RenderFrame(const RenderToken& token, const RenderParams& params,
                                        const RenderResultsRef& results, VideoFrameRef& frame) {
    mEnded = {};
    return FilterNode::RenderFrame(token, params, results, frame);
}

Status SelectInputBaseNode::EndFrame(const RenderToken& token, const RenderParams& params,
                                     const RenderResultsRef& results, std::uint32_t level) {
    const bool isEnded = mEnded.results == results.get() && mEnded.time == params.time &&
                         mEnded.clipTime == params.clipTime && mEnded.fieldSelection == params.fieldSelection &&
                         mEnded.level == level;
    if (isEnded && results) return Ostrand::kStatus_OK;
    mEnded = {results.get(), params.time, params.clipTime, params.fieldSelection, level};
    const Choice choice = Choose(params);
    FilterNode::EndFrame(token, choice.params, results, level);
    // A second end of input 0, when that is the choice, finds nothing left to do.
    if (choice.input) choice.input->EndFrame(token, choice.params, results, level);
    return Ostrand::kStatus_OK;
}

Status SelectInputBaseNode::Render(const RenderToken& token, const RenderParams& params,
                                   const RenderResultsRef& results) {
    const Choice choice = Choose(params);
    if (!choice.input) return Ostrand::kStatus_OK;
    const Status status = TryWithPurge(token, choice.params, results, [&] {
        return choice.input->RenderFrame(token, choice.params, results, mFrameSlot);
    });
    if (Ostrand::Failed(status)) mFrameSlot.Reset();
    return status;
}

}  // namespace Vantrel
