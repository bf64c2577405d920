// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// Turns the picture in space about its centre and draws it in perspective. x goes right, y down, z away from the eye,
/// which looks at the picture's middle from (0, 0, -e), e being the greater of the picture's width and height. A point
/// (X, Y) of the picture, from its middle, goes to
///
///     (X, Y cos t, Y sin t), turned on by the swivel w: (x cos w + z sin w, y, z cos w - x sin w + d)
///
/// with tilt t and distance d, and is seen at (x, y) / (1 + z / e) (a pinhole camera). Either face shows the picture;
/// the back shows it reversed. What lies behind the eye isn't seen, so a plane that goes through the eye shows the part
/// before it, and one seen edge-on nothing. Pixels at the border count by the part that is covered; where the picture
/// is reduced to less than two thirds its pixels are averaged by a tent as wide as a pixel is there, at most
/// kBasic3D_WidestTent pixels to each side. The picture grows where the plane reaches beyond the frame, up to
/// kBasic3D_LargestFrame pixels.
///
/// The specular highlight is white light added by Blinn's model (Models of light reflection for computer synthesized
/// pictures, 1977): with the unit vectors n (the face's normal), l (to a light above, behind and to the left of the
/// viewer) and h (half way between l and the direction to the eye),
///
///     0.6 min(4 n.l, 1) (n.h)^64, none where the light falls on the other face.
enum Basic3DParameter : std::int32_t {
    kBasic3D_Swivel = 0,
    kBasic3D_Tilt = 1,
    kBasic3D_Distance = 2,
    kBasic3D_SpecularHighlight = 3
};

inline constexpr std::int32_t kBasic3D_LargestFrame = 4096;
inline constexpr float kBasic3D_WidestTent = 32.0F;

inline constexpr ParameterRow kBasic3DParameters[] = {
    {kBasic3D_Swivel, "swivel", ParameterType::kFloat, "degrees", -3600, 3600, {0}},
    {kBasic3D_Tilt, "tilt", ParameterType::kFloat, "degrees", -3600, 3600, {0}},
    {kBasic3D_Distance,
     "distance",
     ParameterType::kFloat,
     "%",
     -100,
     1000,
     {0},
     nullptr,
     ParameterConversion::kPercent,
     "the way that the picture moves off, of the eye's distance"},
    {kBasic3D_SpecularHighlight, "specular_highlight", ParameterType::kBool, "", 0, 1, {0}}};
inline constexpr EffectRow kBasic3DEffect = MakeEffectRow(
    "TQ.XQVE Basic 3D", "Basic 3D", "Turns and moves the picture in space, in perspective.", kBasic3DParameters);

}  // namespace Vantrel
