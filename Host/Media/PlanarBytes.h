// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Media/DeepPicture.h"

namespace Vantrel::Host {

/// Converts a decoded picture of 8-bit luma and chroma planes, which is what nearly all films are stored in, into 8-bit
/// BGRA of the same size, opaque and full range. FFmpeg's own scaler needs several times as long when it is to
/// interpolate chroma. Chroma lies on the first pixel of a pair, or half way where the picture says so, and half way
/// between lines; it is interpolated linearly. Results are within one level of the exact ones.
/// @return false, with nothing written, for other formats
[[nodiscard]] bool ConvertPlanarBytes(const AVFrame& frame, const LumaWeights& weights, bool fullRange,
                                      HostPicture& picture);

}  // namespace Vantrel::Host
