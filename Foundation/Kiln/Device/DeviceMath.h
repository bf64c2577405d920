// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// Arithmetic under one set of names, the same formula on every target. Contraction of a * b + c is allowed everywhere.
/// Errors are stated as measured against double precision; "ulp" is of the 32-bit result.

// Where an operand isn't a number the second one is the result.
DEVICE_FUNCTION float Min(float a, float b) { return a < b ? a : b; }
DEVICE_FUNCTION float Max(float a, float b) { return a > b ? a : b; }
/// Not a number becomes `low`.
DEVICE_FUNCTION float Clamp(float value, float low, float high) { return Min(Max(value, low), high); }
DEVICE_FUNCTION float Saturate(float value) { return Clamp(value, 0.0f, 1.0f); }
DEVICE_FUNCTION int MinInt(int a, int b) { return a < b ? a : b; }
DEVICE_FUNCTION int MaxInt(int a, int b) { return a > b ? a : b; }
DEVICE_FUNCTION int ClampInt(int value, int low, int high) { return MinInt(MaxInt(value, low), high); }

/// `a` at t = 0 and `b` at t = 1, exactly.
DEVICE_FUNCTION float Mix(float a, float b, float t) { return a * (1.0f - t) + b * t; }
DEVICE_FUNCTION float Fract(float x) { return x - Floor(x); }
/// With the sign of `divisor`.
DEVICE_FUNCTION float Mod(float x, float divisor) { return x - divisor * Floor(x / divisor); }
DEVICE_FUNCTION float Step(float edge, float x) { return x < edge ? 0.0f : 1.0f; }
DEVICE_FUNCTION float SmoothStep(float low, float high, float x) {
    const float t = Saturate((x - low) / (high - low));
    return t * t * (3.0f - 2.0f * t);
}
/// To the nearest whole number, halves upward.
DEVICE_FUNCTION float Round(float x) { return Floor(x + 0.5f); }

/// 2 to the x within 1.5 ulp; 0 below -126, infinity from 128.
DEVICE_FUNCTION float Exp2(float x) {
    const float bounded = Clamp(x, -126.0f, 127.99999f);
    const float whole = Floor(bounded + 0.5f);
    const float f = bounded - whole;
    float p = 1.5353362e-4f;
    p = p * f + 1.3398874e-3f;
    p = p * f + 9.6184374e-3f;
    p = p * f + 5.5503325e-2f;
    p = p * f + 2.4022648e-1f;
    p = p * f + 6.9314720e-1f;
    p = p * f + 1.0f;
    // The scale is applied in two steps because 2^128 alone isn't a number that a float holds.
    const int first = (int)whole >> 1;
    const int second = (int)whole - first;
    const float scaled = p * AsFloat((first + 127) << 23) * AsFloat((second + 127) << 23);
    const float high = x >= 128.0f ? AsFloat(0x7F800000) : scaled;
    const float low = x < -126.0f ? 0.0f : high;
    return x == x ? low : x;
}

/// Base 2 within 2 ulp, or 1e-7 where the result is near 0. Minus infinity for 0 and subnormal numbers, not a number
/// for negative ones.
DEVICE_FUNCTION float Log2(float x) {
    const int bits = AsInt(x);
    // Mantissa between sqrt(1/2) and sqrt(2), so that the series is short on both sides of 1.
    const int exponent = (bits - 0x3F3504F3) >> 23;
    const float m = AsFloat(bits - (int)((uint)exponent << 23));
    const float s = (m - 1.0f) / (m + 1.0f);
    const float s2 = s * s;
    float p = 0.32059890f;
    p = p * s2 + 0.41219858f;
    p = p * s2 + 0.57707802f;
    p = p * s2 + 0.96179669f;
    p = p * s2 + 2.8853901f;
    const float finite = p * s + (float)exponent;
    const float positive = x < AsFloat(0x7F800000) ? finite : x;
    const float normal = x < 1.17549435e-38f ? AsFloat((int)0xFF800000) : positive;
    const float result = x < 0.0f ? AsFloat(0x7FC00000) : normal;
    return x == x ? result : x;
}

DEVICE_FUNCTION float Exp(float x) {
    // log2(e) in two parts: one rounding of a large product would cost the last digits of the power.
    const float whole = Floor(x * 1.44269504f + 0.5f);
    const float rest = (x - whole * 0.693359375f) + whole * 2.12194440e-4f;
    return Exp2(whole) * Exp2(rest * 1.44269504f);
}
DEVICE_FUNCTION float Log(float x) { return Log2(x) * 0.69314718f; }

/// For colour: a base at or below 0 gives 0 (1 for exponent 0, infinity for a negative one). The relative error is 4e-7
/// while the result lies between 1/16 and 16 and grows with the logarithm of the result.
DEVICE_FUNCTION float Pow(float base, float exponent) {
    const float power = Exp2(exponent * Log2(base));
    const float edge = exponent > 0.0f ? 0.0f : AsFloat(0x7F800000);
    const float bounded = base < 1.17549435e-38f ? edge : power;
    const float result = exponent == 0.0f ? 1.0f : bounded;
    return base == base && exponent == exponent ? result : base + exponent;
}

