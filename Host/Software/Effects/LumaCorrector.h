// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Software/Effects/Corrector.h"

namespace Vantrel::Host::Software {

/// One tonal range's controls; formulas: Vantrel/Effects/LumaCorrector.h.
struct LumaSet {
    double brightness = 0.0;
    double contrast = 0.0;
    double level = 0.5;
    double gamma = 1.0;
    double pedestal = 0.0;
    double gain = 1.0;
};

/// Corrects luma and keeps the colour differences.
/// @param sets  master, shadows, midtones, highlights
void LumaCorrect(Picture& picture, const Corrector& corrector, const std::array<LumaSet, 4>& sets);

}  // namespace Vantrel::Host::Software
