// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace Kiln {

/// How a layer's colour meets what lies below it, numbered alphabetically. Formulas: W3C "Compositing and Blending
/// Level 1" for the modes that it defines; the others are given with their kernel.
enum IR_BlendMode : std::int32_t {
    kBlend_Color = 0,
    kBlend_ColorBurn,
    kBlend_ColorDodge,
    kBlend_Darken,
    kBlend_DarkerColor,
    kBlend_Difference,
    kBlend_Dissolve,
    kBlend_Exclusion,
    kBlend_HardLight,
    kBlend_HardMix,
    kBlend_Hue,
    kBlend_Lighten,
    kBlend_LighterColor,
    kBlend_LinearBurn,
    kBlend_LinearDodge,
    kBlend_LinearLight,
    kBlend_Luminosity,
    kBlend_Multiply,
    kBlend_Normal,
    kBlend_Overlay,
    kBlend_PinLight,
    kBlend_Saturation,
    kBlend_Screen,
    kBlend_SoftLight,
    kBlend_VividLight,
    kBlend_Subtract,
    kBlend_Divide,
    kBlend_Count
};
static_assert(kBlend_Multiply == 17 && kBlend_Normal == 18 && kBlend_Divide == 26);

/// The mode's name ("color_burn"); null for a number that is none.
[[nodiscard]] const char* GetBlendModeName(std::int32_t mode);
/// The mode of a name, or -1.
[[nodiscard]] std::int32_t FindBlendMode(const char* name);

}  // namespace Kiln
