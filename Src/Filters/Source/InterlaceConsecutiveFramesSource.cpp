// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Source/InterlaceConsecutiveFramesSource.h"

namespace Vantrel {

Vellum::FrameRate InterlaceConsecutiveFramesSource::GetFrameRate() { return SourceBaseNode::GetFrameRate().Faster(2); }

Vellum::FrameRate InterlaceConsecutiveFramesSource::GetFieldRate() { return SourceBaseNode::GetFieldRate().Faster(2); }

void InterlaceConsecutiveFramesSource::TransformParams(RenderParams& out, const RenderParams& params) {
    out = params;
    out.time = params.time * 2;
    out.clipTime = params.clipTime * 2;
    if (params.fieldSelection != Vellum::kFieldSelection_Frame) {
        out.fieldSelection = FrameParity(out.clipTime, Vellum::HalfFrameTicks(params.frameTicks));
    }
}

}  // namespace Vantrel
