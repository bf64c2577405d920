// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/LumaCurveNode.h"

#include "Src/Effects/CurveReader.h"
#include "Src/Kernels/RecordUpload.h"
#include "Vantrel/Effects/Curves.h"

namespace Vantrel {
namespace {

constexpr const char* kModuleKey = R"(..\..\Src\Filters\Effects\LumaCurveNode)";
EffectKernel gComposite{kModuleKey, "LumaCurve_CompositeKernel", {}};
EffectKernel gLuma{kModuleKey, "LumaCurve_LumaKernel", {}};
EffectKernel gMask{kModuleKey, "LumaCurve_MaskKernel", {}};
ModuleSymbol gSpline{kModuleKey, "inSpline", {}};

constexpr CorrectorLayout kLayout{&kLumaCurveEffect, 40, 45};
constexpr std::int32_t kPoints = 5;

Status LaunchCurve(EffectKernel& kernel, const CorrectorPass& pass, const Kiln::DeviceRef& device,
                   RecordUpload& spline) {
    const Status status = pass.Launch(kernel, {spline.GetArgument()});
    if (!Ostrand::Failed(status)) spline.SetMark(device->GetCommands()->CreateMark());
    return status;
}

}  // namespace

Status LumaCurveNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                             const RenderResultsRef& /*results*/) {
    if (!mFrameSlot) throw Ostrand::NullInterfaceException();
    RecordUpload spline(mDevice, sizeof(SplineTable));
    if (!spline.GetBlock()) return Ostrand::kStatus_OutOfMemory;
    return Correct(params, kLayout, [&](const ParameterReader& read) {
        ReadSplineTable(read, kPoints, *static_cast<SplineTable*>(spline.GetBlock()));
        return [&](std::int32_t output, const CorrectorPass& pass) {
            if (output == kCorrectorOutput_Mask) return pass.Launch(gMask);
            const Status status = spline.Send(gSpline);
            if (Ostrand::Failed(status)) return status;
            if (output == kCorrectorOutput_Composite) return LaunchCurve(gComposite, pass, mDevice, spline);
            if (output == kCorrectorOutput_Luma) return LaunchCurve(gLuma, pass, mDevice, spline);
            return Ostrand::kStatus_Failure;
        };
    });
}

}  // namespace Vantrel
