// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Software/EffectContext.h"

namespace Vantrel::Host::Software {

/// What is burnt in: Vantrel/Effects/Timecode.h.
void RunTimecode(const EffectContext& context, LayerPicture& layer);

}  // namespace Vantrel::Host::Software
