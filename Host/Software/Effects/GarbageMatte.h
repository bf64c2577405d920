// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <vector>

#include "Host/Software/EffectContext.h"

namespace Vantrel::Host::Software {

/// A place in a picture, in pixels.
struct Corner {
    double x = 0.0;
    double y = 0.0;
};

/// What is kept: Vantrel/Effects/GarbageMatte.h.
void ApplyGarbageMatte(const std::vector<Corner>& corners, Picture& picture);
void RunGarbageMatte(const EffectContext& context, LayerPicture& layer);

}  // namespace Vantrel::Host::Software
