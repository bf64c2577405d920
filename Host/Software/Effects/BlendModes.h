// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Host/Software/Picture.h"

namespace Vantrel::Host::Software {

/// The colour that a mode of Kiln::IR_BlendMode makes of a layer's colour over a backdrop's, both opaque; alpha is left
/// out of account and comes back as the source's. Unknown modes count as normal, and so does dissolve, which is a
/// matter of alpha. Formulas and their sources: Docs/blend-modes.md.
[[nodiscard]] Pixel BlendColor(std::int32_t mode, const Pixel& backdrop, const Pixel& source);

/// Lays a source over a backdrop (W3C "Compositing and Blending Level 1", source over with blending), straight in and
/// out:
///
///     alpha  = as + ab (1 - as)
///     colour = (as (1 - ab) cs + as ab B(cb, cs) + (1 - as) ab cb) / alpha
///
/// Both alphas are taken between 0 and 1.
/// @param coverage multiplies the source's alpha.
/// @param x,y      the pixel's place in the target, which the dissolve mode draws its noise from.
[[nodiscard]] Pixel BlendOver(std::int32_t mode, const Pixel& backdrop, const Pixel& source, double coverage, int x,
                              int y);

/// The dissolve mode's threshold at a pixel: 0 to below 1, evenly spread, the same at each run. A pixel is drawn opaque
/// where its alpha is greater.
[[nodiscard]] double DissolveThreshold(int x, int y);

}  // namespace Vantrel::Host::Software
