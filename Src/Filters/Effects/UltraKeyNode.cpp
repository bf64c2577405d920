// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/UltraKeyNode.h"

#include <cstring>

#include "Kiln/Scratch.h"
#include "Src/Kernels/RecordUpload.h"
#include "Vantrel/Effects/UltraKey.h"

namespace Vantrel {
namespace {

constexpr const char* kModuleKey = R"(..\..\Src\Filters\Effects\UltraKeyNode)";
ModuleSymbol gRecord{kModuleKey, "inParams", {}};
EffectKernel gComposite{kModuleKey, "cuda_kernel_composite", {}};
EffectKernel gChokeX{kModuleKey, "cuda_kernel_chokefilter_x", {}};
EffectKernel gChokeY{kModuleKey, "cuda_kernel_chokefilter_y", {}};
EffectKernel gBoxX{kModuleKey, "cuda_kernel_boxfilter_x", {}};
EffectKernel gBoxY{kModuleKey, "cuda_kernel_boxfilter_y", {}};
EffectKernel gShowAlpha{kModuleKey, "cuda_kernel_showAlpha", {}};

void Composite(DeviceValue /*in*/, DeviceValue /*out*/, std::int32_t /*width*/, std::int32_t /*height*/,
               std::int32_t /*inPitch*/, std::int32_t /*outPitch*/, std::int32_t /*finish*/,
               Vellum::PixelFormat /*format*/, DeviceValue /*record*/) {}
void FilterX(DeviceValue /*frame*/, DeviceValue /*scratch*/, std::int32_t /*pitch*/, std::int32_t /*scratchPitch*/,
             std::int32_t /*width*/, std::int32_t /*height*/, std::int32_t /*reach*/, Vellum::PixelFormat /*format*/) {}
void FilterY(DeviceValue /*scratch*/, DeviceValue /*frame*/, std::int32_t /*scratchPitch*/, std::int32_t /*pitch*/,
             std::int32_t /*width*/, std::int32_t /*height*/, std::int32_t /*reach*/, float /*fraction*/,
             std::int32_t /*finish*/, Vellum::PixelFormat /*format*/, DeviceValue /*record*/) {}
void ShowAlpha(DeviceValue /*in*/, DeviceValue /*out*/, std::int32_t /*width*/, std::int32_t /*height*/,
               std::int32_t /*inPitch*/, std::int32_t /*outPitch*/, Vellum::PixelFormat /*format*/) {}

template <class... Parameters>
Status Launch(const Kiln::DeviceRef& device, EffectKernel& kernel, GridSize grid, BlockSize block,
              void (&signature)(Parameters...), typename KernelParameter<Parameters>::Type... values) {
    const std::uint64_t handle = kernel.Find(device);
    if (handle == 0) return Ostrand::kStatus_Failure;
    return Launch2D(device, handle, grid, block, signature, values...);
}

Status RunStage(const Kiln::DeviceRef& device, EffectKernel& kernelX, EffectKernel& kernelY, const MatteStage& stage,
                const KernelFrame& frame, DeviceValue scratch, bool finishes, DeviceValue record) {
    constexpr BlockSize kBlockX{256, 1}, kBlockY{16, 8};
    const std::int32_t width = frame.Width(), height = frame.Height();
    const Status status =
        Launch(device, kernelX, GridFor(width, height, kBlockX.x, kBlockX.y), kBlockX, FilterX, frame.Data(), scratch,
               frame.Pitch(), width, width, height, stage.reachX, frame.Format());
    if (Ostrand::Failed(status)) return status;
    return Launch(device, kernelY, GridFor(width, height, kBlockY.x, kBlockY.y), kBlockY, FilterY, scratch,
                  frame.Data(), width, frame.Pitch(), width, height, stage.reachY, stage.fractionY, finishes ? 1 : 0,
                  frame.Format(), record);
}

}  // namespace

Status UltraKeyNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                            const RenderResultsRef& /*results*/) {
    DemandInputFrame();
    return RenderNewFrame([&](const KernelFrame& out, const KernelFrame& in) { return RunPipeline(params, out, in); });
}

Status UltraKeyNode::RunPipeline(const RenderParams& params, const KernelFrame& out, const KernelFrame& in) const {
    RecordUpload upload(mDevice, sizeof(UltraKeyParams));
    if (!upload.GetBlock()) return Ostrand::kStatus_OutOfMemory;
    const ParameterReader read(*mDescription, kUltraKeyEffect, GetNodeTime(params.clipTime, false));
    const UltraKeySetup setup = UltraKeySetup::Read(read, params);
    std::memcpy(upload.GetBlock(), &setup.record, sizeof setup.record);
    Status status = upload.Send(gRecord);
    if (Ostrand::Failed(status)) return status;

    const bool hasStages = setup.choke.runs || setup.soften.runs;
    status = Launch(mDevice, gComposite, in.Grid(), {}, Composite, in.Data(), out.Data(), in.Width(), in.Height(),
                    in.Pitch(), out.Pitch(), setup.finishes && !hasStages ? 1 : 0, in.Format(), upload.GetArgument());
    if (Ostrand::Failed(status)) return status;
    upload.SetMark(mDevice->GetCommands()->CreateMark());
    if (hasStages) status = RunStages(setup, out, upload.GetArgument());
    if (Ostrand::Failed(status) || setup.output != kUltraKeyOutput_Alpha) return status;
    return Launch(mDevice, gShowAlpha, out.Grid(), {}, ShowAlpha, out.Data(), out.Data(), out.Width(), out.Height(),
                  out.Pitch(), out.Pitch(), out.Format());
}

Status UltraKeyNode::RunStages(const UltraKeySetup& setup, const KernelFrame& frame, DeviceValue record) const {
    constexpr std::uint64_t kBytesPerPixel = 8;
    const Kiln::DeviceScratchBuffer scratch(mDevice, static_cast<std::uint64_t>(frame.Width()) *
                                                         static_cast<std::uint64_t>(frame.Height()) * kBytesPerPixel);
    const DeviceValue buffer = scratch.GetHandle();
    if (buffer == 0) return Ostrand::kStatus_OutOfMemory;
    if (setup.choke.runs) {
        const bool finishes = setup.finishes && !setup.soften.runs;
        const Status status = RunStage(mDevice, gChokeX, gChokeY, setup.choke, frame, buffer, finishes, record);
        if (Ostrand::Failed(status)) return status;
    }
    if (!setup.soften.runs) return Ostrand::kStatus_OK;
    return RunStage(mDevice, gBoxX, gBoxY, setup.soften, frame, buffer, setup.finishes, record);
}

}  // namespace Vantrel
