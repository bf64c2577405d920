// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Software/EffectContext.h"

namespace Vantrel::Host::Software {

/// The effect "Basic 3D": Vantrel/Effects/Basic3D.h.
void RunBasic3D(const EffectContext& context, LayerPicture& layer);

}  // namespace Vantrel::Host::Software
