// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Kiln/Device/Choices.h"

/// Pixel functions that effects share; part of device files, included behind Kiln/Device/Dialect.h. Formulas:
/// Vantrel/Effects/CorrectorParameters.h.

/// BT.709.
DEVICE_FUNCTION float PixelLuma(Float4 p) { return 0.2126f * p.z + 0.7152f * p.y + 0.0722f * p.x; }

/// From 0 at `low` to 1 at `high`; a step at `low` when it isn't below `high`.
DEVICE_FUNCTION float SmoothRamp(float low, float high, float x) {
    const float span = high - low;
    const float inverse = 1.0f / Choose(span > 0.0f, span, 1.0f);
    const float t = Saturate((x - low) * inverse);
    const float step = x < low ? 0.0f : 1.0f;
    return Choose(span > 0.0f, t * t * (3.0f - 2.0f * t), step);
}

/// value^exponent, and from 0 down the value itself, so that dark colours keep their order. The exponent is above 0.
DEVICE_FUNCTION float PowerLevel(float value, float exponent) {
    const float power = Exp2(exponent * Log2(value));
    const float positive = value > 0.0f ? power : value;
    return Choose(exponent != 1.0f, positive, value);
}

/// Input levels, gamma, output levels; `powers` 0 where no inverse gamma differs from 1, which spares the power. Equal
/// input levels are a step. The light case has no more to do than a product and two sums, and neutral levels keep every
/// bit.
DEVICE_FUNCTION float LevelsChannel(float v, int powers, float blackIn, float whiteIn, float inverseGamma,
                                    float blackOut, float whiteOut) {
    const int hasSpan = whiteIn != blackIn;
    const float inverse = 1.0f / Choose(hasSpan, whiteIn - blackIn, 1.0f);
    const float step = v < blackIn ? 0.0f : 1.0f;
    const float linear = Choose(hasSpan, (v - blackIn) * inverse, step);
    const int isSane = (inverseGamma >= 0.0f) & (inverseGamma <= 100.0f);
    const float bent = powers != 0 ? PowerLevel(linear, Choose(isSane, inverseGamma, 100.0f)) : linear;
    return Choose(whiteOut != blackOut, blackOut + bent * (whiteOut - blackOut), blackOut);
}

/// Shares of shadows (x), midtones (y) and highlights (z), which sum to 1.
DEVICE_FUNCTION Float4 TonalShares(float luma, float t0, float t1, float t2, float t3) {
    const float beyondShadow = SmoothRamp(t0, t1, luma);
    const float highlight = SmoothRamp(t2, t3, luma) * beyondShadow;
    return Make4(1.0f - beyondShadow, beyondShadow - highlight, highlight, 0.0f);
}

/// Shadows black, midtones grey, highlights white.
DEVICE_FUNCTION Float4 TonalView(Float4 p, float t0, float t1, float t2, float t3) {
    const Float4 shares = TonalShares(PixelLuma(p), t0, t1, t2, t3);
    return WithAlpha(Splat4(shares.z + 0.5f * shares.y), p.w);
}

DEVICE_FUNCTION Float4 GreyPixel(Float4 p, float level) { return WithAlpha(Splat4(level), p.w); }

/// value^(1 / gamma).
DEVICE_FUNCTION float GammaLevel(float value, float gamma) { return PowerLevel(value, 1.0f / Max(gamma, 0.01f)); }

/// The colour that a place on the vectorscope stands for, of luma 0.
DEVICE_FUNCTION Float4 ColorDifference(float cb, float cr) {
    return Make4(1.8556f * cb, -0.18732427f * cb - 0.46812427f * cr, 1.5748f * cr, 0.0f);
}

/// By how much the pixel's colour changes when it is turned on the vectorscope and stretched: (c, s) is the cosine less
/// 1 and the sine, both times the saturation, so that zeros change nothing.
DEVICE_FUNCTION Float4 HueChange(Float4 p, float luma, float c, float s) {
    const float cb = (p.x - luma) * (1.0f / 1.8556f), cr = (p.z - luma) * (1.0f / 1.5748f);
    return ColorDifference(c * cb - s * cr, s * cb + c * cr);
}

DEVICE_FUNCTION float NumberOr(float value, float other) { return value == value ? value : other; }

/// The corrected pixel where the selection is whole, the pixel itself where there is none, alpha always its own. What
/// comes of infinity less infinity isn't a number; such a channel stays as it was.
DEVICE_FUNCTION Float4 MixSelected(Float4 p, Float4 corrected, float share) {
    const Float4 mixed = ScaleAdd4(Sub4(corrected, p), share, p);
    const Float4 chosen = Select4(share == 1.0f, corrected, Select4(share == 0.0f, p, mixed));
    return Make4(NumberOr(chosen.x, p.x), NumberOr(chosen.y, p.y), NumberOr(chosen.z, p.z), p.w);
}
