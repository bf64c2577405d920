// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Software/EffectContext.h"

namespace Vantrel::Host::Software {

/// Formulas: Vantrel/Effects/TrackMatte.h.
void ApplyTrackMatte(const Picture& matte, bool byLuma, bool reverse, Picture& picture);
void RunTrackMatte(const EffectContext& context, LayerPicture& layer);

}  // namespace Vantrel::Host::Software
