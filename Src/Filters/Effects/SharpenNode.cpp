// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/SharpenNode.h"

#include "Src/Kernels/TextureTable.h"
#include "Vantrel/Effects/Sharpen.h"

namespace Vantrel {
namespace {

constexpr const char* kModuleKey = R"(..\..\Src\Filters\Effects\SharpenNode)";
EffectKernel gKernel{kModuleKey, "SharpenKernel", {}};
TextureTable gSourceTexture;

void SharpenKernel(DeviceValue /*texture*/, DeviceValue /*out*/, std::int32_t /*outPitch*/,
                   Vellum::PixelFormat /*format*/, std::int32_t /*width*/, std::int32_t /*height*/, float /*centre*/,
                   float /*neighbour*/) {}

}  // namespace

Status SharpenNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                           const RenderResultsRef& /*results*/) {
    DemandInputFrame();
    const std::int64_t time = GetNodeTime(params.clipTime, false);
    const float centre = static_cast<float>(mDescription->GetIntParam(kSharpen_Amount, time)) * 0.0625F + 1.0F;
    if (centre == 1.0F) return Ostrand::kStatus_OK;
    const float neighbour = (1.0F - centre) * 0.25F;
    return RenderNewFrame([&](const KernelFrame& out, const KernelFrame& in) {
        Kiln::Texture& texture = GetTexture(gSourceTexture, mDevice, kModuleKey, "inSrcTexture",
                                            Kiln::TextureAddress::kClamp, Kiln::TextureFilter::kPoint, in.Format());
        const Kiln::ScopedTextureBinding binding(mDevice, texture);
        const Status bound = Kiln::BindTexture(mDevice, texture, in.Data(), in.Data(), in.RowBytes(), in.Width(),
                                               in.Height(), in.Format());
        if (Ostrand::Failed(bound)) return bound;
        const std::uint64_t kernel = gKernel.Find(mDevice);
        if (kernel == 0) return Status{Ostrand::kStatus_Failure};
        return Launch2D(mDevice, kernel, out.Grid(), {}, SharpenKernel, texture.argument, out.Data(), out.Pitch(),
                        in.Format(), out.Width(), out.Height(), centre, neighbour);
    });
}

}  // namespace Vantrel
