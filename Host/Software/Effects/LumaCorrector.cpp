// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/LumaCorrector.h"

namespace Vantrel::Host::Software {
namespace {

double Apply(const LumaSet& set, double v) {
    const double added = v + set.brightness;
    return GammaLevel(added + set.contrast * (added - set.level) + set.pedestal, set.gamma) * set.gain;
}

}  // namespace

void LumaCorrect(Picture& picture, const Corrector& corrector, const std::array<LumaSet, 4>& sets) {
    RunCorrector(picture, corrector, [&](const Pixel& p) {
        const double luma = Luma(p);
        const TonalShares shares = ShareTones(luma, corrector.range);
        const double whole = Apply(sets[0], luma);
        const double corrected = whole + shares.shadow * (Apply(sets[1], whole) - whole) +
                                 shares.midtone * (Apply(sets[2], whole) - whole) +
                                 shares.highlight * (Apply(sets[3], whole) - whole);
        Pixel result = p;
        for (std::size_t c = 0; c < 3; ++c) result[c] += corrected - luma;
        return result;
    });
}

}  // namespace Vantrel::Host::Software
