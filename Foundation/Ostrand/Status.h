// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace Ostrand {

/// What operations return: negative is failure, 0 success.
using Status = std::int32_t;

constexpr Status kStatus_OK = 0;
/// A frame, input, host answer or description that the operation needs is not there.
constexpr Status kStatus_Failure = static_cast<Status>(0xA00F0001);
/// Device memory refused; the one failure that is answered by a release of memory and a second try.
constexpr Status kStatus_OutOfMemory = static_cast<Status>(0xA00F0006);
/// QueryInterface: no such interface.
constexpr Status kStatus_NoInterface = static_cast<Status>(0xA00A0001);

[[nodiscard]] constexpr bool Failed(Status status) { return status < 0; }

}  // namespace Ostrand
