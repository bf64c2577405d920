// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/RGBColorCorrectorNode.h"

#include "Vantrel/Effects/RGBColorCorrector.h"

namespace Vantrel {
namespace {

CorrectorKernels gKernels(R"(..\..\Src\Filters\Effects\RGBColorCorrectorNode)",
                          {"RGBColorCorrector_CompositeKernel", "RGBColorCorrector_LumaKernel",
                           "RGBColorCorrector_TonalRangeKernel", "RGBColorCorrector_MaskKernel"});

constexpr CorrectorLayout kLayout{&kRGBColorCorrectorEffect, 65, 70};

}  // namespace

Status RGBColorCorrectorNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                                     const RenderResultsRef& /*results*/) {
    return Correct(params, kLayout, [](const ParameterReader& read) {
        std::array<float, 52> values{};
        read.Numbers(6, values, 0, 4);
        // A tonal range's triple for all channels, then those of red, green and blue.
        for (std::int32_t set = 0; set < 4; ++set) {
            const std::size_t at = 4 + 12 * static_cast<std::size_t>(set);
            read.Numbers(13 + set * 3, values, at, 3);
            read.Numbers(26 + set * 9, values, at + 3, 9);
        }
        return [values](std::int32_t output, const CorrectorPass& pass) {
            return gKernels.Launch(output, pass, values, values);
        };
    });
}

}  // namespace Vantrel
