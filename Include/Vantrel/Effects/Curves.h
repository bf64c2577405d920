// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/CorrectorParameters.h"

/// The luma curve and the RGB curves. A curve is given by up to 16 points, x the level that goes in and y the level
/// that comes out, both 0 to 255 for 0.0 to 1.0, without their fractions and wrapped to 8 bits. The points up to the
/// last one that isn't (0, 0) count, each that lies to the right of all points before it; the others take no part, so
/// that points out of order or doubled do no harm.
///
/// Between the first and the last point the curve is the natural cubic spline through them (de Boor, "A Practical Guide
/// to Splines", IV), in terms of what it adds: with y_i - x_i at each point and the second derivatives m, for x between
/// the neighbours i and j, h = x_j - x_i and t = x - x_i,
///
///     curve(x) = x + d_i + t ((d_j - d_i) / h - h (2 m_i + m_j) / 6 + t (m_i / 2 + t (m_j - m_i) / (6 h)))
///     d_k = y_k - x_k
///
/// Beyond its ends it adds what it adds there: levels below the first point and above the last one keep their
/// distances, so that super-whites and negative levels stay apart. A straight diagonal, and a curve without points,
/// changes nothing.
///
/// - The luma curve changes luma (BT.709) and keeps the colour differences: c' = c + curve(Y) - Y.
/// - The RGB curves are the master for all channels and then one for each: c' = curve_c(master(c)).
///
/// Alpha stays.
namespace Vantrel {

inline constexpr std::size_t kCurvePoints = 16;
using CurvePointNames = std::array<const char*, 2 * kCurvePoints>;

/// A curve's points from `first` on, a straight diagonal.
[[nodiscard]] constexpr std::array<ParameterRow, 2 * kCurvePoints> CurveParameters(std::int32_t first,
                                                                                   const CurvePointNames& names) {
    std::array<ParameterRow, 2 * kCurvePoints> rows{};
    for (std::size_t i = 0; i < rows.size(); ++i) {
        rows[i] = LevelParameter(first + static_cast<std::int32_t>(i), names[i], i / 2 == 1 ? 255 : 0,
                                 i % 2 == 0 ? "level in" : "level out");
    }
    return rows;
}

[[nodiscard]] inline const char* GetCurveOutputName(std::int32_t output) {
    return output == kCorrectorOutput_TonalRange ? nullptr : GetCorrectorOutputName(output);
}

/// What a curve effect shows; there are no tonal ranges to look at.
[[nodiscard]] constexpr ParameterRow CurveOutputParameter() {
    ParameterRow row = CorrectorOutputParameter();
    row.choiceName = &GetCurveOutputName;
    return row;
}

#define VANTREL_POINT_NAMES(set, i) set "x" i, set "y" i
#define VANTREL_CURVE_NAMES(set)                                                                            \
    {                                                                                                       \
        VANTREL_POINT_NAMES(set, "0"), VANTREL_POINT_NAMES(set, "1"), VANTREL_POINT_NAMES(set, "2"),        \
            VANTREL_POINT_NAMES(set, "3"), VANTREL_POINT_NAMES(set, "4"), VANTREL_POINT_NAMES(set, "5"),    \
            VANTREL_POINT_NAMES(set, "6"), VANTREL_POINT_NAMES(set, "7"), VANTREL_POINT_NAMES(set, "8"),    \
            VANTREL_POINT_NAMES(set, "9"), VANTREL_POINT_NAMES(set, "10"), VANTREL_POINT_NAMES(set, "11"),  \
            VANTREL_POINT_NAMES(set, "12"), VANTREL_POINT_NAMES(set, "13"), VANTREL_POINT_NAMES(set, "14"), \
            VANTREL_POINT_NAMES(set, "15")                                                                  \
    }

inline constexpr auto kLumaCurveParameters =
    JoinParameters(std::array<ParameterRow, 1>{CurveOutputParameter()}, SplitViewParameters(1),
                   CurveParameters(5, VANTREL_CURVE_NAMES("")), std::array<ParameterRow, 1>{ShowMaskParameter(40)},
                   SelectionParameters(45));

inline constexpr auto kRGBCurvesParameters = JoinParameters(
    std::array<ParameterRow, 1>{CurveOutputParameter()}, SplitViewParameters(1),
    CurveParameters(5, VANTREL_CURVE_NAMES("master_")), CurveParameters(37, VANTREL_CURVE_NAMES("red_")),
    CurveParameters(69, VANTREL_CURVE_NAMES("green_")), CurveParameters(101, VANTREL_CURVE_NAMES("blue_")),
    std::array<ParameterRow, 1>{ShowMaskParameter(136)}, SelectionParameters(141));
#undef VANTREL_CURVE_NAMES
#undef VANTREL_POINT_NAMES

inline constexpr EffectRow kLumaCurveEffect =
    MakeEffectRow("TQ.XQVE Luma Curve", "Luma Curve", "Puts luma through a curve of up to 16 points, colour kept.",
                  kLumaCurveParameters);

inline constexpr EffectRow kRGBCurvesEffect =
    MakeEffectRow("TQ.XQVE RGB Curves", "RGB Curves",
                  "Puts all colours and each one through curves of up to 16 points.", kRGBCurvesParameters);

}  // namespace Vantrel
