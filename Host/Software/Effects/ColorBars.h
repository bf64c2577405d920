// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Software/Picture.h"

namespace Vantrel::Host::Software {

/// Fills a picture with the colour bars of SMPTE EG 1: seven bars of 75 % on the upper two thirds, the same bars in
/// reverse with black between them on a twelfth of the height, and at the bottom -I, white, +Q, black and the three
/// steps around black by which a monitor is set up. -I and +Q lie outside of what red, green and blue can be, and the
/// lowest step lies below black: they stay as they are.
///
/// A pixel belongs to the stripe in which its centre lies, edges rounded to the fractions that the engine's pattern
/// has.
void DrawColorBars(Picture& picture);

}  // namespace Vantrel::Host::Software
