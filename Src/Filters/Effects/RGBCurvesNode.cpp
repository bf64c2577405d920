// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/RGBCurvesNode.h"

#include <cstring>

#include "Src/Effects/CurveReader.h"
#include "Src/Kernels/RecordUpload.h"
#include "Vantrel/Effects/Curves.h"

namespace Vantrel {
namespace {

constexpr const char* kModuleKey = R"(..\..\Src\Filters\Effects\RGBCurvesNode)";
EffectKernel gComposite{kModuleKey, "RGBCurves_CompositeKernel", {}};
EffectKernel gLuma{kModuleKey, "RGBCurves_LumaKernel", {}};
EffectKernel gMask{kModuleKey, "RGBCurves_MaskKernel", {}};

constexpr std::size_t kCurves = 4;
ModuleSymbol gSplines[kCurves] = {{kModuleKey, "inSpline0", {}},
                                  {kModuleKey, "inSpline1", {}},
                                  {kModuleKey, "inSpline2", {}},
                                  {kModuleKey, "inSpline3", {}}};

constexpr CorrectorLayout kLayout{&kRGBCurvesEffect, 136, 141};
constexpr std::int32_t kPoints = 5;
constexpr std::int32_t kParametersOfCurve = 2 * SPLINE_POINTS;

using Tables = std::array<SplineTable, kCurves>;
using Uploads = RecordUpload[kCurves];

Status Send(Uploads& uploads, const Tables& tables) {
    for (const RecordUpload& upload : uploads) {
        if (!upload.GetBlock()) return Ostrand::kStatus_OutOfMemory;
    }
    for (std::size_t i = 0; i < kCurves; ++i) std::memcpy(uploads[i].GetBlock(), &tables[i], sizeof tables[i]);
    for (std::size_t i = 0; i < kCurves; ++i) {
        const Status status = uploads[i].Send(gSplines[i]);
        if (Ostrand::Failed(status)) return status;
    }
    return Ostrand::kStatus_OK;
}

Status LaunchCurves(std::int32_t output, const CorrectorPass& pass, const Uploads& uploads) {
    if (output == kCorrectorOutput_Mask) return pass.Launch(gMask);
    if (output != kCorrectorOutput_Composite && output != kCorrectorOutput_Luma) return Ostrand::kStatus_Failure;
    return pass.Launch(
        output == kCorrectorOutput_Luma ? gLuma : gComposite,
        {uploads[0].GetArgument(), uploads[1].GetArgument(), uploads[2].GetArgument(), uploads[3].GetArgument()});
}

}  // namespace

Status RGBCurvesNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                             const RenderResultsRef& /*results*/) {
    return Correct(params, kLayout, [this](const ParameterReader& read) {
        Tables tables{};
        for (std::size_t i = 0; i < kCurves; ++i) {
            ReadSplineTable(read, kPoints + static_cast<std::int32_t>(i) * kParametersOfCurve, tables[i]);
        }
        return [this, tables](std::int32_t output, const CorrectorPass& pass) {
            constexpr std::uint32_t kBytes = sizeof(SplineTable);
            Uploads uploads = {{mDevice, kBytes}, {mDevice, kBytes}, {mDevice, kBytes}, {mDevice, kBytes}};
            Status status = Send(uploads, tables);
            if (!Ostrand::Failed(status)) status = LaunchCurves(output, pass, uploads);
            if (Ostrand::Failed(status)) return status;
            const Kiln::TimingMarkRef mark = mDevice->GetCommands()->CreateMark();
            for (RecordUpload& upload : uploads) upload.SetMark(mark);
            return status;
        };
    });
}

}  // namespace Vantrel
