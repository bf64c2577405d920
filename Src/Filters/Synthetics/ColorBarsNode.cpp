// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Synthetics/ColorBarsNode.h"

#include "Kiln/Frames.h"
#include "Kiln/Scratch.h"
#include "Ostrand/MixHash.h"
#include "Src/Filters/Effects/OneKernelEffect.h"
#include "Src/Filters/Synthetics/ColorBarsPattern.h"
#include "Src/Nodes/WorkingFormat.h"

namespace Vantrel {
namespace {

constexpr const char* kModuleKey = R"(..\..\Src\Filters\Synthetics\ColorBarsNode)";
EffectKernel gCudaBars{kModuleKey, "ColorBarsKernelCuda", {}};
EffectKernel gOpenCLBars{kModuleKey, "ColorBarsKernelOpenCL", {}};

void CudaBars(DeviceValue /*out*/, std::int32_t /*pitch*/, Vellum::PixelFormat /*format*/, std::int32_t /*width*/,
              std::int32_t /*height*/) {}
void OpenCLBars(DeviceValue /*out*/, std::int32_t /*pitch*/, Vellum::PixelFormat /*format*/, std::int32_t /*width*/,
                std::int32_t /*height*/, DeviceValue /*pattern*/) {}

constexpr float kPattern[BARS_SIZE] = BARS_PATTERN;
static_assert(sizeof kPattern == 396);

Status DrawWithTable(const Kiln::DeviceRef& device, const KernelFrame& frame) {
    const Kiln::DeviceScratchBuffer pattern(device, sizeof kPattern);
    if (pattern.GetHandle() == 0) return Ostrand::kStatus_OutOfMemory;
    static_cast<void>(device->GetCommands()->CopyHostToDevice(kPattern, pattern.GetHandle(), sizeof kPattern, nullptr));
    const std::uint64_t kernel = gOpenCLBars.Find(device);
    if (kernel == 0) return Ostrand::kStatus_Failure;
    return Launch2D(device, kernel, frame.Grid(), {}, OpenCLBars, frame.Data(), frame.Pitch(), frame.Format(),
                    frame.Width(), frame.Height(), pattern.GetHandle());
}

}  // namespace

Guid ColorBarsNode::GetFrameHash(const RenderParams& params, const RenderResultsRef& /*results*/) {
    return Ostrand::NodeHasher()
        .Text("ColorBarsNode")
        .Value(params.quality)
        .Value(params.outputRect)
        .Value(params.pixelAspectRatio)
        .Finish();
}

Status ColorBarsNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                             const RenderResultsRef& /*results*/) {
    const Status made = Kiln::CreateGPUVideoFrame(mFrameSlot, mDevice, GetWorkingPixelFormat(params, *mDevice),
                                                  params.outputRect.Width(), params.outputRect.Height(),
                                                  params.pixelAspectRatio, Vellum::kFieldType_Progressive, {0, 0});
    if (Ostrand::Failed(made) || !mFrameSlot) return Ostrand::kStatus_OutOfMemory;
    const KernelFrame frame(mFrameSlot);
    if (mDevice->GetFramework() == Kiln::DeviceFramework::kOpenCL) return DrawWithTable(mDevice, frame);
    const std::uint64_t kernel = gCudaBars.Find(mDevice);
    if (kernel == 0) return Ostrand::kStatus_Failure;
    return Launch2D(mDevice, kernel, frame.Grid(), {}, CudaBars, frame.Data(), frame.Pitch(), frame.Format(),
                    frame.Width(), frame.Height());
}

}  // namespace Vantrel
