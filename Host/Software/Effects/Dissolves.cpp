// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Dissolves.h"

#include <algorithm>
#include <cmath>

#include "Host/Software/Effects/BlendModes.h"
#include "Host/Software/Effects/FrameRepairs.h"
#include "Kiln/BlendMode.h"

namespace Vantrel::Host::Software {

namespace {

constexpr double kFilmGamma = 2.2;

double Power(double value, double exponent) { return std::copysign(std::pow(std::fabs(value), exponent), value); }

/// What `mix` makes of each pair of pixels.
template <class Mix>
Picture MixEach(const Picture& first, const Picture& second, const Mix& mix) {
    Picture mixed(first.width, first.height);
    for (int y = 0; y < mixed.height; ++y) {
        for (int x = 0; x < mixed.width; ++x) mixed.Set(x, y, mix(first.Get(x, y), second.Get(x, y)));
    }
    return mixed;
}

}  // namespace

Picture CrossDissolve(const Picture& first, const Picture& second, double fraction, bool film) {
    if (fraction == 0.0) return first;
    if (fraction == 1.0) return second;
    return MixEach(first, second, [fraction, film](const Pixel& a, const Pixel& b) {
        const double weightA = (1.0 - fraction) * a[3];
        const double weightB = fraction * b[3];
        Pixel out{};
        out[3] = weightA + weightB;
        for (std::size_t c = 0; c < 3 && out[3] > 0; ++c) {
            out[c] = film ? Power((weightA * Power(a[c], kFilmGamma) + weightB * Power(b[c], kFilmGamma)) / out[3],
                                  1.0 / kFilmGamma)
                          : (weightA * a[c] + weightB * b[c]) / out[3];
        }
        return out;
    });
}

Picture Dip(const Picture& side, double level, float fraction) {
    Picture color(side.width, side.height);
    Fill(color, 0, 0, color.width, color.height, {level, level, level, 1.0});
    return fraction > 0.5F ? CrossDissolve(color, side, 2.0 * static_cast<double>(fraction) - 1.0, false)
                           : CrossDissolve(side, color, 2.0 * static_cast<double>(fraction), false);
}

Picture AdditiveDissolve(const Picture& outgoing, const Picture& incoming, double fraction) {
    if (fraction <= 0.0) return outgoing;
    if (fraction >= 1.0) return incoming;
    const double shareA = std::min(1.0, 2.0 * (1.0 - fraction));
    const double shareB = std::min(1.0, 2.0 * fraction);
    return MixEach(outgoing, incoming, [shareA, shareB](const Pixel& a, const Pixel& b) {
        const double weightA = shareA * a[3];
        const double weightB = shareB * b[3];
        Pixel out{};
        out[3] = std::min(1.0, weightA + weightB);
        for (std::size_t c = 0; c < 3 && out[3] > 0; ++c) out[c] = (weightA * a[c] + weightB * b[c]) / out[3];
        return out;
    });
}

Picture WeightedSum(const std::vector<Picture>& pictures, const std::vector<double>& weights) {
    Picture sum(pictures.front().width, pictures.front().height);
    for (int y = 0; y < sum.height; ++y) {
        for (int x = 0; x < sum.width; ++x) {
            Pixel out{};
            for (std::size_t i = 0; i < pictures.size(); ++i) {
                const Pixel pixel = pictures[i].Get(x, y);
                const double weight = weights[i] * pixel[3];
                for (std::size_t c = 0; c < 3; ++c) out[c] += weight * pixel[c];
                out[3] += weight;
            }
            for (std::size_t c = 0; c < 3; ++c) out[c] = out[3] > 0 ? out[c] / out[3] : 0.0;
            sum.Set(x, y, out);
        }
    }
    return sum;
}

void LayAdjusted(const Picture& adjusted, const Picture& matte, double opacity, std::int32_t blendMode,
                 Picture& picture) {
    for (int y = 0; y < picture.height; ++y) {
        for (int x = 0; x < picture.width; ++x) {
            double share = std::clamp(static_cast<double>(matte.At(x, y)[3]) * opacity, 0.0, 1.0);
            if (blendMode == Kiln::kBlend_Dissolve) share = share > DissolveThreshold(x, y) ? 1.0 : 0.0;
            if (share == 0.0) continue;
            const Pixel below = picture.Get(x, y);
            const Pixel above = adjusted.Get(x, y);
            const Pixel blended = BlendColor(blendMode, below, above);
            const double alphaBelow = std::clamp(below[3], 0.0, 1.0);
            const double weightBelow = (1.0 - share) * below[3];
            const double weightAbove = share * above[3];
            Pixel out{};
            out[3] = weightBelow + weightAbove;
            for (std::size_t c = 0; c < 3; ++c) {
                const double color = (1.0 - alphaBelow) * above[c] + alphaBelow * blended[c];
                const double mixed = out[3] > 0 ? (weightBelow * below[c] + weightAbove * color) / out[3] : 0.0;
                out[c] = share < 1.0 ? mixed : color;
            }
            picture.Set(x, y, out);
        }
    }
}

}  // namespace Vantrel::Host::Software
