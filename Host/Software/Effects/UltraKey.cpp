// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/UltraKey.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <vector>

#include "Host/Software/Effects/ColorMath.h"

namespace Vantrel::Host::Software {
namespace {

/// Linear light as two chromas and luma.
struct Chroma {
    double u, v, luma;
};

Chroma Analyse(const Pixel& p) {
    const double blue = LinearLevel(p[0]), green = LinearLevel(p[1]), red = LinearLevel(p[2]);
    return {(2.0 * blue - red - green) / std::sqrt(18.0), (green - red) / std::sqrt(6.0),
            0.21267103 * red + 0.7151599 * green + 0.072169006 * blue};
}

using Light = std::array<double, 3>;  // red, green, blue

/// The colour of those chromas and luma: any one of those chromas, moved to the luma.
Light ToLight(const Chroma& c) {
    const double green = c.v * std::sqrt(6.0);
    const double blue = (c.u * std::sqrt(18.0) + green) / 2.0;
    const double off = c.luma - (0.7151599 * green + 0.072169006 * blue);
    return {off, green + off, blue + off};
}

double LumaOf(const Light& c) { return 0.212671 * c[0] + 0.71516 * c[1] + 0.072169 * c[2]; }

/// Turns a colour about grey by Rodrigues' formula and brings its luma back.
Light TurnHue(const Light& c, double degrees) {
    const double angle = degrees * 3.14159265358979323846 / 180.0;
    const double mean = (c[0] + c[1] + c[2]) / 3.0, across = std::sin(angle) / std::sqrt(3.0);
    Light turned{};
    for (std::size_t i = 0; i < 3; ++i) {
        turned[i] = (c[i] - mean) * std::cos(angle) + (c[(i + 2) % 3] - c[(i + 1) % 3]) * across;
    }
    const double lost = LumaOf(c) - LumaOf(turned);
    for (double& channel : turned) channel += lost;
    return turned;
}

Light CorrectColor(Light c, const UltraKey& controls) {
    const double luma = LumaOf(c);
    for (double& channel : c) channel = luma + controls.saturation * (channel - luma);
    c = TurnHue(c, controls.hueDegrees);
    for (double& channel : c) channel *= std::pow(controls.luminance, 2.2);
    return c;
}

/// 1 at a half, 0 at 1, without end at 0.
double Ramp(double fraction) {
    if (fraction == 0.0) return std::numeric_limits<float>::max();
    return fraction >= 0.5 ? 2.0 * (1.0 - fraction) : 0.5 / fraction;
}

double OverRamp(double share, double fraction) { return std::min(share / std::max(Ramp(fraction), 1e-6), 1.0); }

/// The cotangents of the angles from a hue to where others begin, on the side of rising hue and on the other.
std::array<double, 2> LeanOf(double u, double v) {
    constexpr double kThird = 2.0943951023931953, kMost = kThird / 8.0;
    const double hue = std::atan2(v, u);  // of blue 0, of green and red a third to either side
    const double off = hue - std::round(hue / kThird) * kThird;
    const double turn = std::copysign(std::min({std::abs(off), kMost, kThird / 2.0 - std::abs(off)}), off);
    return {1.0 / std::tan(kThird / 2.0 - turn), 1.0 / std::tan(kThird / 2.0 + turn)};
}

class Keyer {
public:
    explicit Keyer(const UltraKey& controls)
        : mControls(controls), mKey(Analyse(controls.key)), mLength(std::hypot(mKey.u, mKey.v)) {
        if (mLength > mKey.luma * 1e-3) {
            mU = mKey.u / mLength;
            mV = mKey.v / mLength;
            mPerChroma = mKey.luma / mLength;
            mLean = LeanOf(mU, mV);
        }
        const bool isColorView = controls.output == kUltraKeyOutput_Color;
        mTransparency = isColorView ? 0.0 : controls.transparency;
        mNarrowness = std::max(1.0 - controls.tolerance, 0.0) / std::max(controls.tolerance, 1e-6);
    }

    [[nodiscard]] Pixel Apply(const Pixel& p) const {
        const Chroma c = Analyse(p);
        const double share = NearPart(c, mNarrowness) * mPerChroma / mKey.luma;
        const double expected = Expected(share, (c.luma / mKey.luma - share) * mPerChroma);
        const double screen = Limit(share / expected, 0.0, 1.0);

        const double spilt = NearPart(c, std::max(Ramp(mControls.range), 0.0));
        const double amount = std::max(2.0 * mControls.spill, 0.0);
        const double light = std::min(amount, 1.0) * spilt * mPerChroma;
        const double lit = Limit(light / mKey.luma / expected, 0.0, 1.0);
        const double luma = c.luma > 0.0 ? std::max(c.luma - light, 0.0) : c.luma;
        const double gain =
            std::min(Restored(lit), std::max(Restored(std::min(lit, screen)), c.luma / std::max(luma, 1e-30)));
        const double colorGain = gain * (1.0 - OverRamp(screen, mControls.desaturate));
        const Light result = CorrectColor(
            {ToLight({(c.u - amount * spilt * mU) * colorGain, (c.v - amount * spilt * mV) * colorGain, luma * gain})},
            mControls);
        return {DisplayLevel(result[2]), DisplayLevel(result[1]), DisplayLevel(result[0]), p[3] * Matte(screen)};
    }

private:
    [[nodiscard]] double NearPart(const Chroma& c, double narrowness) const {
        const double along = c.u * mU + c.v * mV, turned = c.v * mU - c.u * mV;
        const double across = std::abs(turned) * mLean[turned > 0.0 ? 0 : 1];
        return std::max(std::min(along, 2.0 * (along - narrowness * across)), 0.0);
    }
    /// How bright the screen is here, by that share of the key's light and the rest beside it.
    [[nodiscard]] double Expected(double share, double rest) const {
        const double bright = share + 0.5 * rest, darkest = 2.0 * mControls.shadow;
        const double pure = Limit(1.2 - 20.0 * darkest * rest / std::max(1.25 - share, 0.25), 0.0, 1.0);
        const double below = 1.0 + pure * (std::max(bright, std::min(darkest, 1.0)) - 1.0) +
                             std::max(darkest - 1.0, 0.0) * (1.0 - bright);
        const double above = 1.0 + 2.0 * mControls.highlight * (share - share / bright);
        return Limit(bright < 1.0 ? below : above, 1.0 / 16.0, 1e30);
    }
    [[nodiscard]] double Restored(double lit) const {
        return 1.0 + 2.0 * mControls.luma * lit / std::max(1.0 - lit, 0.125);
    }
    [[nodiscard]] double Matte(double screen) const {
        const double clear = OverRamp(screen, mTransparency);
        return Limit(1.0 - clear - mControls.pedestal * clear * clear, 0.0, 1.0);
    }

