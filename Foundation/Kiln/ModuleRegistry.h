// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string_view>

#include "Kiln/Modules.h"

namespace Kiln {

/// The image of a key, or null. Any thread.
[[nodiscard]] const ModuleImage* FindModuleImage(std::string_view key);

/// Rises with every AddModules: a key that wasn't there may be there now.
[[nodiscard]] std::uint64_t GetModuleGeneration();

}  // namespace Kiln
