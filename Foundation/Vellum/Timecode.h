// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

#include "Vellum/Time.h"

namespace Vellum {

/// How a time is written.
enum TimeDisplay : std::int32_t {
    kTimeDisplay_25 = 101,
    kTimeDisplay_2997Drop = 102,
    kTimeDisplay_2997 = 103,
    kTimeDisplay_30 = 104,
    kTimeDisplay_50 = 105,
    kTimeDisplay_5994Drop = 106,
    kTimeDisplay_5994 = 107,
    kTimeDisplay_Frames = 109,
    kTimeDisplay_23976 = 110,
    kTimeDisplay_Film16 = 111,  ///< feet and frames of 16 mm film, 40 to a foot
    kTimeDisplay_Film35 = 112   ///< of 35 mm film with four perforations a frame, 16 to a foot
};

/// The rate that a display counts by; displays without one of their own, and unknown ones, keep `rate`.
[[nodiscard]] FrameRate GetFrameRateForTimeDisplay(std::int32_t display, FrameRate rate);

/// Whole frames from 0 to a time, towards 0. 0 at the zero rate.
[[nodiscard]] std::int64_t ToFrame64(TickTime time, FrameRate rate);

/// The text of a time at a rate:
/// - "01:23:45:12", counted by the whole number of frames nearest to the rate (at least 1); hours go on beyond 24.
/// - "01:23:45;12" for displays that drop: numbers ;00 and ;01 (at 59.94 to ;03) are left out in each minute but each
///   tenth, so that the text keeps to the clock (SMPTE ST 12-1).
/// - "1234" frames; "12+05" feet and frames.
/// A minus sign goes before times below 0.
[[nodiscard]] std::string TimeToTimecode(TickTime time, FrameRate rate, std::int32_t display);

}  // namespace Vellum
