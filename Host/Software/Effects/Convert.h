// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>

#include "Host/Software/Picture.h"
#include "Vellum/PixelFormat.h"

namespace Vantrel::Host::Software {

/// Reads a picture in any host layout of Vellum/PixelFormat.h as straight 32-bit float.
///
/// Eight bits of red, green, blue and alpha are full range, value / 255. Luma and chroma are 8-bit video levels
/// (ITU-R BT.601-7 section 2.5.3, BT.709-6 section 4): Y' = (y - 16) / 219, Cb = (u - 128) / 224, Cr = (v - 128) / 224,
/// with R = Y' + 2 (1 - Kr) Cr, B = Y' + 2 (1 - Kb) Cb, G = (Y' - Kr R - Kb B) / Kg and Kr, Kb 0.299, 0.114 (601) or
/// 0.2126, 0.0722 (709). Nothing is clamped. Premultiplied colour is divided by alpha, and black where that is 0.
/// @param alphaType one of Vellum's; a format without alpha is opaque and one with premultiplied alpha is that,
/// whatever
///                  it says
[[nodiscard]] Picture ReadPicture(const void* data, std::ptrdiff_t rowBytes, int width, int height,
                                  Vellum::PixelFormat format, std::uint32_t alphaType);

/// Writes a picture as BGRA_4444_8u, each value clamped to 0..1 and rounded to the nearest step; what isn't a number
/// becomes 0.
void WritePicture8(const Picture& picture, void* data, std::ptrdiff_t rowBytes);

}  // namespace Vantrel::Host::Software
