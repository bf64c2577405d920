// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Software/EffectContext.h"

namespace Vantrel::Host::Software {

/// The formula: Vantrel/Effects/Sharpen.h.
void RunSharpen(const EffectContext& context, LayerPicture& layer);

}  // namespace Vantrel::Host::Software
