// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Levels.h"

#include "Host/Software/Effects/ColorMath.h"

namespace Vantrel::Host::Software {
namespace {

/// Levels come in single precision, as devices take them: a narrow input range would show the difference.
double ReadLevel(const EffectContext& context, std::int32_t index) {
    return static_cast<double>(static_cast<float>(context.Integer(index)) / 255.0F);
}

Levels ReadGroup(const EffectContext& context, std::int32_t first) {
    Levels levels;
    levels.blackIn = ReadLevel(context, first);
    levels.whiteIn = ReadLevel(context, first + 1);
    levels.blackOut = ReadLevel(context, first + 2);
    levels.whiteOut = ReadLevel(context, first + 3);
    levels.inverseGamma = 100.0 / context.Integer(first + 4);
    return levels;
}

}  // namespace

void RunLevels(const EffectContext& context, LayerPicture& layer) {
    const Levels master = ReadGroup(context, 0);
    const std::array<Levels, 3> channels = {ReadGroup(context, 15), ReadGroup(context, 10), ReadGroup(context, 5)};
    for (int y = 0; y < layer.picture.height; ++y) {
        for (int x = 0; x < layer.picture.width; ++x) {
            Pixel p = layer.picture.Get(x, y);
            for (std::size_t c = 0; c < 3; ++c) p[c] = LevelsChannel(LevelsChannel(p[c], master), channels[c]);
            layer.picture.Set(x, y, p);
        }
    }
}

}  // namespace Vantrel::Host::Software
