// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

namespace Vantrel::Host {

/// A frame's number as "HH:MM:SS:FF". Frames are counted without drops: at 30000/1001 frames a second an hour of
/// timecode is longer than an hour.
[[nodiscard]] std::string TimecodeOf(std::int64_t frame, std::int64_t ticksPerFrame);

}  // namespace Vantrel::Host
