// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <vector>

#include "Host/Software/Picture.h"
#include "Vellum/Geometry.h"

namespace Vantrel::Host::Software {

struct MulticamGrid {
    int width = 0;  ///< of the monitor's picture
    int height = 0;
    std::int32_t selected = 0;
    bool showProgram = false;
    bool recording = false;
    bool isNonMulticam = false;
    Vellum::RenderQuality quality = Vellum::RenderQuality::kHigh;
};

/// The multicam monitor: the angles' pictures, each stretched to its tile, in a square grid, row by row; a border
/// around the selected one, red while recording, else yellow; and with the programme shown, the grid on the left half
/// and the selected angle on the right. An empty picture, and a place without an angle, is a black tile; what no tile
/// reaches is transparent.
[[nodiscard]] Picture DrawMulticamGrid(const std::vector<Picture>& angles, const MulticamGrid& grid);

}  // namespace Vantrel::Host::Software
