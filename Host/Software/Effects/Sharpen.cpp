// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Sharpen.h"

#include <algorithm>
#include <utility>

#include "Host/Software/Effects/ColorMath.h"
#include "Vantrel/Effects/Sharpen.h"

namespace Vantrel::Host::Software {

void RunSharpen(const EffectContext& context, LayerPicture& layer) {
    const double excess = context.Integer(kSharpen_Amount) / 16.0;
    if (excess == 0.0) return;
    const Picture& source = layer.picture;
    Picture result = source;
    constexpr std::pair<int, int> kNeighbours[] = {{0, -1}, {-1, 0}, {1, 0}, {0, 1}};
    for (int y = 0; y < source.height; ++y) {
        for (int x = 0; x < source.width; ++x) {
            const Pixel p = source.Get(x, y);
            Pixel sharpened = p;
            for (const auto& [dx, dy] : kNeighbours) {
                const Pixel n =
                    source.Get(std::clamp(x + dx, 0, source.width - 1), std::clamp(y + dy, 0, source.height - 1));
                const double covered = Limit(n[3], 0.0, 1.0);
                if (!(covered > 0.0)) continue;
                for (std::size_t c = 0; c < 3; ++c) sharpened[c] += excess / 4.0 * covered * (p[c] - n[c]);
            }
            for (std::size_t c = 0; c < 3; ++c) {
                if (std::isnan(sharpened[c])) sharpened[c] = p[c];
            }
            result.Set(x, y, sharpened);
        }
    }
    layer.picture = std::move(result);
}

}  // namespace Vantrel::Host::Software
