// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/InvertNode.h"

#include "Vantrel/Effects/Invert.h"

namespace Vantrel {
namespace {

EffectKernel gInvert{R"(..\..\Src\Filters\Effects\InvertNode)", "InvertKernel", {}};

void InvertKernel(Vellum::PixelFormat /*format*/, DeviceValue /*out*/, std::int32_t /*width*/, std::int32_t /*height*/,
                  std::int32_t /*outPitch*/, DeviceValue /*in*/, std::int32_t /*inPitch*/, std::int32_t /*channels*/,
                  float /*blend*/) {}

}  // namespace

Status InvertNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                          const RenderResultsRef& /*results*/) {
    DemandInputFrame();
    const std::int64_t time = GetNodeTime(params.clipTime, false);
    const std::int32_t channels = mDescription->GetIntParam(kInvert_Channel, time);
    const float blend = mDescription->GetFloatParam(kInvert_Blend, time) / 100.0F;
    if (blend == 1.0F) return Ostrand::kStatus_OK;
    return RenderNewFrame(gInvert, [&](std::uint64_t kernel, const KernelFrame& out, const KernelFrame& in) {
        return Launch2D(mDevice, kernel, in.Grid(), {}, InvertKernel, in.Format(), out.Data(), in.Width(), in.Height(),
                        out.Pitch(), in.Data(), in.Pitch(), channels, blend);
    });
}

}  // namespace Vantrel
