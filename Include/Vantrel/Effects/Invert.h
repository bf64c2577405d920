// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

enum InvertParameter : std::int32_t { kInvert_Channel = 0, kInvert_Blend = 1 };

/// What is turned into its opposite. The properties are those of the trade's usual popup, in its order. Colour is R, G,
/// B, nothing is clamped, and the effect leaves alpha alone except where it inverts it. Each choice undoes itself, for
/// colours in 0..1.
///
/// - RGB, red, green, blue: c' = 1 - c.
/// - Hue, lightness, saturation are those of the double hexcone (Joblove and Greenberg, "Color Spaces for Computer
///   Graphics", SIGGRAPH 1978). With M and m the largest and smallest of R, G, B: L = (M + m) / 2 and
///   S = (M - m) / (1 - |2 L - 1|).
///   - Hue turns by half a circle, to the complement: c' = M + m - c.
///   - Lightness becomes 1 - L: c' = c + 1 - (M + m).
///   - Saturation becomes 1 - S, at least 0: c' = L + (c - L) S' / S. Greys have no hue to saturate and stay, and so do
///     colours whose L lies outside 0..1.
///   - All three: saturation's rule on 1 - c, which is what the other two make together.
/// - Y, I, Q are the NTSC signals (47 CFR 73.682 (a) (20)): Y = 0.299 R + 0.587 G + 0.114 B,
///   I = 0.74 (R - Y) - 0.27 (B - Y), Q = 0.48 (R - Y) + 0.41 (B - Y).
///   - Luminance becomes 1 - Y: c' = c + 1 - 2 Y. In-phase becomes -I, quadrature -Q, the others staying.
///   - All three: c' = 1 - c.
/// - Alpha: a' = 1 - a, colour stays.
///
/// Other numbers leave the picture as it is. The blend then mixes: result = c' (1 - blend) + c blend.
enum InvertChannel : std::int32_t {
    kInvertChannel_RGB = 0,
    kInvertChannel_Red,
    kInvertChannel_Green,
    kInvertChannel_Blue,
    kInvertChannel_HLS,  ///< hue, lightness and saturation
    kInvertChannel_Hue,
    kInvertChannel_Lightness,
    kInvertChannel_Saturation,
    kInvertChannel_YIQ,  ///< luminance and both chrominances
    kInvertChannel_Luminance,
    kInvertChannel_InPhase,
    kInvertChannel_Quadrature,
    kInvertChannel_Alpha,
    kInvertChannel_Count
};

[[nodiscard]] inline const char* GetInvertChannelName(std::int32_t channel) {
    constexpr const char* kNames[kInvertChannel_Count] = {"rgb",      "red",        "green",      "blue", "hls",
                                                          "hue",      "lightness",  "saturation", "yiq",  "luminance",
                                                          "in_phase", "quadrature", "alpha"};
    return channel >= 0 && channel < kInvertChannel_Count ? kNames[channel] : nullptr;
}

inline constexpr ParameterRow kInvertParameters[] = {
    {kInvert_Channel,
     "channel",
     ParameterType::kInt,
     "",
     0,
     kInvertChannel_Count - 1,
     {kInvertChannel_RGB},
     &GetInvertChannelName},
    {kInvert_Blend, "blend", ParameterType::kFloat, "%", 0, 100, {0}},
};
inline constexpr EffectRow kInvertEffect = MakeEffectRow(
    "TQ.XQVE Invert", "Invert", "Turns colours, or one property of them, into their opposite.", kInvertParameters);

}  // namespace Vantrel
