// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "Host/Timeline/Parameters.h"

namespace Vantrel::Host {

inline constexpr const char* kMotionMatchName = "TQ.XQVE Motion";
inline constexpr const char* kOpacityMatchName = "TQ.XQVE Opacity";

/// What an effect reads: its parameters by index, without a gap, each with the value at which it leaves the picture
/// alone.
struct EffectTable {
    std::string matchName;
    std::vector<Parameter> parameters;
    /// The picture changes with time though no parameter does.
    bool timeDependent = false;

    /// By name, or by index in decimal; null if there is none.
    [[nodiscard]] const Parameter* Find(const std::string& nameOrIndex) const;
};

/// Null for effects that aren't known here: theirs come from the file alone.
[[nodiscard]] const EffectTable* FindEffectTable(const std::string& matchName);

/// All tables, for listings and tests.
[[nodiscard]] const std::vector<EffectTable>& GetEffectTables();

}  // namespace Vantrel::Host
