// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>

namespace Ostrand::Geometry {

/// Points of a spline.
constexpr std::size_t kLargestSpline = 64;

/// The natural cubic spline through points of rising x: the curve with continuous slope and bend that is a cubic
/// between neighbours and doesn't bend at its ends. Between neighbours i and j, with h = x_j - x_i, t = x - x_i and the
/// second derivatives m,
///
///     y = y_i + t ((y_j - y_i) / h - h (2 m_i + m_j) / 6 + t (m_i / 2 + t (m_j - m_i) / (6 h)))
///
/// A point that isn't to the right of all points before it takes no part, nor does one that isn't finite: whoever
/// evaluates the spline passes it over in the same way.
/// @param solution  `count` numbers are written: the second derivative at each point, 0 where one takes no part
/// @return did all points take part? False also without any, and for more than kLargestSpline, when nothing is written.
bool SolveNaturalCubicSpline2D(float* x, float* y, std::size_t count, float* solution);

}  // namespace Ostrand::Geometry
