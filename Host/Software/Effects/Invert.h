// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Host/Software/Picture.h"

namespace Vantrel::Host::Software {

/// Turns colours, or one property of them, into their opposite; formulas: Vantrel/Effects/Invert.h.
/// @param channel an InvertChannel; other numbers leave the picture as it is
/// @param blend   0 the inverted picture, 1 the picture as it was
void Invert(Picture& picture, std::int32_t channel, double blend);

}  // namespace Vantrel::Host::Software
