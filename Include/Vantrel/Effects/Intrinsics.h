// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Kiln/BlendMode.h"
#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// The effects that every clip has: where its picture lies, and how it meets what lies below.
enum MotionParameter : std::int32_t {
    kMotion_Position = 0,
    kMotion_Scale = 1,
    kMotion_ScaleWidth = 2,
    kMotion_UniformScale = 3,
    kMotion_Rotation = 4,
    kMotion_Anchor = 5
};

inline constexpr ParameterRow kMotionParameters[] = {
    {kMotion_Position, "position", ParameterType::kPoint, "of the frame", -10, 10, {0.5, 0.5}},
    {kMotion_Scale, "scale", ParameterType::kFloat, "%", 0, 10000, {100}},
    {kMotion_ScaleWidth, "scale_width", ParameterType::kFloat, "%", 0, 10000, {100}},
    {kMotion_UniformScale, "uniform_scale", ParameterType::kBool, "", 0, 1, {1}},
    {kMotion_Rotation, "rotation", ParameterType::kFloat, "degrees", -32767, 32767, {0}},
    {kMotion_Anchor, "anchor", ParameterType::kPoint, "of the picture", -10, 10, {0.5, 0.5}},
};
inline constexpr EffectRow kMotionEffect = MakeEffectRow(
    "TQ.XQVE Motion", "Motion", "Moves, scales and turns the picture around its anchor.", kMotionParameters);

enum OpacityParameter : std::int32_t { kOpacity_Opacity = 0, kOpacity_BlendMode = 1 };

inline constexpr ParameterRow kOpacityParameters[] = {
    {kOpacity_Opacity, "opacity", ParameterType::kFloat, "%", 0, 100, {100}},
    {kOpacity_BlendMode,
     "blend_mode",
     ParameterType::kInt,
     "",
     0,
     Kiln::kBlend_Count - 1,
     {Kiln::kBlend_Normal},
     &Kiln::GetBlendModeName},
};
inline constexpr EffectRow kOpacityEffect =
    MakeEffectRow("TQ.XQVE Opacity", "Opacity", "Fades the picture and chooses how it blends with what lies below.",
                  kOpacityParameters);

}  // namespace Vantrel