/// Both within 2e-7 for angles (radians) up to 8000.
DEVICE_FUNCTION float SinQuarter(float x, int quarter) {
    const float turns = Floor(x * 0.63661977f + 0.5f);
    const float r = ((x - turns * 1.5703125f) - turns * 4.8375129e-4f) - turns * 7.5497901e-8f;
    const float r2 = r * r;
    const float sine = r + r * r2 * (-1.6666655e-1f + r2 * (8.3321608e-3f - r2 * 1.9515296e-4f));
    const float cosine = 1.0f - 0.5f * r2 + r2 * r2 * (4.1666646e-2f + r2 * (-1.3887316e-3f + r2 * 2.4433157e-5f));
    const int n = (int)turns + quarter;
    const float value = (n & 1) != 0 ? cosine : sine;
    return (n & 2) != 0 ? -value : value;
}
DEVICE_FUNCTION float Sin(float x) { return SinQuarter(x, 0); }
DEVICE_FUNCTION float Cos(float x) { return SinQuarter(x, 1); }

/// In radians, within 4e-7; 0 for (0, 0).
DEVICE_FUNCTION float Atan2(float y, float x) {
    const float ax = Abs(x), ay = Abs(y);
    const float large = Max(ax, ay), small = Min(ax, ay);
    const float t = large > 0.0f ? small / large : 0.0f;
    // Beyond tan(pi/8) the angle is taken from pi/4: the series converges twice as fast.
    const float shifted = t > 0.41421356f ? (t - 1.0f) / (t + 1.0f) : t;
    const float base = t > 0.41421356f ? 0.78539816f : 0.0f;
    const float s = shifted * shifted;
    float p = 8.05374449538e-2f;
    p = p * s - 1.38776856032e-1f;
    p = p * s + 1.99777106478e-1f;
    p = p * s - 3.33329491539e-1f;
    const float angle = base + shifted + shifted * s * p;
    const float octant = ay > ax ? 1.57079633f - angle : angle;
    const float halfPlane = x < 0.0f ? 3.14159265f - octant : octant;
    return y < 0.0f ? -halfPlane : halfPlane;
}

// Pixels: x is blue, y green, z red, w alpha.
DEVICE_FUNCTION Float4 Splat4(float value) { return Make4(value, value, value, value); }
DEVICE_FUNCTION Float4 Add4(Float4 a, Float4 b) { return Make4(a.x + b.x, a.y + b.y, a.z + b.z, a.w + b.w); }
DEVICE_FUNCTION Float4 Sub4(Float4 a, Float4 b) { return Make4(a.x - b.x, a.y - b.y, a.z - b.z, a.w - b.w); }
DEVICE_FUNCTION Float4 Mul4(Float4 a, Float4 b) { return Make4(a.x * b.x, a.y * b.y, a.z * b.z, a.w * b.w); }
DEVICE_FUNCTION Float4 Div4(Float4 a, Float4 b) { return Make4(a.x / b.x, a.y / b.y, a.z / b.z, a.w / b.w); }
DEVICE_FUNCTION Float4 Scale4(Float4 a, float s) { return Make4(a.x * s, a.y * s, a.z * s, a.w * s); }
/// a * s + b.
DEVICE_FUNCTION Float4 ScaleAdd4(Float4 a, float s, Float4 b) {
    return Make4(a.x * s + b.x, a.y * s + b.y, a.z * s + b.z, a.w * s + b.w);
}
/// a * b + c.
DEVICE_FUNCTION Float4 MulAdd4(Float4 a, Float4 b, Float4 c) {
    return Make4(a.x * b.x + c.x, a.y * b.y + c.y, a.z * b.z + c.z, a.w * b.w + c.w);
}
/// `a` at t = 0 and `b` at t = 1, exactly.
DEVICE_FUNCTION Float4 Mix4(Float4 a, Float4 b, float t) {
    return Make4(Mix(a.x, b.x, t), Mix(a.y, b.y, t), Mix(a.z, b.z, t), Mix(a.w, b.w, t));
}
DEVICE_FUNCTION Float4 Min4(Float4 a, Float4 b) {
    return Make4(Min(a.x, b.x), Min(a.y, b.y), Min(a.z, b.z), Min(a.w, b.w));
}
DEVICE_FUNCTION Float4 Max4(Float4 a, Float4 b) {
    return Make4(Max(a.x, b.x), Max(a.y, b.y), Max(a.z, b.z), Max(a.w, b.w));
}
DEVICE_FUNCTION Float4 Clamp4(Float4 a, float low, float high) {
    return Make4(Clamp(a.x, low, high), Clamp(a.y, low, high), Clamp(a.z, low, high), Clamp(a.w, low, high));
}
DEVICE_FUNCTION Float4 Abs4(Float4 a) { return Make4(Abs(a.x), Abs(a.y), Abs(a.z), Abs(a.w)); }
DEVICE_FUNCTION float Dot4(Float4 a, Float4 b) { return a.x * b.x + a.y * b.y + a.z * b.z + a.w * b.w; }
/// Of blue, green and red alone.
DEVICE_FUNCTION float Dot3(Float4 a, Float4 b) { return a.x * b.x + a.y * b.y + a.z * b.z; }
DEVICE_FUNCTION Float4 WithAlpha(Float4 color, float alpha) { return Make4(color.x, color.y, color.z, alpha); }
/// `a` where the condition isn't 0.
DEVICE_FUNCTION Float4 Select4(int condition, Float4 a, Float4 b) {
    return Make4(condition != 0 ? a.x : b.x, condition != 0 ? a.y : b.y, condition != 0 ? a.z : b.z,
                 condition != 0 ? a.w : b.w);
}
