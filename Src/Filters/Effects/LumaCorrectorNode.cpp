// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/LumaCorrectorNode.h"

#include "Vantrel/Effects/LumaCorrector.h"

namespace Vantrel {
namespace {

constexpr const char* kModuleKey = "..\\..\\Src\\Filters\\Effects\\LumaCorrectorNode";
EffectKernel gComposite{kModuleKey, "LumaCorrector_CompositeKernel", {}};
EffectKernel gLuma{kModuleKey, "LumaCorrector_LumaKernel", {}};
EffectKernel gTonalRange{kModuleKey, "LumaCorrector_TonalRangeKernel", {}};
EffectKernel gMask{kModuleKey, "LumaCorrector_MaskKernel", {}};

constexpr CorrectorLayout kLayout{&kLumaCorrectorEffect, 39, 44};

}  // namespace

Status LumaCorrectorNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                                 const RenderResultsRef& /*results*/) {
    return Correct(params, kLayout, [](const ParameterReader& read) {
        std::array<float, 4> range{};
        std::array<float, 28> values{};
        read.Numbers(6, range, 0, 4);
        read.Numbers(6, values, 0, 4);
        read.Numbers(13, values, 4, 24);
        return [range, values](std::int32_t output, const CorrectorPass& pass) {
            switch (output) {
                case kCorrectorOutput_Composite:
                    return pass.Launch(gComposite, values);
                case kCorrectorOutput_Luma:
                    return pass.Launch(gLuma, values);
                case kCorrectorOutput_TonalRange:
                    return pass.Launch(gTonalRange, range);
                case kCorrectorOutput_Mask:
                    return pass.Launch(gMask);
                default:
                    return Ostrand::kStatus_Failure;
            }
        };
    });
}

}  // namespace Vantrel
