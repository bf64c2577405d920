// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// Keeps what lies inside a polygon, for taking away what a key need not see. Corner i is parameter i, a point in
/// fractions of the picture at hand, and may lie outside of it; edges go from each corner to the next and from the last
/// to the first.
///
/// Inside is what the outline surrounds an odd number of times (the even-odd rule): concave outlines and such as cross
/// themselves are welcome. A pixel's alpha is multiplied by the exact area of it that lies inside; colour stays. So
/// pixels wholly inside keep their bits, also all of them when the polygon is the frame, as it is by default. An edge
/// with a corner that is no number, or 1e9 pixels or more away, doesn't count.
template <std::size_t kCount>
[[nodiscard]] constexpr std::array<ParameterRow, kCount> MakeGarbageMatteParameters() {
    constexpr const char* kNames[] = {"corner0",  "corner1",  "corner2",  "corner3", "corner4",  "corner5",
                                      "corner6",  "corner7",  "corner8",  "corner9", "corner10", "corner11",
                                      "corner12", "corner13", "corner14", "corner15"};
    constexpr std::size_t kPerSide = kCount / 4;
    std::array<ParameterRow, kCount> rows{};
    // Clockwise round the frame's edge from the top left.
    for (std::size_t i = 0; i < kCount; ++i) {
        const double along = static_cast<double>(i % kPerSide) / kPerSide;
        const double corners[4][2] = {{along, 0}, {1, along}, {1 - along, 1}, {0, 1 - along}};
        const double* corner = corners[i / kPerSide];
        rows[i] = {static_cast<std::int32_t>(i), kNames[i], ParameterType::kPoint, "of the frame", 0, 1,
                   {corner[0], corner[1]}};
    }
    return rows;
}

inline constexpr auto kGarbageMatteParameters = MakeGarbageMatteParameters<4>();
inline constexpr auto kGarbageMatte8Parameters = MakeGarbageMatteParameters<8>();
inline constexpr auto kGarbageMatte16Parameters = MakeGarbageMatteParameters<16>();
inline constexpr EffectRow kGarbageMatteEffect =
    MakeEffectRow("TQ.XQVE Garbage Matte", "Garbage Matte", "Keeps what lies inside a polygon of 4 corners.",
                  kGarbageMatteParameters);
inline constexpr EffectRow kGarbageMatte8Effect =
    MakeEffectRow("TQ.XQVE Garbage Matte 8", "Garbage Matte 8", "Keeps what lies inside a polygon of 8 corners.",
                  kGarbageMatte8Parameters);
inline constexpr EffectRow kGarbageMatte16Effect =
    MakeEffectRow("TQ.XQVE Garbage Matte 16", "Garbage Matte 16", "Keeps what lies inside a polygon of 16 corners.",
                  kGarbageMatte16Parameters);

}  // namespace Vantrel
