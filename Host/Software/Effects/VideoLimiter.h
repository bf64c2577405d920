// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Software/EffectContext.h"

namespace Vantrel::Host::Software {

/// Formulas: Vantrel/Effects/VideoLimiter.h.
void RunVideoLimiter(const EffectContext& context, LayerPicture& layer);

}  // namespace Vantrel::Host::Software
