// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Source/ScaleSource.h"

#include "Kiln/FrameOperations.h"
#include "Kiln/Frames.h"
#include "Src/Nodes/FrameBuffer.h"

namespace Vantrel {

Status ScaleSource::Render(const RenderToken&, const RenderParams& params, const RenderResultsRef&) {
    if (!mFrameSlot || mFrameSlot->GetBounds() == params.outputRect) return Ostrand::kStatus_OK;

    const VideoFrameRef input = mFrameSlot;
    const FrameBuffer source = FrameBuffer::Demand(input);
    if (Ostrand::Failed(Kiln::CreateGPUVideoFrame(mFrameSlot, mDevice, source.format, params.outputRect.Width(),
                                                  params.outputRect.Height(), params.pixelAspectRatio,
                                                  Vellum::kFieldType_Progressive, input->GetOrigin()))) {
        // The slot must hold the input again for a second try.
        mFrameSlot = input;
        return Ostrand::kStatus_OutOfMemory;
    }
    const FrameBuffer target = FrameBuffer::Demand(mFrameSlot);
    const float factorX = static_cast<float>(target.Width()) / static_cast<float>(source.Width());
    const float factorY = static_cast<float>(target.Height()) / static_cast<float>(source.Height());
    return Kiln::Scale(mDevice, source.data, source.rowBytes, source.Width(), source.Height(), target.data,
                       target.rowBytes, target.Width(), target.Height(), source.format, factorX, factorY,
                       Vellum::ToRenderQuality(params.quality));
}

}  // namespace Vantrel
