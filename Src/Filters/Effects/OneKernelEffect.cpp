// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/OneKernelEffect.h"

#include "Kiln/Frames.h"

namespace Vantrel {

Status OneKernelEffect::MakeFrameLike(const VideoFrameRef& input) {
    const Vellum::Rect bounds = input->GetBounds();
    return Kiln::CreateGPUVideoFrame(mFrameSlot, mDevice, input->GetPixelFormat(), bounds.Width(), bounds.Height(),
                                     input->GetPixelAspectRatio(), Vellum::kFieldType_Progressive, input->GetOrigin());
}

}  // namespace Vantrel
