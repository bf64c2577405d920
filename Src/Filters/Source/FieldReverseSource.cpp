// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Source/FieldReverseSource.h"

#include "Kiln/FrameOperations.h"
#include "Kiln/Frames.h"
#include "Src/Nodes/FrameBuffer.h"

namespace Vantrel {

Status FieldReverseSource::Render(const RenderToken&, const RenderParams&, const RenderResultsRef&) {
    // The slot changes only when all has gone well: a second try starts from the input again.
    const FrameBuffer source = FrameBuffer::Demand(mFrameSlot);
    const VideoFrameRef output = Kiln::CreateSimilarFrame(mFrameSlot);
    if (!output) return Ostrand::kStatus_OutOfMemory;
    const FrameBuffer target = FrameBuffer::Demand(output);
    const Status status = Kiln::FieldReverse(mDevice, source.data, source.rowBytes, target.data, target.rowBytes,
                                             source.format, source.Width(), source.Height());
    if (!Ostrand::Failed(status)) mFrameSlot = output;
    return status;
}

}  // namespace Vantrel
