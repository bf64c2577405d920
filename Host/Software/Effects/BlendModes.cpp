// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/BlendModes.h"

#include <algorithm>
#include <cmath>

#include "Kiln/BlendMode.h"

namespace Vantrel::Host::Software {
namespace {

constexpr std::size_t kBlue = 0;
constexpr std::size_t kGreen = 1;
constexpr std::size_t kRed = 2;
constexpr std::size_t kAlpha = 3;

double Clamp01(double value) { return std::clamp(value, 0.0, 1.0); }

double HardLight(double cb, double cs) {
    return cs <= 0.5 ? cb * 2.0 * cs : cb + (2.0 * cs - 1.0) - cb * (2.0 * cs - 1.0);
}

double ColorDodge(double cb, double cs) {
    if (cb == 0.0) return 0.0;
    return cs == 1.0 ? 1.0 : std::min(1.0, cb / (1.0 - cs));
}

double ColorBurn(double cb, double cs) {
    if (cb == 1.0) return 1.0;
    return cs == 0.0 ? 0.0 : 1.0 - std::min(1.0, (1.0 - cb) / cs);
}

double SoftLight(double cb, double cs) {
    if (cs <= 0.5) return cb - (1.0 - 2.0 * cs) * cb * (1.0 - cb);
    const double d = cb <= 0.25 ? ((16.0 * cb - 12.0) * cb + 4.0) * cb : std::sqrt(cb);
    return cb + (2.0 * cs - 1.0) * (d - cb);
}

double VividLight(double cb, double cs) { return cs <= 0.5 ? ColorBurn(cb, 2.0 * cs) : ColorDodge(cb, 2.0 * cs - 1.0); }

double Divide(double cb, double cs) {
    if (cb == 0.0) return 0.0;
    return cs == 0.0 ? 1.0 : std::min(1.0, cb / cs);
}

double BlendChannel(std::int32_t mode, double cb, double cs) {
    switch (mode) {
        case Kiln::kBlend_ColorBurn:
            return ColorBurn(Clamp01(cb), Clamp01(cs));
        case Kiln::kBlend_ColorDodge:
            return ColorDodge(Clamp01(cb), Clamp01(cs));
        case Kiln::kBlend_Darken:
            return std::min(cb, cs);
        case Kiln::kBlend_Difference:
            return std::abs(cb - cs);
        case Kiln::kBlend_Exclusion:
            return cb + cs - 2.0 * cb * cs;
        case Kiln::kBlend_HardLight:
            return HardLight(cb, cs);
        case Kiln::kBlend_HardMix:
            return cb + cs >= 1.0 ? 1.0 : 0.0;
        case Kiln::kBlend_Lighten:
            return std::max(cb, cs);
        case Kiln::kBlend_LinearBurn:
            return cb + cs - 1.0;
        case Kiln::kBlend_LinearDodge:
            return cb + cs;
        case Kiln::kBlend_LinearLight:
            return cb + 2.0 * cs - 1.0;
        case Kiln::kBlend_Multiply:
            return cb * cs;
        case Kiln::kBlend_Overlay:
            return HardLight(cs, cb);
        case Kiln::kBlend_PinLight:
            return cs <= 0.5 ? std::min(cb, 2.0 * cs) : std::max(cb, 2.0 * cs - 1.0);
        case Kiln::kBlend_Screen:
            return cb + cs - cb * cs;
        case Kiln::kBlend_SoftLight:
            return SoftLight(Clamp01(cb), Clamp01(cs));
        case Kiln::kBlend_VividLight:
            return VividLight(Clamp01(cb), Clamp01(cs));
        case Kiln::kBlend_Subtract:
            return cb - cs;
        case Kiln::kBlend_Divide:
            return Divide(Clamp01(cb), Clamp01(cs));
        default:
            return cs;
    }
}

double Lum(const Pixel& c) { return 0.3 * c[kRed] + 0.59 * c[kGreen] + 0.11 * c[kBlue]; }

double Sat(const Pixel& c) {
    return std::max({c[kRed], c[kGreen], c[kBlue]}) - std::min({c[kRed], c[kGreen], c[kBlue]});
}

Pixel ClipColor(Pixel c) {
    const double l = Lum(c);
    const double n = std::min({c[kRed], c[kGreen], c[kBlue]});
    const double x = std::max({c[kRed], c[kGreen], c[kBlue]});
    for (std::size_t i = 0; i < kAlpha; ++i) {
        if (n < 0.0) c[i] = l + (c[i] - l) * l / (l - n);
        if (x > 1.0) c[i] = l + (c[i] - l) * (1.0 - l) / (x - l);
    }
    return c;
}

Pixel SetLum(Pixel c, double l) {
    const double d = l - Lum(c);
    for (std::size_t i = 0; i < kAlpha; ++i) c[i] += d;
    return ClipColor(c);
}

Pixel SetSat(Pixel c, double s) {
    std::array<std::size_t, 3> order{kBlue, kGreen, kRed};
    std::sort(order.begin(), order.end(), [&c](std::size_t a, std::size_t b) { return c[a] < c[b]; });
    double& least = c[order[0]];
    double& middle = c[order[1]];
    double& most = c[order[2]];
    if (most > least) {
        middle = (middle - least) * s / (most - least);
        most = s;
    } else {
        middle = most = 0.0;
    }
    least = 0.0;
    return c;
}

Pixel ClampColor(Pixel c) {
    for (std::size_t i = 0; i < kAlpha; ++i) c[i] = Clamp01(c[i]);
    return c;
}

}  // namespace

Pixel BlendColor(std::int32_t mode, const Pixel& backdrop, const Pixel& source) {
    const Pixel cb = ClampColor(backdrop);
    const Pixel cs = ClampColor(source);
    Pixel out = source;
    switch (mode) {
        case Kiln::kBlend_Color:
            out = SetLum(cs, Lum(cb));
            break;
        case Kiln::kBlend_Hue:
            out = SetLum(SetSat(cs, Sat(cb)), Lum(cb));
            break;
        case Kiln::kBlend_Saturation:
            out = SetLum(SetSat(cb, Sat(cs)), Lum(cb));
            break;
        case Kiln::kBlend_Luminosity:
            out = SetLum(cb, Lum(cs));
            break;
        case Kiln::kBlend_DarkerColor:
            out = Lum(source) < Lum(backdrop) ? source : backdrop;
            break;
        case Kiln::kBlend_LighterColor:
            out = Lum(source) > Lum(backdrop) ? source : backdrop;
            break;
        default:
            for (std::size_t c = 0; c < kAlpha; ++c) out[c] = BlendChannel(mode, backdrop[c], source[c]);
    }
    out[kAlpha] = source[kAlpha];
    return out;
}

Pixel BlendOver(std::int32_t mode, const Pixel& backdrop, const Pixel& source, double coverage, int x, int y) {
    double as = Clamp01(source[kAlpha] * coverage);
    if (mode == Kiln::kBlend_Dissolve) as = as > DissolveThreshold(x, y) ? 1.0 : 0.0;
    const double ab = Clamp01(backdrop[kAlpha]);
    if (as == 0.0) return backdrop;
    const Pixel blended = BlendColor(mode, backdrop, source);
    const double alpha = as + ab * (1.0 - as);
    Pixel out;
    for (std::size_t c = 0; c < kAlpha; ++c) {
        out[c] = (as * (1.0 - ab) * source[c] + as * ab * blended[c] + (1.0 - as) * ab * backdrop[c]) / alpha;
    }
    out[kAlpha] = alpha;
    return out;
}

double DissolveThreshold(int x, int y) {
    // Two rounds of xorshift and multiply ("lowbias32", Chris Wellons, public domain) over the position.
    std::uint32_t h = static_cast<std::uint32_t>(x) * 0x9E3779B1U ^ static_cast<std::uint32_t>(y) * 0x85EBCA77U;
    h = (h ^ h >> 16) * 0x7FEB352DU;
    h = (h ^ h >> 15) * 0x846CA68BU;
    h ^= h >> 16;
    return static_cast<double>(h >> 8) / 16777216.0;
}

}  // namespace Vantrel::Host::Software
