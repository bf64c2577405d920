// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

enum CropParameter : std::int32_t { kCrop_Left = 0, kCrop_Top = 1, kCrop_Right = 2, kCrop_Bottom = 3, kCrop_Zoom = 4 };

/// Cuts a share off each edge of the clip's own frame. The picture at hand may be larger than that (a blur has grown
/// it) or smaller: what it has beyond the clip's frame goes as well, and what it lacks counts as cut. Cuts fall between
/// pixels, rounded half up:
///
///     left edge = trunc(width * left + 0.5),   right edge = trunc(width - width * right + 0.5)
///
/// and likewise above and below. Kept pixels keep their bits. Opposite cuts that meet or cross, and one of 100 % or
/// more, leave nothing: the picture is transparent, with zoom as well. A cut below 0 % is none.
///
/// Without zoom what was cut is transparent black and the picture keeps its size. With zoom what is left is stretched
/// over the whole frame, each direction by itself, with the filter of the request's quality.
inline constexpr ParameterRow kCropParameters[] = {
    {kCrop_Left, "left", ParameterType::kFloat, "%", 0, 100, {0}, nullptr, ParameterConversion::kPercent},
    {kCrop_Top, "top", ParameterType::kFloat, "%", 0, 100, {0}, nullptr, ParameterConversion::kPercent},
    {kCrop_Right, "right", ParameterType::kFloat, "%", 0, 100, {0}, nullptr, ParameterConversion::kPercent},
    {kCrop_Bottom, "bottom", ParameterType::kFloat, "%", 0, 100, {0}, nullptr, ParameterConversion::kPercent},
    {kCrop_Zoom, "zoom", ParameterType::kBool, "", 0, 1, {0}},
};
inline constexpr EffectRow kCropEffect = MakeEffectRow(
    "TQ.XQVE TQCrop", "Crop", "Cuts the picture's edges off, and may enlarge what is left.", kCropParameters);

}  // namespace Vantrel
