// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <deque>
#include <optional>
#include <string>
#include <vector>

#include "Host/Timeline/Model.h"

/// Where the items of a track stand in time, and what they give up to transitions. Times count from the start of the
/// sequence; intervals are half open.
namespace Vantrel::Host {

/// An item with its whole extent on the track, also where a transition or the track's range hides a part of it.
struct PlacedItem {
    const Item* item = nullptr;
    std::int64_t start = 0;
    std::int64_t duration = 0;
    /// What the transitions at its ends add to it.
    std::int64_t head = 0;
    std::int64_t tail = 0;

    [[nodiscard]] std::int64_t End() const { return start + duration; }
};

/// A stretch in which a track shows one thing.
struct Placement {
    std::int64_t start = 0;
    std::int64_t end = 0;
    /// Time 0 of the thing: its start if nothing were hidden.
    std::int64_t anchor = 0;
    /// The item; null for a transition.
    const PlacedItem* item = nullptr;
    const Item* transition = nullptr;
    /// Null for what counts as blank.
    const PlacedItem* outgoing = nullptr;
    const PlacedItem* incoming = nullptr;
};

struct TrackLayout {
    TrackLayout() = default;
    // The placements point into the items.
    TrackLayout(const TrackLayout&) = delete;
    TrackLayout& operator=(const TrackLayout&) = delete;
    TrackLayout(TrackLayout&&) = default;
    TrackLayout& operator=(TrackLayout&&) = default;

    std::deque<PlacedItem> items;
    /// By rising time, without overlap.
    std::vector<Placement> placements;
    std::int64_t end = 0;
};

/// The trimmed range of an item in its own time.
[[nodiscard]] TimeRange TrimmedRange(const Item& item);

/// Whether a composition must be shown through a clip, because effects or time warps hang on it.
[[nodiscard]] bool CarriesEffects(const Item& item);

/// @param applyRange the track's source_range shifts and cuts it; not so inside a nested track
/// @param file       names the file in warnings
[[nodiscard]] TrackLayout LayOutTrack(const Item& track, bool applyRange, const std::string& file,
                                      std::vector<std::string>& warnings);

/// A track with one item at 0.
[[nodiscard]] TrackLayout LayOutSingle(const Item& item);

}  // namespace Vantrel::Host
