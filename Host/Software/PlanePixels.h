// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Media/FFmpegHandles.h"
#include "Host/Software/Picture.h"

namespace Vantrel::Host::Software {

/// Writes a picture into a frame of the same size in one of FFmpeg's formats of red, green and blue, packed or planar,
/// of integers or 32-bit floats. Integers are kept to 0..1 and rounded; a format without alpha loses it.
void WritePlanes(const Picture& picture, AVFrame& frame);

/// The reverse; without alpha the picture is opaque.
[[nodiscard]] Picture ReadPlanes(const AVFrame& frame);

}  // namespace Vantrel::Host::Software
