// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <vector>

#include "Host/Software/LayerPicture.h"
#include "Host/Timeline/Model.h"

namespace Vantrel::Host::Software {

/// The multicam monitor: the angles' pictures in a square grid, row by row, a border around the selected one, and with
/// the programme shown, the grid on the left half and the selected angle on the right. An empty picture is a black
/// tile.
[[nodiscard]] Picture DrawMulticamGrid(const std::vector<Picture>& angles, const Multicam& options, const View& view);

}  // namespace Vantrel::Host::Software
