// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Invert.h"

#include <algorithm>
#include <cmath>

#include "Vantrel/Effects/Invert.h"

namespace Vantrel::Host::Software {
namespace {

/// A colour as hue in sixths of a circle, lightness and saturation.
struct Hls {
    double hue = 0.0;
    double lightness = 0.0;
    double saturation = 0.0;
};

double Chroma(const Hls& color) { return color.saturation * (1.0 - std::abs(2.0 * color.lightness - 1.0)); }

/// Of a colour that isn't grey and whose lightness lies inside 0..1.
Hls ToHls(const Pixel& p) {
    const double red = p[2], green = p[1], blue = p[0];
    const double high = std::max({red, green, blue}), low = std::min({red, green, blue});
    const double chroma = high - low;
    Hls color;
    color.lightness = (high + low) / 2.0;
    color.saturation = chroma / (1.0 - std::abs(high + low - 1.0));
    if (high == red) {
        color.hue = (green - blue) / chroma;
    } else if (high == green) {
        color.hue = 2.0 + (blue - red) / chroma;
    } else {
        color.hue = 4.0 + (red - green) / chroma;
    }
    return color;
}

Pixel FromHls(const Hls& color, double alpha) {
    const double chroma = Chroma(color);
    // How far each primary is from its own hue, 0 to 3 sixths, tells how much of the chroma it takes.
    const auto primary = [&](double hue) {
        const double turned = color.hue - hue - 6.0 * std::floor((color.hue - hue) / 6.0);
        const double distance = std::min(turned, 6.0 - turned);
        return color.lightness + chroma * (std::clamp(2.0 - distance, 0.0, 1.0) - 0.5);
    };
    return {primary(4.0), primary(2.0), primary(0.0), alpha};
}

Pixel InvertHls(const Pixel& p, std::int32_t channel) {
    const double high = std::max({p[0], p[1], p[2]}), low = std::min({p[0], p[1], p[2]});
    const bool all = channel == kInvertChannel_HLS;
    if (high == low || high + low <= 0.0 || high + low >= 2.0) {
        // No hue, or a lightness whose saturation means nothing: what is left is to move the colour as a whole.
        Pixel result = p;
        for (std::size_t c = 0; c < 3; ++c) {
            if (all) result[c] = 1.0 - p[c];
            if (channel == kInvertChannel_Hue) result[c] = high + low - p[c];
            if (channel == kInvertChannel_Lightness) result[c] = p[c] + 1.0 - (high + low);
        }
        return result;
    }
    Hls color = ToHls(p);
    if (all || channel == kInvertChannel_Hue) color.hue += 3.0;
    if (all || channel == kInvertChannel_Lightness) color.lightness = 1.0 - color.lightness;
    if (all || channel == kInvertChannel_Saturation) color.saturation = std::max(1.0 - color.saturation, 0.0);
    return FromHls(color, p[3]);
}

Pixel InvertYiq(const Pixel& p, std::int32_t channel) {
    double luminance = 0.299 * p[2] + 0.587 * p[1] + 0.114 * p[0];
    double i = 0.74 * (p[2] - luminance) - 0.27 * (p[0] - luminance);
    double q = 0.48 * (p[2] - luminance) + 0.41 * (p[0] - luminance);
    const bool all = channel == kInvertChannel_YIQ;
    if (all || channel == kInvertChannel_Luminance) luminance = 1.0 - luminance;
    if (all || channel == kInvertChannel_InPhase) i = -i;
    if (all || channel == kInvertChannel_Quadrature) q = -q;
    const double determinant = 0.74 * 0.41 + 0.27 * 0.48;
    const double red = luminance + (0.41 * i + 0.27 * q) / determinant;
    const double blue = luminance + (0.74 * q - 0.48 * i) / determinant;
    return {blue, (luminance - 0.299 * red - 0.114 * blue) / 0.587, red, p[3]};
}

Pixel InvertPixel(const Pixel& p, std::int32_t channel) {
    Pixel result = p;
    switch (channel) {
        case kInvertChannel_RGB:
            for (std::size_t c = 0; c < 3; ++c) result[c] = 1.0 - p[c];
            break;
        case kInvertChannel_Red:
        case kInvertChannel_Green:
        case kInvertChannel_Blue: {
            const auto c = static_cast<std::size_t>(kInvertChannel_Blue - channel);
            result[c] = 1.0 - p[c];
            break;
        }
        case kInvertChannel_HLS:
        case kInvertChannel_Hue:
        case kInvertChannel_Lightness:
        case kInvertChannel_Saturation:
            return InvertHls(p, channel);
        case kInvertChannel_YIQ:
        case kInvertChannel_Luminance:
        case kInvertChannel_InPhase:
        case kInvertChannel_Quadrature:
            return InvertYiq(p, channel);
        case kInvertChannel_Alpha:
            result[3] = 1.0 - p[3];
            break;
        default:
            break;
    }
    return result;
}

}  // namespace

void Invert(Picture& picture, std::int32_t channel, double blend) {
    for (int y = 0; y < picture.height; ++y) {
        for (int x = 0; x < picture.width; ++x) {
            const Pixel original = picture.Get(x, y);
            Pixel mixed = InvertPixel(original, channel);
            for (std::size_t c = 0; c < 4; ++c) {
                // What wasn't touched stays as it is, also where it is no finite number.
                if (mixed[c] != original[c]) mixed[c] = mixed[c] * (1.0 - blend) + original[c] * blend;
            }
            picture.Set(x, y, mixed);
        }
    }
}

}  // namespace Vantrel::Host::Software
