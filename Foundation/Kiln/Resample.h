// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Kiln/FrameObject.h"

namespace Kiln {

/// Resamples a picture in host memory onto another of the same format: nearest below kMedium, bilinear at kMedium,
/// above it Catmull-Rom's cubic (a = -1/2), widened by the factor of reduction so that each source pixel counts by its
/// area. Colour with straight alpha is weighed by it. Edges are clamped. kStatus_Failure for layouts other than four
/// 8-bit integers or four floats a pixel.
[[nodiscard]] Status ResampleOnHost(const FrameAttributes& to, std::uint8_t* target, const FrameAttributes& from,
                                    const std::uint8_t* source, Vellum::RenderQuality quality);

}  // namespace Kiln
