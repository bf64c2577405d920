// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Software/EffectContext.h"

namespace Vantrel::Host::Software {

/// What it means: Vantrel/Effects/DirectionalBlur.h.
void RunDirectionalBlur(const EffectContext& context, LayerPicture& layer);

}  // namespace Vantrel::Host::Software
