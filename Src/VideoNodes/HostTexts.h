// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>

#include "Halden/Guid.h"

namespace Vantrel {

/// Room for the texts that the host writes.
using HostHashText = std::array<char, 40>;
using HostKindText = std::array<char, 272>;

/// The text up to its terminator; the last byte counts as one, whatever the host wrote.
template <std::size_t N>
[[nodiscard]] std::string ToString(const std::array<char, N>& text) {
    std::size_t length = 0;
    while (length + 1 < N && text[length] != 0) ++length;
    return std::string(text.data(), length);
}

[[nodiscard]] inline Halden::utility::Guid ToGuid(const HostHashText& text) {
    return Halden::utility::Guid(ToString(text));
}

}  // namespace Vantrel
