// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/ThreeWayColorCorrectorNode.h"

#include <algorithm>
#include <cmath>

#include "Vantrel/Effects/ThreeWayColorCorrector.h"

namespace Vantrel {
namespace {

CorrectorKernels gKernels(R"(..\..\Src\Filters\Effects\ThreeWayColorCorrectorNode)",
                          {"ThreeWayColorCorrector_CompositeKernel", "ThreeWayColorCorrector_LumaKernel",
                           "ThreeWayColorCorrector_TonalRangeKernel", "ThreeWayColorCorrector_MaskKernel"});

constexpr CorrectorLayout kLayout{&kThreeWayColorCorrectorEffect, 32, 37, 2, 18};

constexpr std::size_t kRangeCount = 4, kValueCount = 23, kLevelsCount = 20;

float Radians(float degrees) { return static_cast<float>(static_cast<double>(degrees) * 0.017453292519943295); }

/// A wheel's amount, gain and angle as a direction of length sqrt(1/2) and a strength.
void ReadWheel(const ParameterReader& read, std::int32_t first, float* values) {
    const float amount = read.Number(first) * 0.01F, gain = read.Number(first + 1) * 0.01F;
    const float angle = Radians(read.Number(first + 2));
    // Adding 0 makes a 0 of a -0, which atan2 would take for the opposite direction.
    const float y = std::sin(angle) * amount * 0.5F + 0.0F, x = std::cos(angle) * amount * 0.5F + 0.0F;
    const float direction = -std::atan2(y, x);
    values[0] = std::cos(direction) * 0.70710677F;
    values[1] = std::sin(direction) * 0.70710677F;
    values[2] = gain * amount;
}

void ReadValues(const ParameterReader& read, std::array<float, kValueCount + kLevelsCount>& values) {
    read.Numbers(19, values, 0, kRangeCount);
    // The fourth saturation repeats the first.
    std::size_t at = kRangeCount;
    for (const std::int32_t index : {25, 26, 27, 25}) values[at++] = read.Number(index) * 0.01F;
    const float commonAngle = Radians(read.Number(94));
    for (const std::int32_t index : {76, 82, 88}) values[at++] = -(Radians(read.Number(index)) + commonAngle);
    for (const std::int32_t first : {95, 77, 83, 89}) {
        ReadWheel(read, first, &values[at]);
        at += 3;
    }
}

/// Black in, white in, inverse gamma, black out, white out of the whole picture, then of each range, which has none.
std::array<float, kLevelsCount> ReadLevels(const ParameterReader& read) {
    return {read.Number(100),
            read.Number(102),
            1.0F / read.Number(101),
            read.Number(103),
            read.Number(104),
            0.0F,
            1.0F,
            1.0F,
            0.0F,
            1.0F,
            0.0F,
            1.0F,
            1.0F,
            0.0F,
            1.0F,
            0.0F,
            1.0F,
            1.0F,
            0.0F,
            1.0F};
}

}  // namespace

Status ThreeWayColorCorrectorNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                                          const RenderResultsRef& /*results*/) {
    return Correct(params, kLayout, [](const ParameterReader& read) {
        std::array<float, kValueCount + kLevelsCount> values{};
        std::array<float, kRangeCount + kLevelsCount> lumaValues{};
        ReadValues(read, values);
        const std::array<float, kLevelsCount> levels = ReadLevels(read);
        std::copy(levels.begin(), levels.end(), values.begin() + kValueCount);
        std::copy_n(values.begin(), kRangeCount, lumaValues.begin());
        std::copy(levels.begin(), levels.end(), lumaValues.begin() + kRangeCount);
        return [values, lumaValues](std::int32_t output, const CorrectorPass& pass) {
            return gKernels.Launch(output, pass, values, lumaValues);
        };
    });
}

}  // namespace Vantrel
