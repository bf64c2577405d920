// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <vector>

#include "Host/Software/Picture.h"

/// Mixes of pictures of the same size. Colour is weighed by alpha in all of them.
namespace Vantrel::Host::Software {

/// The first picture at fraction 0, the second at 1, to the bit; in between
///
///     a = (1 - f) a1 + f a2,   c = ((1 - f) a1 c1 + f a2 c2) / a
///
/// @param film  mixes the light that values stand for, |c|^2.2 with the sign of c, as a film that is exposed twice does
[[nodiscard]] Picture CrossDissolve(const Picture& first, const Picture& second, double fraction, bool film);

/// A dissolve to an opaque grey of that level in the first half of the time, and from it in the second.
/// @param side  the outgoing picture up to the middle, the incoming one after it
[[nodiscard]] Picture Dip(const Picture& side, double level, float fraction);

/// Adds: the outgoing picture stays whole up to the middle and then fades, the incoming one is whole from the middle
/// on. With the shares p = min(1, 2 (1 - f)) and q = min(1, 2 f): a = min(1, p a1 + q a2), c = (p a1 c1 + q a2 c2) / a.
/// At 0 and below it is the outgoing picture, at 1 and above the incoming one, to the bit.
[[nodiscard]] Picture AdditiveDissolve(const Picture& outgoing, const Picture& incoming, double fraction);

/// The sum of pictures by weights. At least one picture.
[[nodiscard]] Picture WeightedSum(const std::vector<Picture>& pictures, const std::vector<double>& weights);

/// Lays a picture that was made of another one over it: where `matte` covers, it takes the other's place, so that at
/// full coverage nothing of that remains. With k = matte's alpha times opacity, taken between 0 and 1, and B the blend
/// mode's colour of `picture` (b) and `adjusted` (s):
///
///     a = (1 - k) ab + k as,   c = ((1 - k) ab cb + k as ((1 - ab) cs + ab B(cb, cs))) / a
///
/// In the dissolve mode k is 1 where it is greater than the pixel's threshold, else 0.
void LayAdjusted(const Picture& adjusted, const Picture& matte, double opacity, std::int32_t blendMode,
                 Picture& picture);

}  // namespace Vantrel::Host::Software
