// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>

#include "Host/Software/Effects/ColorMath.h"
#include "Host/Software/Effects/Selection.h"
#include "Vantrel/Effects/CorrectorParameters.h"

namespace Vantrel::Host::Software {

/// What all correctors have besides their own controls.
struct Corrector {
    std::int32_t output = kCorrectorOutput_Composite;
    double columns = 1.0;  ///< the shares of the picture that are corrected
    double rows = 1.0;
    TonalRange range{};
    bool hasSelection = false;
    Selection selection;
};

/// Shows what the output asks for, over the corrected part of the picture.
/// @param correct  a pixel as if it were wholly selected; its alpha is not looked at
void RunCorrector(Picture& picture, const Corrector& corrector, const std::function<Pixel(const Pixel&)>& correct);

}  // namespace Vantrel::Host::Software
