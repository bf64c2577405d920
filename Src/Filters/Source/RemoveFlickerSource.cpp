// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Source/RemoveFlickerSource.h"

#include "Kiln/Frames.h"
#include "Src/Filters/Effects/OneKernelEffect.h"
#include "Src/Kernels/TextureTable.h"
#include "Src/Nodes/FrameBuffer.h"

namespace Vantrel {
namespace {

constexpr const char* kModule = R"(..\..\Src\Filters\Source\RemoveFlickerSource)";

EffectKernel gRemoveFlicker{kModule, "RemoveFlickerKernel", {}};
TextureTable gSourceTexture;

void RemoveFlickerKernel(DeviceValue /*texture*/, DeviceValue /*out*/, std::int32_t /*outPitch*/,
                         Vellum::PixelFormat /*format*/, std::int32_t /*width*/, std::int32_t /*height*/) {}

}  // namespace

void RemoveFlickerSource::TransformParams(RenderParams& out, const RenderParams& params) {
    out = params;
    out.fieldSelection = Vellum::kFieldSelection_Frame;
}

Status RemoveFlickerSource::Render(const RenderToken&, const RenderParams&, const RenderResultsRef&) {
    // The slot changes only when all has gone well: a second try starts from the input again.
    const FrameBuffer source = FrameBuffer::Demand(mFrameSlot);
    const VideoFrameRef output = Kiln::CreateSimilarFrame(mFrameSlot);
    if (!output) return Ostrand::kStatus_OutOfMemory;

    Kiln::Texture& texture = GetTexture(gSourceTexture, mDevice, kModule, "inSrcTexture", Kiln::TextureAddress::kClamp,
                                        Kiln::TextureFilter::kPoint, source.format);
    const Kiln::ScopedTextureBinding binding(mDevice, texture);
    const Status bound = Kiln::BindTexture(mDevice, texture, source.data, source.data, source.rowBytes, source.Width(),
                                           source.Height(), source.format);
    if (Ostrand::Failed(bound)) return bound;
    const std::uint64_t kernel = gRemoveFlicker.Find(mDevice);
    if (kernel == 0) return Ostrand::kStatus_Failure;
    const KernelFrame target(output);
    const Status status = Launch2D(mDevice, kernel, target.Grid(), {}, RemoveFlickerKernel, texture.argument,
                                   target.Data(), target.Pitch(), target.Format(), target.Width(), target.Height());
    if (!Ostrand::Failed(status)) mFrameSlot = output;
    return status;
}

}  // namespace Vantrel
