// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Source/ScaleSource.h"

#include "Kiln/FrameOperations.h"
#include "Kiln/Frames.h"
#include "Src/Nodes/FrameBuffer.h"

namespace Vantrel {

Status ScaleSource::Render(const RenderToken&, const RenderParams& params, const RenderResultsRef&) {
    if (!mFrameSlot || mFrameSlot->GetBounds() == params.outputRect) return Ostrand::kStatus_OK;

    // The slot changes only when all has gone well: a second try starts from the input again.
    const FrameBuffer source = FrameBuffer::Demand(mFrameSlot);
    VideoFrameRef output;
    if (Ostrand::Failed(Kiln::CreateGPUVideoFrame(output, mDevice, source.format, params.outputRect.Width(),
                                                  params.outputRect.Height(), params.pixelAspectRatio,
                                                  Vellum::kFieldType_Progressive, mFrameSlot->GetOrigin()))) {
        return Ostrand::kStatus_OutOfMemory;
    }
    const FrameBuffer target = FrameBuffer::Demand(output);
    const float factorX = static_cast<float>(target.Width()) / static_cast<float>(source.Width());
    const float factorY = static_cast<float>(target.Height()) / static_cast<float>(source.Height());
    const Status status = Kiln::Scale(mDevice, source.data, source.rowBytes, source.Width(), source.Height(),
                                      target.data, target.rowBytes, target.Width(), target.Height(), source.format,
                                      factorX, factorY, Vellum::ToRenderQuality(params.quality));
    if (!Ostrand::Failed(status)) mFrameSlot = output;
    return status;
}

}  // namespace Vantrel
