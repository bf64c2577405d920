// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/OneKernelEffect.h"

#include "Kiln/Frames.h"

namespace Vantrel {

Status MakeFrameLike(const Kiln::DeviceRef& device, const VideoFrameRef& input, VideoFrameRef& frame) {
    if (!input) throw Ostrand::NullInterfaceException();
    const Vellum::Rect bounds = input->GetBounds();
    return Kiln::CreateGPUVideoFrame(frame, device, input->GetPixelFormat(), bounds.Width(), bounds.Height(),
                                     input->GetPixelAspectRatio(), Vellum::kFieldType_Progressive, input->GetOrigin());
}

}  // namespace Vantrel
