// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/CorrectorParameters.h"

namespace Vantrel {

/// What a limiter limits.
enum VideoLimiterAxis : std::int32_t {
    kVideoLimiterAxis_Luma = 0,
    kVideoLimiterAxis_Chroma = 1,
    kVideoLimiterAxis_LumaAndChroma = 2,
    kVideoLimiterAxis_Signal = 3,  ///< the composite signal: luma with the chroma upon it
    kVideoLimiterAxis_Count
};

[[nodiscard]] inline const char* GetVideoLimiterAxisName(std::int32_t axis) {
    constexpr const char* kNames[kVideoLimiterAxis_Count] = {"luma", "chroma", "luma_and_chroma", "signal"};
    return axis >= 0 && axis < kVideoLimiterAxis_Count ? kNames[axis] : nullptr;
}

/// Where it does so.
enum VideoLimiterMethod : std::int32_t {
    kVideoLimiterMethod_Highlights = 0,
    kVideoLimiterMethod_Midtones = 1,
    kVideoLimiterMethod_Shadows = 2,
    kVideoLimiterMethod_All = 3,  ///< as every other number
    kVideoLimiterMethod_Count
};

[[nodiscard]] inline const char* GetVideoLimiterMethodName(std::int32_t method) {
    constexpr const char* kNames[kVideoLimiterMethod_Count] = {"highlights", "midtones", "shadows", "all"};
    return method >= 0 && method < kVideoLimiterMethod_Count ? kNames[method] : nullptr;
}

/// Brings a picture within the limits of a transmission. Luma is BT.709's Y; chroma is the amplitude of the colour
/// subcarrier (SMPTE 170M), of white's level:
///
///     C = sqrt((0.492111 (B - Y))^2 + (0.877283 (R - Y))^2)
///
/// - luma: Y' = Y within its limits, and the colour differences stay.
/// - chroma: C' = C within its limits, and luma and hue stay; what is all but grey (C up to 1/4096) isn't raised.
/// - the composite signal swings from Y - C to Y + C: Y' = Y within its limits, and C' is at most what then is left
///   above and below, min(max - Y', Y' - min).
///
///     c' = Y' + (c - Y) C' / C
///
/// Counted by the pixel's share in one of the tonal ranges, or wholly: c + share (c' - c). Pixels within the limits
/// keep every bit. Where a lower limit is above the upper one, the upper one holds; chroma isn't negative. Alpha stays.
[[nodiscard]] constexpr ParameterRow LimitParameter(std::int32_t index, const char* name, double value) {
    return {index, name, ParameterType::kDouble, "%", -30, 130, {value}};
}

inline constexpr std::array<ParameterRow, 8> kLimitParameters = {{
    {3,
     "reduction_axis",
     ParameterType::kInt,
     "",
     0,
     kVideoLimiterAxis_Count - 1,
     {kVideoLimiterAxis_LumaAndChroma},
     &GetVideoLimiterAxisName},
    LimitParameter(4, "luma_min", 0),
    LimitParameter(5, "luma_max", 100),
    LimitParameter(6, "chroma_min", 0),
    LimitParameter(7, "chroma_max", 100),
    LimitParameter(8, "signal_min", 0),
    LimitParameter(9, "signal_max", 100),
    {10,
     "reduction_method",
     ParameterType::kInt,
     "",
     0,
     kVideoLimiterMethod_Count - 1,
     {kVideoLimiterMethod_All},
     &GetVideoLimiterMethodName},
}};

inline constexpr auto kVideoLimiterParameters =
    JoinParameters(SplitViewParameters(0), kLimitParameters, TonalRangeParameters(13));

inline constexpr EffectRow kVideoLimiterEffect =
    MakeEffectRow("TQ.XQVE Video Limiter", "Video Limiter",
                  "Brings luma, chroma or the composite signal within limits.", kVideoLimiterParameters);

}  // namespace Vantrel
