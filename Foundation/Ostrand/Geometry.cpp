// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Ostrand/Geometry.h"

#include <array>
#include <cmath>

namespace Ostrand::Geometry {

bool SolveNaturalCubicSpline2D(float* x, float* y, std::size_t count, float* solution) {
    if (count == 0 || count > kLargestSpline) return false;
    std::array<std::size_t, kLargestSpline> points{};
    std::size_t used = 0;
    for (std::size_t i = 0; i < count; ++i) {
        solution[i] = 0.0F;
        const bool finite = std::isfinite(x[i]) && std::isfinite(y[i]);
        if (finite && (used == 0 || x[i] > x[points[used - 1]])) points[used++] = i;
    }

    // One equation for each inner point: h_l m_l + 2 (h_l + h_r) m + h_r m_r = 6 (slope_r - slope_l). Its diagonal
    // outweighs the rest, so that elimination needs no pivots.
    const auto width = [&](std::size_t i) { return static_cast<double>(x[points[i + 1]]) - x[points[i]]; };
    const auto slope = [&](std::size_t i) { return (static_cast<double>(y[points[i + 1]]) - y[points[i]]) / width(i); };
    std::array<double, kLargestSpline> share{};
    std::array<double, kLargestSpline> bend{};
    for (std::size_t i = 1; i + 1 < used; ++i) {
        const double left = width(i - 1), right = width(i);
        const double pivot = 2.0 * (left + right) - left * share[i - 1];
        share[i] = right / pivot;
        bend[i] = (6.0 * (slope(i) - slope(i - 1)) - left * bend[i - 1]) / pivot;
    }
    for (std::size_t i = used; i-- > 2;) {
        bend[i - 1] -= share[i - 1] * bend[i];
        solution[points[i - 1]] = static_cast<float>(bend[i - 1]);
    }
    return used == count;
}

}  // namespace Ostrand::Geometry
