// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Host/Time/ExactTime.h"
#include "Host/Timeline/JsonCursor.h"
#include "Host/Timeline/Model.h"

/// The parts of the reader, one for each kind of object below an item.
namespace Vantrel::Host {

struct RationalTime {
    std::int64_t ticks = 0;
    Rate rate;
};
[[nodiscard]] RationalTime ReadTime(const JsonCursor& at);

struct ReadRange {
    TimeRange range;
    std::int64_t frameTicks = 0;
};
[[nodiscard]] ReadRange ReadTimeRange(const JsonCursor& at);

/// The `vantrel` object in an item's metadata, if there is one.
[[nodiscard]] std::optional<JsonCursor> FindOwnMetadata(const JsonCursor& object);

/// Effects and time warps of an item, and what its metadata says.
void ReadEffects(const JsonCursor& object, Item& item);
void ReadItemOptions(const JsonCursor& object, Item& item);
[[nodiscard]] SequenceSettings ReadSequenceSettings(const JsonCursor& at);
/// `params` of an effect or transition, over the table of its match name if there is one.
[[nodiscard]] std::vector<Parameter> ReadParameters(const std::string& matchName,
                                                    const std::optional<JsonCursor>& params);
void ReadTransition(const JsonCursor& object, Item& item);

/// @param directory of the timeline file, for relative paths
[[nodiscard]] MediaReference ReadMediaReference(const JsonCursor& at, const std::string& directory);

}  // namespace Vantrel::Host
