// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>

#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// For effects whose picture grows: would it fit on the device at time 0 and at each keyframe of a parameter?
/// @param pad  what the picture grows by on its left and right (x) and at its top and bottom (y), in pixels of the
/// media
[[nodiscard]] bool FitsAtEveryKeyframe(const VideoNode& effect, const RenderRequirements& requirements,
                                       std::int32_t parameter, const std::function<Vellum::Point(std::int64_t)>& pad);

}  // namespace Vantrel
