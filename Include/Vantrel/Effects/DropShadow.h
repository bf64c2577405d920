// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cmath>

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// Lays a shadow of the picture's alpha behind the picture: in one colour, moved by the distance towards the direction
/// (a clock's: 0 upwards, 90 to the right), blurred by a Gaussian whose standard deviation is a fifth of the softness.
/// The opacity makes it transparent. The picture lies over it by the rule "over" (T. Porter and T. Duff, "Compositing
/// Digital Images", SIGGRAPH 1984) and grows by what the shadow reaches beyond it; where the shadow doesn't show, it
/// keeps its values. The shadow alone is left with `shadow_only`, also where the picture covers it.
enum DropShadowParameter : std::int32_t {
    kDropShadow_Color = 0,
    kDropShadow_Opacity,
    kDropShadow_Direction,
    kDropShadow_Distance,
    kDropShadow_Softness,
    kDropShadow_ShadowOnly
};

inline constexpr ParameterRow kDropShadowParameters[] = {
    {kDropShadow_Color, "color", ParameterType::kColor, "", 0, 1, {0, 0, 0, 1}},
    {kDropShadow_Opacity, "opacity", ParameterType::kFloat, "", 0, 255, {0}, nullptr, ParameterConversion::kLevel},
    {kDropShadow_Direction, "direction", ParameterType::kFloat, "degrees", 0, 360, {135}},
    {kDropShadow_Distance, "distance", ParameterType::kFloat, "pixels", 0, 1000, {10}},
    {kDropShadow_Softness, "softness", ParameterType::kFloat, "pixels", 0, 1000, {0}},
    {kDropShadow_ShadowOnly, "shadow_only", ParameterType::kBool, "", 0, 1, {0}},
};
inline constexpr EffectRow kDropShadowEffect = MakeEffectRow(
    "TQ.XQVE Drop Shadow", "Drop Shadow", "Lays a shadow of the picture's shape behind it.", kDropShadowParameters);

/// Where picture and shadow lie in the grown frame, in pixels of that frame.
struct ShadowPlace {
    std::int32_t left = 0;  ///< of the picture
    std::int32_t top = 0;
    std::int32_t shadowX = 0;  ///< of the shadow before it is blurred
    std::int32_t shadowY = 0;
    std::int32_t width = 0;  ///< of the frame
    std::int32_t height = 0;
    float sigmaX = 0.0F;  ///< of the blur
    float sigmaY = 0.0F;
};

/// @param width,height       of the picture
/// @param direction          degrees
/// @param distance,softness  pixels of the sequence; a softness below 0 is none, and no number counts as 0
/// @param scaleX,scaleY      pixels of the sequence in one of the picture
[[nodiscard]] inline ShadowPlace PlaceShadow(std::int32_t width, std::int32_t height, float direction, float distance,
                                             float softness, float scaleX, float scaleY) {
    constexpr float kFarthest = 1 << 20;  // no frame reaches so far; beyond it sizes would stop being numbers
    const auto bounded = [](float value, float least) {
        return std::isfinite(value) ? std::fmin(std::fmax(value, least), kFarthest) : 0.0F;
    };
    const auto round = [](float value) { return static_cast<std::int32_t>(std::floor(value + 0.5F)); };
    const float clock = std::isfinite(direction) ? 90.0F - direction : 0.0F;
    const auto theta = static_cast<float>(static_cast<double>(clock) * 0.017453292519943295);
    const float offsetX = std::cos(theta) * bounded(distance / scaleX, -kFarthest);
    const float offsetY = -(std::sin(theta) * bounded(distance / scaleY, -kFarthest));
    const float softX = bounded(softness / scaleX, 0.0F), softY = bounded(softness / scaleY, 0.0F);
    ShadowPlace place;
    place.left = round(softX - std::fmin(0.0F, offsetX));
    place.top = round(softY - std::fmin(0.0F, offsetY));
    place.shadowX = round(offsetX) + place.left;
    place.shadowY = round(offsetY) + place.top;
    place.width = round(static_cast<float>(width) + std::fabs(offsetX) + 1.0F + 2.0F * softX);
    place.height = round(static_cast<float>(height) + std::fabs(offsetY) + 1.0F + 2.0F * softY);
    place.sigmaX = softX / 5.0F;
    place.sigmaY = softY / 5.0F;
    return place;
}

}  // namespace Vantrel
