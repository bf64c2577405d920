// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Halden/Guid.h"

namespace Brae {

/// An identifier as the host's caches take it: its text and a terminator.
struct PluginID {
    char text[37] = {};
};

[[nodiscard]] PluginID GuidToPluginID(const Halden::utility::Guid& guid);

/// The host's field type (0 progressive, 1 upper first, 2 lower first, 3 any, 4 separate fields) as Vellum's. The
/// numbers agree; anything else becomes Vellum::kFieldType_Unknown.
[[nodiscard]] std::uint32_t SDKToBEFieldType(std::uint32_t fieldType);

/// The host's alpha type (0 none, 1 straight, 2 premultiplied) with 0 kept as it is: a reader decides what no alpha
/// means to it. Anything else becomes Vellum::kAlphaType_Straight.
[[nodiscard]] std::uint32_t SDKToBEAlphaType(std::int32_t alphaType);

/// The host's pulldown cadence; 0 is none, 1 to 5 the phases of 2:3, 6 to 10 those of 2:3:3:2. Anything else becomes 0.
[[nodiscard]] std::uint32_t SDKToVellumPulldownCadence(std::int32_t cadence);

}  // namespace Brae
