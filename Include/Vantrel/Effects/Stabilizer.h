// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <iterator>

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// Draws each frame through the mesh that an analysis of its clip made for it, so that what is seen stands still or
/// moves smoothly: Vantrel/StabilizerPlugIn.h tells what a mesh is. The frame is sampled bilinearly, colour weighed by
/// alpha; where the picture is reduced the filter widens with it. Pixels at the frame's edge count by the part that is
/// covered, and outside it nothing is seen.
///
/// Whole, the steadied picture has the size of all that its frames cover, centred on the clip's. Cropped, what comes to
/// the middle is the crop window, cut off at the window that stays covered. With the automatic scale that window is
/// enlarged to fill the frame but for the margin, up to the largest scale; the extra scale comes on top.
enum StabilizerParameter : std::int32_t {
    kStabilizer_Framing = 8,
    kStabilizer_LargestScale = 10,
    kStabilizer_Margin = 11,
    kStabilizer_ExtraScale = 13
};

enum StabilizerFraming : std::int32_t {
    kStabilizerFraming_Whole = 0,
    kStabilizerFraming_Crop = 1,
    kStabilizerFraming_CropAndScale = 2
};

[[nodiscard]] inline const char* GetStabilizerFramingName(std::int32_t framing) {
    constexpr const char* kNames[] = {"whole", "crop", "crop_and_scale"};
    return framing >= 0 && framing < 3 ? kNames[framing] : nullptr;
}

inline constexpr ParameterRow kStabilizerParameters[] = {
    {kStabilizer_Framing,
     "framing",
     ParameterType::kInt,
     "",
     0,
     kStabilizerFraming_CropAndScale,
     {kStabilizerFraming_CropAndScale},
     &GetStabilizerFramingName},
    {kStabilizer_LargestScale,
     "largest_scale",
     ParameterType::kDouble,
     "%",
     100,
     1000,
     {150},
     nullptr,
     ParameterConversion::kPercent,
     "of the automatic scale"},
    {kStabilizer_Margin,
     "margin",
     ParameterType::kDouble,
     "%",
     0,
     50,
     {0},
     nullptr,
     ParameterConversion::kPercent,
     "of the frame, that the automatic scale may leave empty"},
    {kStabilizer_ExtraScale,
     "extra_scale",
     ParameterType::kDouble,
     "%",
     1,
     1000,
     {100},
     nullptr,
     ParameterConversion::kPercent},
};
inline constexpr EffectRow kStabilizerEffect = {"TQ.XQVE SubspaceStabilizer",
                                                "Stabilizer",
                                                "Warps each frame so that a shaky shot stands still.",
                                                kStabilizerParameters,
                                                std::size(kStabilizerParameters),
                                                true};

}  // namespace Vantrel
