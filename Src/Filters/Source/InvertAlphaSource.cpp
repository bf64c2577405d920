// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Source/InvertAlphaSource.h"

#include "Kiln/Frames.h"
#include "Src/Filters/Effects/OneKernelEffect.h"

namespace Vantrel {
namespace {

EffectKernel gInvertAlpha{R"(..\..\Src\Filters\Source\InvertAlphaSource)", "InvertAlphaKernel", {}};

void InvertAlphaKernel(DeviceValue /*frame*/, std::int32_t /*pitch*/, Vellum::PixelFormat /*format*/,
                       std::int32_t /*width*/, std::int32_t /*height*/) {}

}  // namespace

Status InvertAlphaSource::Render(const RenderToken&, const RenderParams&, const RenderResultsRef&) {
    if (mDescription && mDescription->IsStill()) {
        // The device's cache holds a still's frame, which must stay as it came.
        const VideoFrameRef own = Kiln::CreateSimilarFrame(mFrameSlot);
        if (!own) return Ostrand::kStatus_OutOfMemory;
        const Status status = Kiln::CopyFrame(mFrameSlot, own, Vellum::RenderQuality::kDraft);
        if (Ostrand::Failed(status)) return status;
        mFrameSlot = own;
    }
    const KernelFrame frame(mFrameSlot);
    const std::uint64_t kernel = gInvertAlpha.Find(mDevice);
    if (kernel == 0) return Ostrand::kStatus_Failure;
    return Launch2D(mDevice, kernel, frame.Grid(), {}, InvertAlphaKernel, frame.Data(), frame.Pitch(), frame.Format(),
                    frame.Width(), frame.Height());
}

}  // namespace Vantrel
