// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Software/EffectContext.h"

namespace Vantrel::Host::Software {

/// Lift, gamma and gain by channel and tonal range; formulas: Vantrel/Effects/RGBColorCorrector.h.
void RunRGBColorCorrector(const EffectContext& context, LayerPicture& layer);

}  // namespace Vantrel::Host::Software
