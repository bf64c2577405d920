// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// Laying pixels over others, for kernels in lanes. Docs/blend-modes.md has every formula and its source; here `b` is
/// the backdrop's channel and `s` the source's.

#define BLEND_COLOR 0
#define BLEND_COLOR_BURN 1
#define BLEND_COLOR_DODGE 2
#define BLEND_DARKEN 3
#define BLEND_DARKER_COLOR 4
#define BLEND_DIFFERENCE 5
#define BLEND_DISSOLVE 6
#define BLEND_EXCLUSION 7
#define BLEND_HARD_LIGHT 8
#define BLEND_HARD_MIX 9
#define BLEND_HUE 10
#define BLEND_LIGHTEN 11
#define BLEND_LIGHTER_COLOR 12
#define BLEND_LINEAR_BURN 13
#define BLEND_LINEAR_DODGE 14
#define BLEND_LINEAR_LIGHT 15
#define BLEND_LUMINOSITY 16
#define BLEND_MULTIPLY 17
#define BLEND_NORMAL 18
#define BLEND_OVERLAY 19
#define BLEND_PIN_LIGHT 20
#define BLEND_SATURATION 21
#define BLEND_SCREEN 22
#define BLEND_SOFT_LIGHT 23
#define BLEND_VIVID_LIGHT 24
#define BLEND_SUBTRACT 25
#define BLEND_DIVIDE 26

DEVICE_FUNCTION float BlendHardLight(float b, float s) {
    const float t = 2.0f * s - 1.0f;
    return s <= 0.5f ? 2.0f * b * s : b + t - b * t;
}

DEVICE_FUNCTION float BlendPinLight(float b, float s) { return s <= 0.5f ? Min(b, 2.0f * s) : Max(b, 2.0f * s - 1.0f); }

/// min(1, b / d), 1 where d is 0, and 0 where b is: the quotient that dodge, burn and divide are made of.
DEVICE_FUNCTION float BlendQuotient(float b, float d) {
    const float bounded = b < d ? b / d : 1.0f;
    return b > 0.0f ? bounded : 0.0f;
}

DEVICE_FUNCTION float BlendDodge(float b, float s) { return BlendQuotient(b, 1.0f - s); }
DEVICE_FUNCTION float BlendBurn(float b, float s) { return 1.0f - BlendQuotient(1.0f - b, s); }

DEVICE_FUNCTION float BlendVividLight(float b, float s) {
    const float burn = BlendBurn(b, 2.0f * s);
    const float dodge = BlendDodge(b, 2.0f * s - 1.0f);
    return s <= 0.5f ? burn : dodge;
}

DEVICE_FUNCTION float BlendSoftLight(float b, float s) {
    const float polynomial = ((16.0f * b - 12.0f) * b + 4.0f) * b;
    const float root = Sqrt(b);
    const float d = b <= 0.25f ? polynomial : root;
    const float t = 2.0f * s - 1.0f;
    return s <= 0.5f ? b + t * b * (1.0f - b) : b + t * (d - b);
}

// A colour without alpha. The fourth value is at nobody's service.
DEVICE_FUNCTION float Luminosity(Float4 c) { return 0.11f * c.x + 0.59f * c.y + 0.3f * c.z; }
DEVICE_FUNCTION float LeastOf(Float4 c) { return Min(Min(c.x, c.y), c.z); }
DEVICE_FUNCTION float MostOf(Float4 c) { return Max(Max(c.x, c.y), c.z); }

/// SetLum: shifts a colour to a luminosity, and pulls it towards that grey as far as it takes to bring it into the
/// gamut.
DEVICE_FUNCTION Float4 SetLuminosity(Float4 c, float luminosity) {
    const float shift = luminosity - Luminosity(c);
    const float least = LeastOf(c) + shift, most = MostOf(c) + shift;
    const float below = least < 0.0f ? luminosity / (luminosity - least) : 1.0f;
    const float above = most > 1.0f ? (1.0f - luminosity) / (most - luminosity) : 1.0f;
    const float pull = below * above;
    return Make4(luminosity + (c.x + shift - luminosity) * pull, luminosity + (c.y + shift - luminosity) * pull,
                 luminosity + (c.z + shift - luminosity) * pull, 0.0f);
}

/// SetSat: stretches a colour so that its least channel is 0 and its greatest the saturation.
DEVICE_FUNCTION Float4 SetSaturation(Float4 c, float saturation) {
    const float least = LeastOf(c), most = MostOf(c);
    const float stretch = most > least ? saturation / (most - least) : 0.0f;
    return Make4((c.x - least) * stretch, (c.y - least) * stretch, (c.z - least) * stretch, 0.0f);
}

DEVICE_FUNCTION float SaturationOf(Float4 c) { return MostOf(c) - LeastOf(c); }

