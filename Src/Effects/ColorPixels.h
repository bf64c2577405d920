// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// Pixel functions that effects share; part of device files, included behind Kiln/Device/Dialect.h. Formulas:
/// Vantrel/Effects/CorrectorParameters.h.

/// BT.709.
DEVICE_FUNCTION float PixelLuma(Float4 p) { return 0.2126f * p.z + 0.7152f * p.y + 0.0722f * p.x; }

/// From 0 at `low` to 1 at `high`; a step at `low` when it isn't below `high`.
DEVICE_FUNCTION float SmoothRamp(float low, float high, float x) {
    const float span = high - low;
    const float t = Saturate((x - low) / (span > 0.0f ? span : 1.0f));
    return span > 0.0f ? t * t * (3.0f - 2.0f * t) : (x < low ? 0.0f : 1.0f);
}

/// Input levels, gamma, output levels; `powers` 0 where no inverse gamma differs from 1, which spares the power. Equal
/// input levels are a step. The light case has no more to do than a product and two sums, and neutral levels keep every
/// bit.
DEVICE_FUNCTION float LevelsChannel(float v, int powers, float blackIn, float whiteIn, float inverseGamma,
                                    float blackOut, float whiteOut) {
    const float inverse = 1.0f / (whiteIn != blackIn ? whiteIn - blackIn : 1.0f);
    const float linear = whiteIn != blackIn ? (v - blackIn) * inverse : (v < blackIn ? 0.0f : 1.0f);
    const float exponent = inverseGamma >= 0.0f && inverseGamma <= 100.0f ? inverseGamma : 100.0f;
    const float bent = powers != 0 && linear > 0.0f && exponent != 1.0f ? Pow(linear, exponent) : linear;
    return whiteOut != blackOut ? blackOut + bent * (whiteOut - blackOut) : blackOut;
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

/// value^(1 / gamma), and below 0 the value itself, so that dark colours keep their order.
DEVICE_FUNCTION float GammaLevel(float value, float gamma) {
    const float power = Pow(value, 1.0f / Max(gamma, 0.01f));
    return value > 0.0f && gamma != 1.0f ? power : value;
}

/// How much of a correction a pixel takes: all of it without a selection, which a null mask stands for.
DEVICE_FUNCTION float SelectedShare(GLOBAL const float* mask, int index) { return mask ? mask[index] : 1.0f; }

/// The corrected pixel where the selection is whole, the pixel itself where there is none, alpha always its own.
DEVICE_FUNCTION Float4 MixSelected(Float4 p, Float4 corrected, float share) {
    const Float4 mixed = ScaleAdd4(Sub4(corrected, p), share, p);
    const Float4 chosen = Select4(share == 1.0f, corrected, mixed);
    return WithAlpha(Select4(share == 0.0f, p, chosen), p.w);
}
