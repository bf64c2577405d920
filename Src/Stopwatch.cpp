// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Stopwatch.h"

#include <algorithm>
#include <cmath>

namespace Vantrel {

double Stopwatch::ReadSeconds() {
    constexpr double kBelievableDifference = 0.5;
    if (!mFrequencyKnown) {
        mFrequency = mClock->QueryPerformanceFrequency();
        mFrequencyKnown = true;
    }
    const std::uint32_t ticks = mClock->GetTickCount() - mStartTicks;
    const double byTicks = ticks / 1000.0;
    if (mFrequency <= 0) return byTicks;
    const double byCounter =
        static_cast<double>(mClock->QueryPerformanceCounter() - mStartCounter) / static_cast<double>(mFrequency);
    const bool believable = std::abs(byCounter - byTicks) <= kBelievableDifference;
    return std::max(0.0, believable ? byCounter : byTicks);
}

}  // namespace Vantrel
