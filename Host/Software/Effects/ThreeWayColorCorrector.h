// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Software/EffectContext.h"

namespace Vantrel::Host::Software {

/// Balance, hue and saturation by tonal range, and levels; formulas: Vantrel/Effects/ThreeWayColorCorrector.h.
void RunThreeWayColorCorrector(const EffectContext& context, LayerPicture& layer);

}  // namespace Vantrel::Host::Software
