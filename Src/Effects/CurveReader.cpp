// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Effects/CurveReader.h"

#include <cstddef>

#include "Ostrand/Geometry.h"

namespace Vantrel {
namespace {

static_assert(sizeof(SplineTable) == 200 && offsetof(SplineTable, solution) == 128 &&
                  offsetof(SplineTable, count) == 192,
              "the record is copied byte for byte");

/// An 8-bit level as it would be stored: without its fraction, and wrapped.
float ReadLevel(const ParameterReader& read, std::int32_t index) {
    constexpr double kRange = 9.2e18;  // beyond it there is no 64-bit integer to take bits from
    const double value = read.GetEffect().GetDoubleParam(index, read.GetTime());
    if (!(value > -kRange && value < kRange)) return 0.0F;
    return static_cast<float>(static_cast<std::int64_t>(value) & 0xFF) / 255.0F;
}

}  // namespace

void ReadSplineTable(const ParameterReader& read, std::int32_t first, SplineTable& table) {
    table.count = 0;
    for (std::int32_t i = 0; i < SPLINE_POINTS; ++i) {
        const float x = table.x[i] = ReadLevel(read, first + 2 * i);
        const float y = table.y[i] = ReadLevel(read, first + 2 * i + 1);
        if (x != 0.0F || y != 0.0F) table.count = static_cast<unsigned long>(i) + 1;
    }
    Ostrand::Geometry::SolveNaturalCubicSpline2D(table.x, table.y, table.count, table.solution);
}

}  // namespace Vantrel