// Each mode has loops of its own, so that none is decided pixel by pixel.
#define BLEND_CHANNEL(plane, formula)                         \
    EACH_LANE(i) {                                            \
        const float b = below->plane[i], s = layer->plane[i]; \
        out->plane[i] = (formula);                            \
    }
#define BLEND_CHANNELS(number, formula) \
    if (mode == number) {               \
        BLEND_CHANNEL(x, formula)       \
        BLEND_CHANNEL(y, formula)       \
        BLEND_CHANNEL(z, formula)       \
        return;                         \
    }
#define BLEND_BOUNDED_CHANNEL(plane, formula)                                     \
    EACH_LANE(i) {                                                                \
        const float b = Saturate(below->plane[i]), s = Saturate(layer->plane[i]); \
        out->plane[i] = (formula);                                                \
    }
#define BLEND_BOUNDED_CHANNELS(number, formula) \
    if (mode == number) {                       \
        BLEND_BOUNDED_CHANNEL(x, formula)       \
        BLEND_BOUNDED_CHANNEL(y, formula)       \
        BLEND_BOUNDED_CHANNEL(z, formula)       \
        return;                                 \
    }
#define BLEND_COLORS(number, formula)                               \
    if (mode == number) {                                           \
        EACH_LANE(i) {                                              \
            const Float4 b = Clamp4(GetLane(below, i), 0.0f, 1.0f); \
            const Float4 s = Clamp4(GetLane(layer, i), 0.0f, 1.0f); \
            SetLane(out, i, formula);                               \
        }                                                           \
        return;                                                     \
    }
#define BLEND_WHOLE_COLORS(number, condition)                          \
    if (mode == number) {                                              \
        EACH_LANE(i) {                                                 \
            const Float4 b = GetLane(below, i), s = GetLane(layer, i); \
            SetLane(out, i, Select4(condition, s, b));                 \
        }                                                              \
        return;                                                        \
    }

/// B(b, s): `out` receives colours, its alpha is undefined.
DEVICE_FUNCTION void BlendColorLanes(Lanes4* out, const Lanes4* layer, const Lanes4* below, int mode) {
    BLEND_CHANNELS(BLEND_MULTIPLY, b * s)
    BLEND_CHANNELS(BLEND_SCREEN, b + s - b * s)
    BLEND_CHANNELS(BLEND_OVERLAY, BlendHardLight(s, b))
    BLEND_CHANNELS(BLEND_HARD_LIGHT, BlendHardLight(b, s))
    BLEND_CHANNELS(BLEND_DARKEN, Min(b, s))
    BLEND_CHANNELS(BLEND_LIGHTEN, Max(b, s))
    BLEND_CHANNELS(BLEND_LINEAR_DODGE, b + s)
    BLEND_CHANNELS(BLEND_LINEAR_BURN, b + s - 1.0f)
    BLEND_CHANNELS(BLEND_LINEAR_LIGHT, b + 2.0f * s - 1.0f)
    BLEND_CHANNELS(BLEND_PIN_LIGHT, BlendPinLight(b, s))
    BLEND_CHANNELS(BLEND_HARD_MIX, b + s >= 1.0f ? 1.0f : 0.0f)
    BLEND_CHANNELS(BLEND_DIFFERENCE, Abs(b - s))
    BLEND_CHANNELS(BLEND_EXCLUSION, b + s - 2.0f * b * s)
    BLEND_CHANNELS(BLEND_SUBTRACT, b - s)
    BLEND_BOUNDED_CHANNELS(BLEND_COLOR_DODGE, BlendDodge(b, s))
    BLEND_BOUNDED_CHANNELS(BLEND_COLOR_BURN, BlendBurn(b, s))
    BLEND_BOUNDED_CHANNELS(BLEND_VIVID_LIGHT, BlendVividLight(b, s))
    BLEND_BOUNDED_CHANNELS(BLEND_SOFT_LIGHT, BlendSoftLight(b, s))
    BLEND_BOUNDED_CHANNELS(BLEND_DIVIDE, BlendQuotient(b, s))
    BLEND_COLORS(BLEND_COLOR, SetLuminosity(s, Luminosity(b)))
    BLEND_COLORS(BLEND_HUE, SetLuminosity(SetSaturation(s, SaturationOf(b)), Luminosity(b)))
    BLEND_COLORS(BLEND_SATURATION, SetLuminosity(SetSaturation(b, SaturationOf(s)), Luminosity(b)))
    BLEND_COLORS(BLEND_LUMINOSITY, SetLuminosity(b, Luminosity(s)))
    BLEND_WHOLE_COLORS(BLEND_DARKER_COLOR, Luminosity(s) < Luminosity(b))
    BLEND_WHOLE_COLORS(BLEND_LIGHTER_COLOR, Luminosity(s) > Luminosity(b))
    *out = *layer;
}

