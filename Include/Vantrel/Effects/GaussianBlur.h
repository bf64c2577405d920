// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// Both blurs convolve the picture with a Gaussian, colour weighed by alpha, and differ in what a unit of blurriness
/// is: a standard deviation of blurriness / 3.5 pixels of the sequence in "Gaussian Blur", of 1.125 blurriness / 2.71
/// in "Fast Blur". The picture grows by the blur's reach, 3.5 standard deviations and 3 pixels, on each blurred side;
/// what lies outside is transparent. With its size kept, its edge pixels go on outside instead.
enum BlurParameter : std::int32_t { kBlur_Blurriness = 0, kBlur_Dimensions = 1, kBlur_KeepSize = 2 };

enum BlurDimensions : std::int32_t { kBlurDimensions_Both = 0, kBlurDimensions_Horizontal, kBlurDimensions_Vertical };

[[nodiscard]] inline const char* GetBlurDimensionsName(std::int32_t dimensions) {
    constexpr const char* kNames[] = {"both", "horizontal", "vertical"};
    return dimensions >= 0 && dimensions < 3 ? kNames[dimensions] : nullptr;
}

[[nodiscard]] constexpr std::array<ParameterRow, 3> BlurParameters(ParameterType type) {
    return {{{kBlur_Blurriness, "blurriness", type, "", 0, 1000, {0}},
             {kBlur_Dimensions,
              "dimensions",
              ParameterType::kInt,
              "",
              0,
              kBlurDimensions_Vertical,
              {kBlurDimensions_Both},
              &GetBlurDimensionsName},
             {kBlur_KeepSize, "keep_size", ParameterType::kBool, "", 0, 1, {0}}}};
}

inline constexpr auto kGaussianBlurParameters = BlurParameters(ParameterType::kDouble);
inline constexpr EffectRow kGaussianBlurEffect = MakeEffectRow(
    "TQ.XQVE Gaussian Blur 2", "Gaussian Blur", "Blurs the picture by a Gaussian.", kGaussianBlurParameters);

inline constexpr auto kFastBlurParameters = BlurParameters(ParameterType::kFloat);
inline constexpr EffectRow kFastBlurEffect =
    MakeEffectRow("TQ.XQVE Fast Blur", "Fast Blur", "Blurs the picture by a Gaussian, wider for the same number.",
                  kFastBlurParameters);

}  // namespace Vantrel
