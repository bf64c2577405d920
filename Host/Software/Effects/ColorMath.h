// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <algorithm>
#include <array>
#include <cmath>

#include "Host/Software/Picture.h"

/// What colour effects share. Formulas: Vantrel/Effects/CorrectorParameters.h.
namespace Vantrel::Host::Software {

/// BT.709.
[[nodiscard]] inline double Luma(const Pixel& p) { return 0.2126 * p[2] + 0.7152 * p[1] + 0.0722 * p[0]; }

/// 0 for what isn't a number.
[[nodiscard]] inline double Limit(double value, double low, double high) {
    return value > low ? std::min(value, high) : low;
}

[[nodiscard]] inline double SmoothRamp(double low, double high, double x) {
    if (!(high > low)) return x < low ? 0.0 : 1.0;
    const double t = Limit((x - low) / (high - low), 0.0, 1.0);
    return t * t * (3.0 - 2.0 * t);
}

/// value^exponent, and from 0 down the value itself.
[[nodiscard]] inline double PowerLevel(double value, double exponent) {
    return value > 0.0 ? std::pow(value, exponent) : value;
}

struct Levels {
    double blackIn = 0.0;
    double whiteIn = 1.0;
    double inverseGamma = 1.0;  ///< one that isn't within 0..100 counts as 100
    double blackOut = 0.0;
    double whiteOut = 1.0;
};
/// v1 = (v - blackIn) / (whiteIn - blackIn), where the two are equal 0 below and 1 from there on;
/// v2 = v1^inverseGamma where v1 is above 0, else v1; blackOut + v2 (whiteOut - blackOut).
[[nodiscard]] inline double LevelsChannel(double v, const Levels& levels) {
    const double span = levels.whiteIn - levels.blackIn;
    const double linear = span != 0.0 ? (v - levels.blackIn) / span : (v < levels.blackIn ? 0.0 : 1.0);
    const bool sane = levels.inverseGamma >= 0.0 && levels.inverseGamma <= 100.0;
    const double bent = PowerLevel(linear, sane ? levels.inverseGamma : 100.0);
    const double reach = levels.whiteOut - levels.blackOut;
    return reach != 0.0 ? levels.blackOut + bent * reach : levels.blackOut;
}

/// Four levels: up to where all is shadow, from where nothing is, up to where nothing is highlight, from where all is.
using TonalRange = std::array<double, 4>;

struct TonalShares {
    double shadow, midtone, highlight;
};
[[nodiscard]] inline TonalShares ShareTones(double luma, const TonalRange& range) {
    const double beyondShadow = SmoothRamp(range[0], range[1], luma);
    const double highlight = SmoothRamp(range[2], range[3], luma) * beyondShadow;
    return {1.0 - beyondShadow, beyondShadow - highlight, highlight};
}

/// value^(1 / gamma).
[[nodiscard]] inline double GammaLevel(double value, double gamma) {
    return PowerLevel(value, 1.0 / std::max(gamma, 0.01));
}

/// A place on the vectorscope.
struct ColorDifference {
    double cb = 0.0;
    double cr = 0.0;
};
[[nodiscard]] inline ColorDifference DifferenceOf(const Pixel& p) {
    const double luma = Luma(p);
    return {(p[0] - luma) / 1.8556, (p[2] - luma) / 1.5748};
}
/// The colour with that luma and those differences.
[[nodiscard]] inline Pixel ColorOf(double luma, const ColorDifference& difference, double alpha) {
    const double blue = luma + 1.8556 * difference.cb, red = luma + 1.5748 * difference.cr;
    return {blue, (luma - 0.2126 * red - 0.0722 * blue) / 0.7152, red, alpha};
}

/// From display values to linear ones and back (IEC 61966-2-1), beyond 0..1 too.
[[nodiscard]] inline double LinearLevel(double c) {
    return c > 0.04045 ? std::pow((c + 0.055) / 1.055, 2.4) : c / 12.92;
}
[[nodiscard]] inline double DisplayLevel(double c) {
    return c > 0.0031308 ? 1.055 * std::pow(c, 1.0 / 2.4) - 0.055 : c * 12.92;
}

}  // namespace Vantrel::Host::Software