/// A threshold for each place, 0 to below 1, evenly spread: two rounds of xorshift and multiply ("lowbias32", Chris
/// Wellons, public domain).
DEVICE_FUNCTION float DissolveThreshold(int x, int y) {
    uint h = ((uint)x * 0x9E3779B1u) ^ ((uint)y * 0x85EBCA77u);
    h = (h ^ (h >> 16)) * 0x7FEB352Du;
    h = (h ^ (h >> 15)) * 0x846CA68Bu;
    h = h ^ (h >> 16);
    return (float)(int)(h >> 8) * (1.0f / 16777216.0f);
}

/// The layer's colour becomes what the mode makes of it over `below`, as far as that covers.
DEVICE_FUNCTION void BlendLayerLanes(Lanes4* layer, const Lanes4* below, int mode) {
    Lanes4 blended;
    BlendColorLanes(&blended, layer, below, mode);
    EACH_LANE(i) {
        const float ab = Saturate(below->w[i]);
        layer->x[i] = Mix(layer->x[i], blended.x[i], ab);
        layer->y[i] = Mix(layer->y[i], blended.y[i], ab);
        layer->z[i] = Mix(layer->z[i], blended.z[i], ab);
    }
}

/// Source over, straight: `layer` becomes the result. Its alpha is multiplied by the coverage.
/// @param x,y place of the first lane in the target
DEVICE_FUNCTION void BlendOverLanes(Lanes4* layer, const Lanes4* below, const float* coverage, int mode, int x, int y) {
    EACH_LANE(i) layer->w[i] = Saturate(layer->w[i] * coverage[i]);
    if (mode == BLEND_DISSOLVE) {
        EACH_LANE(i) layer->w[i] = layer->w[i] > DissolveThreshold(x + i, y) ? 1.0f : 0.0f;
    } else if (mode != BLEND_NORMAL) {
        BlendLayerLanes(layer, below, mode);
    }
    EACH_LANE(i) {
        const float as = layer->w[i];
        const float ab = Saturate(below->w[i]);
        const float alpha = as + ab * (1.0f - as);
        const float share = as / alpha;
        // Selected rather than mixed where one side has no part: what isn't seen mustn't leave a trace, not even of
        // NaN.
        const int all = share >= 1.0f, none = !(as > 0.0f);
        const float x4 = Mix(below->x[i], layer->x[i], share), y4 = Mix(below->y[i], layer->y[i], share);
        const float z4 = Mix(below->z[i], layer->z[i], share);
        const float upperX = all ? layer->x[i] : x4, upperY = all ? layer->y[i] : y4, upperZ = all ? layer->z[i] : z4;
        layer->x[i] = none ? below->x[i] : upperX;
        layer->y[i] = none ? below->y[i] : upperY;
        layer->z[i] = none ? below->z[i] : upperZ;
        layer->w[i] = none ? below->w[i] : alpha;
    }
}

/// The layer takes the place of what lies below as far as it covers it: `layer` becomes the result.
DEVICE_FUNCTION void ReplaceLanes(Lanes4* layer, const Lanes4* below, const float* coverage) {
    EACH_LANE(i) {
        const float upper = coverage[i] * layer->w[i];
        const float lower = (1.0f - coverage[i]) * below->w[i];
        const float alpha = upper + lower;
        const float inverse = alpha > 0.0f ? 1.0f / alpha : 0.0f;
        const int all = coverage[i] >= 1.0f, none = !(coverage[i] > 0.0f);
        const float x4 = (layer->x[i] * upper + below->x[i] * lower) * inverse;
        const float y4 = (layer->y[i] * upper + below->y[i] * lower) * inverse;
        const float z4 = (layer->z[i] * upper + below->z[i] * lower) * inverse;
        const float mixedX = all ? layer->x[i] : x4, mixedY = all ? layer->y[i] : y4, mixedZ = all ? layer->z[i] : z4;
        const float mixedW = all ? layer->w[i] : alpha;
        layer->x[i] = none ? below->x[i] : mixedX;
        layer->y[i] = none ? below->y[i] : mixedY;
        layer->z[i] = none ? below->z[i] : mixedZ;
        layer->w[i] = none ? below->w[i] : mixedW;
    }
}

/// A layer that was made of what lies below takes its place, with a blend mode: `layer` becomes the result, the
/// coverage is used up.
/// @param x,y place of the first lane in the target
DEVICE_FUNCTION void ReplaceBlendedLanes(Lanes4* layer, const Lanes4* below, float* coverage, int mode, int x, int y) {
    EACH_LANE(i) coverage[i] = Saturate(coverage[i]);
    if (mode == BLEND_DISSOLVE) {
        EACH_LANE(i) coverage[i] = coverage[i] > DissolveThreshold(x + i, y) ? 1.0f : 0.0f;
    } else if (mode != BLEND_NORMAL) {
        BlendLayerLanes(layer, below, mode);
    }
    ReplaceLanes(layer, below, coverage);
}
