// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/LumaCorrectorNode.h"

#include "Vantrel/Effects/LumaCorrector.h"

namespace Vantrel {
namespace {

CorrectorKernels gKernels(R"(..\..\Src\Filters\Effects\LumaCorrectorNode)",
                          {"LumaCorrector_CompositeKernel", "LumaCorrector_LumaKernel",
                           "LumaCorrector_TonalRangeKernel", "LumaCorrector_MaskKernel"});

constexpr CorrectorLayout kLayout{&kLumaCorrectorEffect, 39, 44};

}  // namespace

Status LumaCorrectorNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                                 const RenderResultsRef& /*results*/) {
    return Correct(params, kLayout, [](const ParameterReader& read) {
        std::array<float, 28> values{};
        read.Numbers(6, values, 0, 4);
        read.Numbers(13, values, 4, 24);
        return [values](std::int32_t output, const CorrectorPass& pass) {
            return gKernels.Launch(output, pass, values, values);
        };
    });
}

}  // namespace Vantrel
