// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/GarbageMatteNode.h"

#include <cstring>

#include "Src/Kernels/RecordUpload.h"
#include "Vantrel/Effects/GarbageMatte.h"

namespace Vantrel {
namespace {

constexpr const char* kModuleKey = R"(..\..\Src\Filters\Effects\GarbageMatteNode)";
ModuleSymbol gPolyPoints{kModuleKey, "polyPoints", {}};
EffectKernel gBitmask{kModuleKey, "cuda_kernel_bitmask", {}};
EffectKernel gInPlace4{"GarbageMatte", "amdcl_kernel_gm4_inplace", {}};
EffectKernel gInPlace8{"GarbageMatte", "amdcl_kernel_gm8_inplace", {}};
EffectKernel gInPlace16{"GarbageMatte", "amdcl_kernel_gm16_inplace", {}};

void Bitmask(DeviceValue /*frame*/, std::int32_t /*width*/, std::int32_t /*height*/, std::int32_t /*pitch*/,
             std::int32_t /*count*/, Vellum::PixelFormat /*format*/) {}
void InPlace(DeviceValue /*frame*/, std::int32_t /*width*/, DeviceValue /*table*/) {}

constexpr std::uint32_t kPointsBytes = sizeof(PolyTable::points);
static_assert(kPointsBytes == 204 && sizeof(PolyTable) == 208);

EffectKernel& InPlaceKernel(std::int32_t count) {
    return count == 16 ? gInPlace16 : count == 8 ? gInPlace8 : gInPlace4;
}

}  // namespace

std::int32_t GarbageMatteNode::CountCorners() {
    const WideString name = GetName();
    return name == u"TQ.XQVE Garbage Matte 8" ? 8 : name == u"TQ.XQVE Garbage Matte 16" ? 16 : 4;
}

PolyTable GarbageMatteNode::MakeTable(std::int32_t count, std::int64_t time, const KernelFrame& frame) const {
    PolyTable table{};
    for (std::int32_t i = 0; i < count; ++i) {
        double x = 0.0, y = 0.0;
        mDescription->GetPointParam(i, time, x, y);
        table.points[i].x = static_cast<float>(frame.Width() * x);
        table.points[i].y = static_cast<float>(frame.Height() * y);
    }
    for (std::int32_t i = count; i <= MATTE_CORNERS; ++i) table.points[i] = table.points[0];
    for (std::int32_t i = 0; i < count; ++i) {
        const PolyPoint& next = table.points[i + 1];
        table.points[i].slope = (next.x - table.points[i].x) / (next.y - table.points[i].y);
    }
    table.layout = frame.Pitch() * 2 + PackArgument(frame.Format());
    return table;
}

Status GarbageMatteNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                                const RenderResultsRef& /*results*/) {
    const bool isOpenCL = mDevice->GetFramework() == Kiln::DeviceFramework::kOpenCL;
    const std::uint32_t bytes = isOpenCL ? sizeof(PolyTable) : kPointsBytes;
    RecordUpload upload(mDevice, bytes);
    if (!upload.GetBlock()) return Ostrand::kStatus_OutOfMemory;
    const std::int32_t count = CountCorners();
    const KernelFrame frame(mFrameSlot);
    const PolyTable table = MakeTable(count, GetNodeTime(params.clipTime, false), frame);
    std::memcpy(upload.GetBlock(), &table, bytes);
    Status status = upload.Send(gPolyPoints);
    if (Ostrand::Failed(status)) return status;

    const std::uint64_t kernel = (isOpenCL ? InPlaceKernel(count) : gBitmask).Find(mDevice);
    if (kernel == 0) return Ostrand::kStatus_Failure;
    if (isOpenCL) {
        constexpr BlockSize kBlock{256, 1};
        status = Launch2D(mDevice, kernel, {2, frame.Height()}, kBlock, InPlace, frame.Data(), frame.Width(),
                          upload.GetArgument());
    } else {
        constexpr BlockSize kBlock{4, 12};
        constexpr std::int32_t kRun = 32;
        status = Launch2D(mDevice, kernel, GridFor(frame.Width(), frame.Height(), kRun * kBlock.x, kBlock.y), kBlock,
                          Bitmask, frame.Data(), frame.Width(), frame.Height(), frame.Pitch(), count, frame.Format());
    }
    upload.SetMark(mDevice->GetCommands()->CreateMark());
    return status;
}

}  // namespace Vantrel
