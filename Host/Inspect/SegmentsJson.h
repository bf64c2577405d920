// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <functional>
#include <nlohmann/json.hpp>
#include <optional>

#include "Host/Snapshot/Snapshot.h"
#include "Vantrel/SegmentInfo.h"

namespace Vantrel::Host {

/// What the engine answers for a time of the top sequence; empty where it has nothing to say.
using VerdictLookup = std::function<std::optional<SegmentInfo>(std::int64_t time)>;

/// A sequence's size, pixel aspect, frame length in ticks and field type.
[[nodiscard]] nlohmann::ordered_json FormatToJson(const SequenceFormat& format);

/// Every sequence with its segments and trees, as they are told to the engine. Times are in ticks and in frames of
/// their sequence. A tree that stands twice in a segment is written once and then named by its hash.
/// @param verdict may be empty: the description alone needs no device
[[nodiscard]] nlohmann::ordered_json SegmentsToJson(const Snapshot& snapshot, const VerdictLookup& verdict);

}  // namespace Vantrel::Host
