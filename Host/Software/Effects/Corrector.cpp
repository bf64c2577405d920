// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Corrector.h"

namespace Vantrel::Host::Software {
namespace {

Pixel Grey(double level, double alpha) { return {level, level, level, alpha}; }

Pixel Mix(const Pixel& p, const Pixel& corrected, double share) {
    Pixel mixed = p;
    for (std::size_t c = 0; c < 3; ++c) {
        const double value = share == 1.0 ? corrected[c] : p[c] + share * (corrected[c] - p[c]);
        if (!std::isnan(value)) mixed[c] = value;
    }
    return mixed;
}

Pixel Show(const Corrector& corrector, const Pixel& p, double share,
           const std::function<Pixel(const Pixel&)>& correct) {
    if (corrector.output == kCorrectorOutput_Mask) return Grey(share, p[3]);
    if (corrector.output == kCorrectorOutput_TonalRange) {
        const TonalShares tones = ShareTones(Luma(p), corrector.range);
        return Grey(tones.highlight + 0.5 * tones.midtone, p[3]);
    }
    const Pixel result = Mix(p, correct(p), share);
    return corrector.output == kCorrectorOutput_Luma ? Grey(Luma(result), p[3]) : result;
}

}  // namespace

void RunCorrector(Picture& picture, const Corrector& corrector, const std::function<Pixel(const Pixel&)>& correct) {
    // The size is cut in single precision, as the engine cuts it.
    const int width = corrector.columns != 1.0
                          ? static_cast<int>(static_cast<float>(picture.width) * static_cast<float>(corrector.columns))
                          : picture.width;
    const int height = corrector.columns == 1.0 && corrector.rows != 1.0
                           ? static_cast<int>(static_cast<float>(picture.height) * static_cast<float>(corrector.rows))
                           : picture.height;
    if (width < 1 || height < 1) return;
    const Mask mask = corrector.hasSelection ? MakeMask(picture, width, height, corrector.selection) : Mask();
    for (int y = 0; y < height; ++y) {
        for (int x = 0; x < width; ++x) {
            const double share = corrector.hasSelection ? mask.At(x, y) : 1.0;
            picture.Set(x, y, Show(corrector, picture.Get(x, y), share, correct));
        }
    }
}

}  // namespace Vantrel::Host::Software
