// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cmath>

#include "Vantrel/Effects/EffectRow.h"
#include "Vantrel/Effects/GrownPicture.h"

namespace Vantrel {

/// Convolves the picture with a Gaussian along a line: its standard deviation is the length, in pixels of the sequence,
/// colour weighed by alpha. The direction is a clock's, 0 upwards and 90 to the right, in the picture's geometry:
/// pixels that aren't square don't change the angle. The picture grows by one length along the line on each side; what
/// lies outside is transparent.
///
/// It is done without a filter at an angle: the picture is sheared so that the line becomes a row or a column,
/// whichever is nearer, blurred along it and sheared back, both times by linear interpolation (after A. Paeth, "A Fast
/// Algorithm for General Raster Rotation", Graphics Interface 1986).
enum DirectionalBlurParameter : std::int32_t { kDirectionalBlur_Direction = 0, kDirectionalBlur_Length = 1 };

inline constexpr ParameterRow kDirectionalBlurParameters[] = {
    {kDirectionalBlur_Direction, "direction", ParameterType::kFloat, "degrees", 0, 360, {0}},
    {kDirectionalBlur_Length, "length", ParameterType::kFloat, "pixels", 0, 1000, {0}},
};
inline constexpr EffectRow kDirectionalBlurEffect = MakeEffectRow(
    "TQ.XQVE Motion Blur", "Directional Blur", "Blurs the picture along a line.", kDirectionalBlurParameters);

/// How a picture is sheared and blurred.
struct ShearPlan {
    float shear = 0.0F;           ///< the tangent of the angle that is left; pixels a line
    float sigma = 0.0F;           ///< of the Gaussian, in pixels of the sheared picture
    float padX = 0.0F;            ///< what the picture grows by on the left and on the right
    float padY = 0.0F;            ///< and at the top and the bottom
    std::uint8_t horizontal = 1;  ///< 1: rows are shifted and the blur is vertical, 0: columns and horizontal

    /// The sheared picture's size along the shift, of a picture that is `along` by `across` pixels.
    [[nodiscard]] std::int32_t GetShearedSize(std::int32_t along, std::int32_t across) const {
        return static_cast<std::int32_t>(std::fabs(shear) * static_cast<float>(across) + static_cast<float>(along));
    }
    [[nodiscard]] std::int32_t GetPadX() const { return PixelsToGrow(padX); }
    [[nodiscard]] std::int32_t GetPadY() const { return PixelsToGrow(padY); }
};

/// @param direction     degrees; no number counts as 0
/// @param length        pixels of the sequence; not above 0: none
/// @param scaleX,scaleY pixels of the sequence in one of the picture
/// @param aspect        a pixel's width over its height
[[nodiscard]] inline ShearPlan MakeShearPlan(float direction, float length, float scaleX, float scaleY, float aspect) {
    constexpr float kMostTurns = 1000.0F;  // beyond them steps of a turn could get lost in rounding
    if (!std::isfinite(direction)) direction = 0.0F;
    if (std::fabs(direction) > kMostTurns * 360.0F) direction = std::fmod(direction, 360.0F);
    if (!(length > 0.0F)) length = 0.0F;
    float angle = direction / 360.0F * 2.0F * 3.1415927F;
    while (angle < -0.7853982F) angle += 6.2831855F;
    while (static_cast<double>(angle) >= 5.497787296772003) angle -= 6.2831855F;

    const bool isRow = angle == 1.5707964F || angle == 4.712389F;
    float rest = isRow ? angle : std::atan(std::tan(angle) / aspect);
    ShearPlan plan;
    plan.horizontal = rest >= -0.7853982F && rest <= 0.7853982F ? 1 : 0;
    if (plan.horizontal == 0)
        rest = rest > 0.7853982F && rest < 2.3561945F ? -(rest - 1.5707964F) : -(rest - 4.712389F);
    plan.shear = std::tan(rest);
    const float sine = std::fabs(std::sin(angle)), cosine = std::fabs(std::cos(angle));
    const float pixelWidth = scaleX * aspect;
    const float across = sine / pixelWidth, down = cosine / scaleY;
    plan.sigma = std::fabs(std::cos(rest)) * length * std::sqrt(down * down + across * across);
    plan.padX = sine * (length / pixelWidth);
    plan.padY = cosine * (length / scaleY);
    return plan;
}

}  // namespace Vantrel
