// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "Host/Time/TimeMap.h"
#include "Vantrel/Effects/EffectRow.h"
#include "Vantrel/HostSuites.h"

namespace Vantrel::Host {

[[nodiscard]] const char* GetParameterTypeName(ParameterType type);

/// One, two (point) or four (colour) numbers; bools are 0 or 1.
using ParameterValue = std::array<double, 4>;

[[nodiscard]] int CountComponents(ParameterType type);

struct Keyframe {
    /// In a file's model the item's own time, in a description the host's parameter time.
    std::int64_t time = 0;
    ParameterValue value{};
    /// Rules up to the next key.
    Interpolation interpolation = Interpolation::kLinear;
    /// Bezier: the handle that leaves this key, and the one that reaches it; one for each component.
    std::array<Handle, 4> out{};
    std::array<Handle, 4> in{};
};

struct Parameter {
    std::int32_t index = 0;
    std::string name;
    ParameterType type = ParameterType::kDouble;
    /// Holds when there are no keys.
    ParameterValue value{};
    /// Sorted by time, no two at the same one.
    std::vector<Keyframe> keys;
    /// The name of a choice; null where the parameter isn't one.
    const char* (*choiceName)(std::int32_t choice) = nullptr;

    [[nodiscard]] bool IsAnimated() const { return keys.size() > 1; }
    /// The value at a time: constant before the first key and after the last; bools and whole numbers hold.
    [[nodiscard]] ParameterValue At(std::int64_t time) const;
    /// The number of the first key strictly later than `time`.
    [[nodiscard]] std::optional<std::int32_t> KeyAfter(std::int64_t time) const;
};

/// Writes type word and value. Whole numbers are rounded and limited to their range, colours become four words blue,
/// green, red, alpha of round(v * 65280).
void WriteRecord(ParameterType type, const ParameterValue& value, VantrelParamRecord& record);

}  // namespace Vantrel::Host
