// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// From display values to linear ones and back (IEC 61966-2-1), beyond 0..1 too. Part of device files, included behind
/// Kiln/Device/Dialect.h.

/// base^exponent within 5e-7 of it for bases from 2^-20 to 2^50 and exponents up to 2.4: without the rest of what Pow
/// takes care of, at half its cost.
DEVICE_FUNCTION float PlainPower(float base, float exponent) {
    const int bits = AsInt(base);
    // Mantissa between sqrt(1/2) and sqrt(2), as in Log2.
    const int whole = (bits - 0x3F3504F3) >> 23;
    const float m = AsFloat(bits - (int)((uint)whole << 23));
    const float s = (m - 1.0f) / (m + 1.0f), s2 = s * s;
    const float log2 = ((0.59886790f * s2 + 0.96147393f) * s2 + 2.8853913f) * s + (float)whole;
    const float power = exponent * log2;
    const float near = Floor(power + 0.5f);
    const float f = power - near;
    float p = 1.3264797e-3f;
    p = p * f + 9.6715383e-3f;
    p = p * f + 5.5507338e-2f;
    p = p * f + 2.4022242e-1f;
    p = p * f + 6.9314698e-1f;
    p = p * f + 1.0f;
    return p * AsFloat(((int)near + 127) << 23);
}

// Bounds keep what isn't a number, or is on the straight part, out of the power; infinity becomes a great number.
DEVICE_FUNCTION float LinearLevel(float c) {
    const float power = PlainPower(Clamp((c + 0.055f) * (1.0f / 1.055f), 0.0625f, 1e15f), 2.4f);
    return c > 0.04045f ? power : c * (1.0f / 12.92f);
}

DEVICE_FUNCTION float DisplayLevel(float c) {
    const float power = 1.055f * PlainPower(Clamp(c, 0.001f, 1e15f), 1.0f / 2.4f) - 0.055f;
    return c > 0.0031308f ? power : c * 12.92f;
}
