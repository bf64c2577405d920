// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/PlatformClock.h"

namespace Vantrel {

/// Measures a span with two clocks, since a counter may jump, between processors or over a sleep: where the two
/// disagree by more than half a second, the coarse one is believed.
class Stopwatch {
public:
    /// Starts it.
    explicit Stopwatch(const PlatformClock& clock = PlatformClock::System())
        : mClock(&clock), mStartCounter(clock.QueryPerformanceCounter()), mStartTicks(clock.GetTickCount()) {}

    /// Seconds since the start, at least 0.
    [[nodiscard]] double ReadSeconds();

private:
    const PlatformClock* mClock;
    std::int64_t mStartCounter;
    std::uint32_t mStartTicks;
    std::int64_t mFrequency = 0;
    bool mFrequencyKnown = false;
};

}  // namespace Vantrel
