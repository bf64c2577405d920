// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

enum TrackMatteParameter : std::int32_t { kTrackMatte_Track = 0, kTrackMatte_Using = 1, kTrackMatte_Reverse = 2 };

enum TrackMatteUsing : std::int32_t { kTrackMatteUsing_Alpha = 0, kTrackMatteUsing_Luma = 1 };

[[nodiscard]] inline const char* GetTrackMatteUsingName(std::int32_t choice) {
    constexpr const char* kNames[] = {"alpha", "luma"};
    return choice == kTrackMatteUsing_Alpha || choice == kTrackMatteUsing_Luma ? kNames[choice] : nullptr;
}

/// Shows the layer where another track's finished picture, with that track's own motion and opacity, lets it:
///
///     m = clamp(a)                                                        by alpha
///     m = clamp(0.2126 R + 0.7152 G + 0.0722 B) clamp(a)                  by luma (BT.709), over black
///     a' = a m,   reversed a (1 - m)
///
/// with clamp to 0..1; any choice but 0 is luma. Colour stays. A matte of another size is scaled onto the layer, m
/// interpolated between the centres of its pixels and going on beyond its border.
///
/// Without a chosen track the layer stays as it is. Where the track has no picture at a time, it counts as black: by
/// luma nothing shows, by luma reversed all; by alpha the layer stays as it is, reversed nothing shows.
inline constexpr ParameterRow kTrackMatteParameters[] = {
    {kTrackMatte_Track,
     "matte_track",
     ParameterType::kInt,
     "",
     0,
     1000,
     {0},
     nullptr,
     ParameterConversion::kAsIs,
     "the number of a video track, from 1; 0 for none"},
    {kTrackMatte_Using,
     "composite_using",
     ParameterType::kInt,
     "",
     0,
     1,
     {kTrackMatteUsing_Alpha},
     &GetTrackMatteUsingName},
    {kTrackMatte_Reverse, "reverse", ParameterType::kBool, "", 0, 1, {0}},
};
inline constexpr EffectRow kTrackMatteEffect =
    MakeEffectRow("TQ.XQVE Legacy Key Track Matte", "Track Matte",
                  "Shows a layer through the alpha or the luma of another track.", kTrackMatteParameters);

}  // namespace Vantrel
