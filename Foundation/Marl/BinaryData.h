// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "Ostrand/Status.h"

namespace Marl {

using BinaryData = std::vector<std::uint8_t>;

/// Decodes base64 text (RFC 4648, padding demanded and its unused bits zero, no line breaks). On failure `out` is
/// emptied and kStatus_Failure comes back.
[[nodiscard]] Ostrand::Status DecodeBinaryDataFromUTF8String(const std::string& text, BinaryData& out);

/// The inverse.
[[nodiscard]] std::string EncodeBinaryDataToUTF8String(const BinaryData& data);

}  // namespace Marl