    const UltraKey& mControls;
    Chroma mKey;
    double mLength;
    double mU = 0.0, mV = 0.0, mPerChroma = 0.0;  ///< the key's direction and luma for its chroma; none without a hue
    std::array<double, 2> mLean{};
    double mTransparency = 0.0, mNarrowness = 0.0;
};

using Filter = double (*)(const std::vector<double>& values);

double Least(const std::vector<double>& values) { return *std::min_element(values.begin(), values.end()); }
double Mean(const std::vector<double>& values) {
    double sum = 0.0;
    for (const double value : values) sum += value;
    return sum / static_cast<double>(values.size());
}

/// Over a rectangle of whole pixels.
double FilterAround(const Picture& picture, int x, int y, int reachX, int reachY, Filter filter) {
    std::vector<double> values;
    for (int v = y - reachY; v <= y + reachY; ++v) {
        for (int u = x - reachX; u <= x + reachX; ++u) {
            values.push_back(static_cast<double>(
                picture.At(std::clamp(u, 0, picture.width - 1), std::clamp(v, 0, picture.height - 1))[3]));
        }
    }
    return filter(values);
}

void FilterMatte(Picture& picture, const std::array<double, 2>& reach, Filter filter) {
    if (!(reach[0] > 0.0 || reach[1] > 0.0)) return;
    constexpr double kFurthest = 31.0;
    const auto whole = [kFurthest](double r) {
        return static_cast<int>(std::min(std::ceil(std::max(r, 0.0)), kFurthest));
    };
    const auto before = [](double r) { return static_cast<int>(Limit(std::ceil(r) - 1.0, 0.0, kFurthest)); };
    const double beyond = std::min(reach[1] - (std::ceil(reach[1]) - 1.0), 1.0);
    const Picture from = picture;
    for (int y = 0; y < picture.height; ++y) {
        for (int x = 0; x < picture.width; ++x) {
            const double inner = FilterAround(from, x, y, before(reach[0]), before(reach[1]), filter);
            const double outer = FilterAround(from, x, y, whole(reach[0]), whole(reach[1]), filter);
            picture.At(x, y)[3] = static_cast<float>(inner + beyond * (outer - inner));
        }
    }
}

template <class Change>
void ChangePixels(Picture& picture, const Change& change) {
    for (int y = 0; y < picture.height; ++y) {
        for (int x = 0; x < picture.width; ++x) picture.Set(x, y, change(picture.Get(x, y)));
    }
}

}  // namespace

void ApplyUltraKey(Picture& picture, const UltraKey& controls) {
    const Keyer keyer(controls);
    ChangePixels(picture, [&](const Pixel& p) { return keyer.Apply(p); });
    FilterMatte(picture, controls.chokeReach, Least);
    FilterMatte(picture, controls.softenReach, Mean);
    if (controls.contrast > 0.0) {
        ChangePixels(picture, [&](const Pixel& p) {
            const double matte = controls.midPoint + (1.0 + controls.contrast) * (p[3] - controls.midPoint);
            return Pixel{p[0], p[1], p[2], Limit(matte, 0.0, 1.0)};
        });
    }
    if (controls.output == kUltraKeyOutput_Alpha) {
        ChangePixels(picture, [](const Pixel& p) { return Pixel{p[3], p[3], p[3], 1.0}; });
    }
}

void RunUltraKey(const EffectContext& context, LayerPicture& layer) {
    const auto p = [&context](std::int32_t index) { return context.Number(index) / 100.0; };
    const std::array<double, 4> key = context.value(2);
    UltraKey controls;
    controls.output = context.Integer(0);
    controls.key = {key[2], key[1], key[0], key[3]};
    controls.transparency = p(4);
    controls.highlight = p(5);
    controls.shadow = p(6);
    controls.tolerance = p(7);
    controls.pedestal = p(8);
    controls.contrast = p(13);
    controls.midPoint = p(14);
    controls.desaturate = p(17);
    controls.range = p(18);
    controls.spill = p(19);
    controls.luma = p(20);
    controls.saturation = p(23);
    controls.hueDegrees = context.Number(24);
    controls.luminance = p(25);
    const std::array<double, 2> pixels = {4.0 / context.view.ScaleX(), 4.0 / context.view.ScaleY()};
    for (std::size_t i = 0; i < 2; ++i) {
        controls.chokeReach[i] = (p(11) + p(12)) * pixels[i];
        controls.softenReach[i] = p(12) * pixels[i];
    }
    ApplyUltraKey(layer.picture, controls);
}

}  // namespace Vantrel::Host::Software
