// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Kiln/Device.h"
#include "Vellum/Geometry.h"

namespace Vantrel {

/// Would the frames of this size that a node may hold at once go beyond what a device allows?
[[nodiscard]] inline bool ExceedsDeviceMemory(const Vellum::Rect& rect, const Kiln::Device& device) {
    constexpr std::uint32_t kLargestPixel = 16;
    constexpr std::uint64_t kFramesOfANode = 4;
    const auto bytes = static_cast<std::int32_t>(static_cast<std::uint32_t>(rect.Width()) *
                                                 static_cast<std::uint32_t>(rect.Height()) * kLargestPixel);
    // A product beyond 31 bits is negative and, widened, larger than any limit.
    return static_cast<std::uint64_t>(std::int64_t{bytes}) * kFramesOfANode > device.GetMemoryLimit();
}

}  // namespace Vantrel
