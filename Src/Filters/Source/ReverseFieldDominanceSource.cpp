// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Source/ReverseFieldDominanceSource.h"

namespace Vantrel {

void ReverseFieldDominanceSource::TransformParams(RenderParams& out, const RenderParams& params) {
    out = params;
    out.time = AlignToFrame(params.time, params.frameTicks);
    out.clipTime = AlignToFrame(params.clipTime, params.frameTicks);
    if (params.fieldSelection == Vellum::kFieldSelection_Second) {
        out.fieldSelection = Vellum::kFieldSelection_First;
    } else if (params.fieldSelection == Vellum::kFieldSelection_First) {
        const std::int64_t fieldTicks = Vellum::FrameRate::Create(params.frameTicks).Faster(2).GetTicksPerFrame();
        out.fieldSelection = Vellum::kFieldSelection_Second;
        out.time += fieldTicks;
        out.clipTime += fieldTicks;
    }
}

}  // namespace Vantrel
