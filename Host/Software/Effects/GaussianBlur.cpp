// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/GaussianBlur.h"

#include <algorithm>

#include "Vantrel/Effects/GaussianBlur.h"
#include "Vantrel/Effects/GrownPicture.h"

namespace Vantrel::Host::Software {
namespace {

using Plane = std::vector<Pixel>;

/// One line of `count` pixels into one that is longer by `pad` at both ends.
void BlurLine(const Pixel* in, int count, std::ptrdiff_t inStep, Pixel* out, std::ptrdiff_t outStep, int pad,
              const std::vector<double>& weights, bool clamped) {
    const int reach = static_cast<int>(weights.size()) - 1;
    for (int o = 0; o < count + 2 * pad; ++o) {
        Pixel sum{};
        for (int k = -reach; k <= reach; ++k) {
            const int at = o - pad + k, inside = std::clamp(at, 0, count - 1);
            if (!clamped && at != inside) continue;
            const double weight = weights[static_cast<std::size_t>(std::abs(k))];
            for (std::size_t c = 0; c < 4; ++c) sum[c] += weight * in[inside * inStep][c];
        }
        out[o * outStep] = sum;
    }
}

/// From the middle outwards, to where what is left can't be told from nothing.
std::vector<double> MakeWeights(double sigma) {
    constexpr double kReach = 6.0;
    std::vector<double> weights{1.0};
    double sum = 1.0;
    for (int k = 1; k <= static_cast<int>(std::ceil(kReach * sigma)); ++k) {
        weights.push_back(std::exp(-0.5 * k * k / (sigma * sigma)));
        sum += 2.0 * weights.back();
    }
    for (double& weight : weights) weight /= sum;
    return weights;
}

double SigmaOf(const EffectContext& context, double pixelSize) {
    const double blurriness = context.Number(kBlur_Blurriness);
    const bool fast = context.matchName == kFastBlurEffect.matchName;
    return std::max((fast ? blurriness / 2.71 * 1.125 : blurriness / 3.5) / pixelSize, 0.0);
}

int PadOf(double sigma, bool keepSize) {
    // The reach in single precision, as the engine counts it.
    return sigma > 0.0 && !keepSize ? PixelsToGrow(static_cast<double>(static_cast<float>(sigma)) * 3.5) + 3 : 0;
}

}  // namespace

Picture GaussianBlur(const Picture& picture, double sigmaX, double sigmaY, int padX, int padY, bool clamped) {
    const std::vector<double> acrossWeights = MakeWeights(sigmaX), downWeights = MakeWeights(sigmaY);
    const auto width = static_cast<std::size_t>(picture.width), height = static_cast<std::size_t>(picture.height);
    Picture result(picture.width + 2 * padX, picture.height + 2 * padY);
    const auto newWidth = static_cast<std::size_t>(result.width), newHeight = static_cast<std::size_t>(result.height);
    Plane source(width * height), across(newWidth * height), both(newWidth * newHeight);
    for (std::size_t i = 0; i < source.size(); ++i) {
        const float* p = picture.pixels.data() + 4 * i;
        for (std::size_t c = 0; c < 4; ++c) source[i][c] = c < 3 ? static_cast<double>(p[c]) * p[3] : p[3];
    }
    for (std::size_t y = 0; y < height; ++y) {
        BlurLine(&source[y * width], picture.width, 1, &across[y * newWidth], 1, padX, acrossWeights, clamped);
    }
    const auto step = static_cast<std::ptrdiff_t>(newWidth);
    for (std::size_t x = 0; x < newWidth; ++x) {
        BlurLine(&across[x], picture.height, step, &both[x], step, padY, downWeights, clamped);
    }
    for (std::size_t i = 0; i < both.size(); ++i) {
        const double alpha = both[i][3], inverse = alpha > 0.0 ? 1.0 / alpha : 0.0;
        for (std::size_t c = 0; c < 4; ++c) {
            result.pixels[4 * i + c] = static_cast<float>(c < 3 ? both[i][c] * inverse : alpha);
        }
    }
    return result;
}

void RunGaussianBlur(const EffectContext& context, LayerPicture& layer) {
    const std::int32_t dimensions = context.Integer(kBlur_Dimensions);
    const bool keepSize = context.Flag(kBlur_KeepSize);
    const double aspect = static_cast<double>(layer.aspect.numerator) / layer.aspect.denominator;
    const bool across = dimensions == kBlurDimensions_Both || dimensions == kBlurDimensions_Horizontal;
    const bool down = dimensions == kBlurDimensions_Both || dimensions == kBlurDimensions_Vertical;
    const double sigmaX = across ? SigmaOf(context, context.view.ScaleX() * aspect) : 0.0;
    const double sigmaY = down ? SigmaOf(context, context.view.ScaleY()) : 0.0;
    if (sigmaX <= 0.0 && sigmaY <= 0.0) return;
    const int padX = PadOf(sigmaX, keepSize), padY = PadOf(sigmaY, keepSize);
    layer.picture = GaussianBlur(layer.picture, sigmaX, sigmaY, padX, padY, keepSize);
    layer.origin = {layer.origin.x + padX, layer.origin.y + padY};
}

}  // namespace Vantrel::Host::Software
