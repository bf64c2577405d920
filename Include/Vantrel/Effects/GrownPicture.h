// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cmath>
#include <cstdint>

namespace Vantrel {

/// By how many pixels a picture grows on a side for a filter that reaches `reach` pixels far: upwards, none for what
/// isn't above 0. What no frame could hold stays a number with which sizes can be worked out in 32 bits.
[[nodiscard]] inline std::int32_t PixelsToGrow(double reach) {
    constexpr double kMost = 1 << 20;
    return static_cast<std::int32_t>(std::ceil(std::fmin(std::fmax(reach, 0.0), kMost)));
}

}  // namespace Vantrel
