// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cstring>

#include "Host/Software/Effects/ColorMath.h"
#include "Host/Software/Effects/PointwiseFilters.h"

namespace Vantrel::Host::Software {
namespace {

std::uint32_t Scramble(std::uint32_t h) {
    h ^= h >> 16U;
    h *= 0x7FEB352DU;
    h ^= h >> 15U;
    h *= 0x846CA68BU;
    return h ^ (h >> 16U);
}

/// From -1 to 1.
double NoiseOf(std::uint32_t h) { return 2.0 * (h >> 8U) / 16777216.0 - 1.0; }

}  // namespace

void RunHorizontalFlip(const EffectContext& /*context*/, LayerPicture& layer) {
    const Picture source = layer.picture;
    ChangePixels(layer.picture, [&](const Pixel&, int x, int y) { return source.Get(source.width - 1 - x, y); });
}

void RunVerticalFlip(const EffectContext& /*context*/, LayerPicture& layer) {
    const Picture source = layer.picture;
    ChangePixels(layer.picture, [&](const Pixel&, int x, int y) { return source.Get(x, source.height - 1 - y); });
}

void RunNoise(const EffectContext& context, LayerPicture& layer) {
    const double amount = context.Number(0) / 100.0;
    const bool inColor = context.Flag(1), clips = context.Flag(2);
    const std::int64_t ticks = context.view.frameTicks;
    const std::int64_t number = ticks != 0 ? context.time / ticks : 0;
    const auto frame = static_cast<float>(number);
    std::uint32_t frameBits = 0;
    std::memcpy(&frameBits, &frame, sizeof frameBits);
    ChangePixels(layer.picture, [&](Pixel p, int x, int y) {
        const std::uint32_t row = Scramble(frameBits ^ Scramble(static_cast<std::uint32_t>(y)));
        const std::uint32_t h = Scramble(row + static_cast<std::uint32_t>(x) * 0x9E3779B9U);
        const std::array<double, 3> noise = {NoiseOf(h), NoiseOf(h * 0xC2B2AE35U), NoiseOf(h * 0x85EBCA6BU)};
        for (std::size_t c = 0; c < 3; ++c) {
            p[c] += amount * noise.at(inColor ? c : 0);
            if (clips) p[c] = Limit(p[c], 0.0, 1.0);
        }
        return p;
    });
}

}  // namespace Vantrel::Host::Software
