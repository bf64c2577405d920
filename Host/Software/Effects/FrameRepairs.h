// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Host/Software/Picture.h"

/// What is mended on a frame after it was decoded.
namespace Vantrel::Host::Software {

/// Takes the matte colour (blue in the lowest byte, then green and red) out of colour that was blended with it:
/// c = m + (c - m) / a, and m where a is 0.
void Unpremultiply(Picture& picture, std::uint32_t matteColor);

/// Replaces the lines of one field by the mean, weighed by alpha, of the lines above and below; at the border by the
/// one that is there. `keep` 0 keeps the even lines, 1 the odd ones. A picture of one line that isn't kept stays as it
/// is.
void Deinterlace(Picture& picture, int keep);

/// Exchanges the lines of the two fields: 0 with 1, 2 with 3, ... The last line of an odd number stays.
void ReverseFields(Picture& picture);

/// Puts the lines of one field of another picture of the same size into a picture: the odd ones, or the even ones.
void WeaveField(Picture& picture, const Picture& other, bool oddLines);

/// Softens across the lines: each becomes a quarter of the line above, half of itself and a quarter of the line below,
/// colour weighed by alpha; beyond the border lies the border's line.
[[nodiscard]] Picture SoftenLines(const Picture& picture);

/// Fills a rectangle, as far as it lies inside.
void Fill(Picture& picture, int left, int top, int width, int height, const Pixel& color);

}  // namespace Vantrel::Host::Software
