// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Media/FFmpegHandles.h"
#include "Host/Media/HostPicture.h"

namespace Vantrel::Host {

/// The weights of red and blue in luma.
struct LumaWeights {
    double red = 0.2126;
    double blue = 0.0722;
};

/// Converts a decoded picture of more than 8 bits, in integers or floats, into BGRA of 32-bit float of the same size.
/// FFmpeg's own scaler leaves white at 255/256 on this road, which would show in every grade, and doesn't copy floats.
/// Nothing is clamped. Chroma that is stored for pairs of pixels lies on the first of them, as in MPEG-2 and everything
/// after it, and between lines half way; it is interpolated linearly.
/// @return false, with nothing written, for formats that need more: palettes, mosaics, XYZ, pictures that aren't in
///         ordinary memory
[[nodiscard]] bool ConvertDeepPicture(const AVFrame& frame, const LumaWeights& weights, bool fullRange,
                                      HostPicture& picture);

}  // namespace Vantrel::Host
