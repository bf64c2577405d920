// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/Effects/SplineTable.h"
#include "Src/Filters/Effects/ParameterReader.h"

/// A curve from its parameters. What it means: Vantrel/Effects/Curves.h.
namespace Vantrel {

/// Reads the points from the 32 parameters from `first` on and fits the spline through them. `solution` is written for
/// the points in use alone.
void ReadSplineTable(const ParameterReader& read, std::int32_t first, SplineTable& table);

}  // namespace Vantrel
