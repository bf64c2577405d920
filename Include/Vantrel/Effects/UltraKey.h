// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// What the keyer shows.
enum UltraKeyOutput : std::int32_t {
    kUltraKeyOutput_Composite = 0,  ///< the picture with its matte
    kUltraKeyOutput_Alpha = 1,      ///< the matte as grey, opaque
    kUltraKeyOutput_Color = 2,      ///< the cleaned colours without a matte
    kUltraKeyOutput_Count
};

[[nodiscard]] inline const char* GetUltraKeyOutputName(std::int32_t output) {
    constexpr const char* kNames[kUltraKeyOutput_Count] = {"composite", "alpha", "color"};
    return output >= 0 && output < kUltraKeyOutput_Count ? kNames[output] : nullptr;
}

[[nodiscard]] constexpr ParameterRow UltraKeyParameter(std::int32_t index, const char* name, double value,
                                                       const char* goesTo, double maximum = 100) {
    return {index,   name,    ParameterType::kDouble,        "%",   0, maximum,
            {value}, nullptr, ParameterConversion::kPercent, goesTo};
}

/// Makes a colour transparent: the colour of the screen in front of which something was shot. Light adds up in linear
/// values, so display values c are first made linear (IEC 61966-2-1: ((c + 0.055) / 1.055)^2.4 above 0.04045, else
/// c / 12.92), and the result goes back. All percentages below are fractions, and
///
///     ramp(p) = 2 (1 - p) from 0.5 up, else 1 / (2 p): infinity at 0, 1 at 0.5, 0 at 1
///     y = BT.709 luma,  u = (2 B - R - G) / sqrt(18),  v = (G - R) / sqrt(6);  K: the same of the key colour
///
/// The keyer is a colour difference keyer: a pixel has of the screen what its chroma has of the key's, as far as that
/// hue can't be its own (P. Vlahos, US patent 3158477; A. R. Smith and J. F. Blinn, "Blue Screen Matting", SIGGRAPH
/// 1996). A pixel's chroma has a part `along` the key's and a part `across` it. The two secondary colours beside the
/// key's strongest channel, for green yellow and cyan, bound what may be screen. They lie 60 - d and 60 + d degrees
/// from a key whose hue is d from that channel's; d counts up to 15 and no more than 60 - d. lean is the cotangent of
/// the angle on the pixel's side. A tolerance of 0.5 ends at these bounds, a greater one goes beyond them:
///
///     part(g) = max(0, min(along, 2 (along - g lean across))),  share = part((1 - tolerance) / tolerance) / |K chroma|
///
/// That is the share of the screen if it is as bright as the key. How bright it is here is judged by the light beside
/// it:
///
///     rest = (y / K.y - share) K.y / |K chroma|,  bright = share + rest / 2
///     bright below 1    expected = 1 + pure (max(bright, min(d, 1)) - 1) + max(d - 1, 0) (1 - bright),  d = 2 shadow,
///                       pure = 1.2 - 20 d rest / max(1.25 - share, 0.25), limited to 0..1
///     else              expected = 1 + 2 highlight (share - share / bright)
///     screen = share / expected, limited to 0..1;  expected is at least 1/16
///
/// So a darker part with the key's pure colour is a less lit screen, down to d of the key's light, and below that
/// something dark before it; one with other light in it, more than would be black, is something in front. No pixel by
/// itself can tell a shadow from black. A brighter part is taken for a brighter screen by its purity. What is neutral
/// in front of an even screen gets the exact share at a highlight of 0 and a shadow of 0.5.
///
///     a = min(1, screen / ramp(transparency)),  matte = 1 - a - pedestal a^2, limited to 0..1
///
/// On the matte work two filters over (2 r + 1)^2 pixels, r = 4 radius, where part of a pixel is had by going that far
/// from one whole reach to the next: choke takes the least (radius (choke + soften) / scale), soften then the mean
/// (radius soften / scale). So a softened edge stays inside what the matte was. They reach at most 31 pixels and go on
/// beyond the frame with its outermost pixels. The vertical part of a pixel counts for both directions. With a contrast
/// above 0 the last step is matte = mid + (1 + contrast) (matte - mid), limited to 0..1. Alpha is the input's times the
/// matte.
///
/// Colours lose what the screen added, which their own light can't tell apart from spill, and get their strength back:
///
///     spilt = part(ramp(range)),  taken = 2 spill spilt,  light = min(1, 2 spill) spilt / |K chroma| * K.y
///     along' = along - taken,  y' = y - light (not below 0)
///     lit = light / K.y / expected, limited to 0..1,  restored(l) = 1 + 2 luma l / max(1 - l, 1/8)
///     all three times min(restored(lit), max(restored(min(lit, screen)), y / y'))
///     chroma loses min(1, screen / ramp(desaturate)) of itself
///
/// so that what is opaque never gets brighter than it was, and at last go through a matrix: saturation, a turn of hue
/// that keeps luma, and a gain luminance^2.2. A colour that none of this concerns keeps its bits. A key without a hue
/// (chroma below a thousandth of luma) keys nothing.
inline constexpr ParameterRow kUltraKeyParameters[] = {
    {0,
     "output",
     ParameterType::kInt,
     "",
     0,
     kUltraKeyOutput_Count - 1,
     {kUltraKeyOutput_Composite},
     &GetUltraKeyOutputName},
    {2, "key_color", ParameterType::kColor, "", 0, 1, {0, 0.7, 0.25, 1}},
    UltraKeyParameter(4, "transparency", 50, "of the screen; 50 as it was mixed"),
    UltraKeyParameter(5, "highlight", 50,
                      "makes what is brighter than the key opaque: 50 all but a brighter screen, 100 that too"),
    UltraKeyParameter(6, "shadow", 25,
                      "makes what is darker than the key opaque: 25 what has less than half its light, 50 all"),
    UltraKeyParameter(7, "tolerance", 50, "how far from the key's hue is screen: 50 to where another colour begins"),
    UltraKeyParameter(8, "pedestal", 10, "clears noise where the matte is low"),
    UltraKeyParameter(11, "choke", 0, "shrinks the matte, 4 pixels at 100"),
    UltraKeyParameter(12, "soften", 0, "blurs the matte's edge inward, 4 pixels at 100"),
    UltraKeyParameter(13, "contrast", 0, "of the matte, about the mid point"),
    UltraKeyParameter(14, "mid_point", 50, "stays under contrast"),
    UltraKeyParameter(17, "desaturate", 25, "of what is nearly transparent"),
    UltraKeyParameter(18, "range", 50, "how far from the key's hue is spill: 50 to where another colour begins"),
    UltraKeyParameter(19, "spill", 50, "how much spill is taken; 50 all of it, above that the opposite shows"),
    UltraKeyParameter(20, "luma", 50, "how much brightness is given back for spill; 50 as it was mixed"),
    UltraKeyParameter(23, "saturation", 100, "of the colours", 200),
    {24,
     "hue",
     ParameterType::kDouble,
     "degrees",
     -180,
     180,
     {0},
     nullptr,
     ParameterConversion::kPercent,
     "turns the colours, red towards green"},
    UltraKeyParameter(25, "luminance", 100, "of the colours", 200),
};

inline constexpr EffectRow kUltraKeyEffect = MakeEffectRow(
    "TQ.XQVE Ultra Key", "Ultra Key",
    "Makes the colour of a screen transparent and cleans its light from what stood before it.", kUltraKeyParameters);

}  // namespace Vantrel
