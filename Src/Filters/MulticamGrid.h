// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <vector>

#include "Kiln/Device.h"
#include "Marl/IVideoFrame.h"
#include "Vellum/Geometry.h"

namespace Vantrel {

/// What a multicam monitor shows.
struct MulticamLook {
    std::int32_t selected = 0;   ///< the camera on air; one that isn't there has no border and no programme picture
    bool showProgram = false;    ///< the grid takes the left half, the selected camera the right one
    bool recording = false;      ///< a red border round the selected camera instead of a yellow one
    bool isNonMulticam = false;  ///< the first camera takes the place of the whole grid
};

/// Draws the monitor over all of `output`. Each camera's picture is stretched to its tile; an empty one is an opaque
/// black tile, and what no tile reaches is transparent.
/// @param cameras as many as the grid has tiles, of the output's pixel format
/// @return the first negative status; the output is then partly drawn.
[[nodiscard]] Ostrand::Status DrawMulticamGrid(const Kiln::DeviceRef& device,
                                               const std::vector<Marl::VideoFrameRef>& cameras,
                                               const Marl::VideoFrameRef& output, const MulticamLook& look,
                                               Vellum::RenderQuality quality);

}  // namespace Vantrel
