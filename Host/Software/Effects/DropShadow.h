// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Software/EffectContext.h"

namespace Vantrel::Host::Software {

/// What it looks like: Vantrel/Effects/DropShadow.h.
void RunDropShadow(const EffectContext& context, LayerPicture& layer);

}  // namespace Vantrel::Host::Software
