// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/LevelsNode.h"

#include "Src/Filters/Effects/ParameterReader.h"
#include "Vantrel/Effects/Levels.h"

namespace Vantrel {
namespace {

EffectKernel gLevels{R"(..\..\Src\Filters\Effects\LevelsNode)", "Levels", {}};

constexpr std::size_t kValues = 20;
constexpr std::int32_t kValuesOfGroup = 5;

}  // namespace

Status LevelsNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                          const RenderResultsRef& /*results*/) {
    DemandInputFrame();
    const ParameterReader read(*mDescription, kLevelsEffect, GetNodeTime(params.clipTime, false));
    std::array<float, kValues> values{};
    for (std::int32_t i = 0; i < static_cast<std::int32_t>(kValues); ++i) {
        const float value = read.Number(i);
        // A gamma goes as the power that it stands for.
        values[static_cast<std::size_t>(i)] = i % kValuesOfGroup == kValuesOfGroup - 1 ? 100.0F / value : value;
    }
    return RenderInPlace(gLevels, [&](std::uint64_t kernel, const KernelFrame& frame) {
        return LaunchList(mDevice, kernel, frame.Grid(), frame.Data(), frame.Pitch(), frame.Format(), frame.Width(),
                          frame.Height(), values);
    });
}

}  // namespace Vantrel
