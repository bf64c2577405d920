// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <set>

namespace Vantrel {

/// The media subtypes that play natively in a sequence of a native subtype. Four-character codes, first character in
/// the highest byte.
[[nodiscard]] std::set<std::uint32_t> GetNativeSubTypes(std::uint32_t nativeSubType);

/// The media subtypes that always need the host.
[[nodiscard]] std::set<std::uint32_t> GetHostSubTypes();

}  // namespace Vantrel
