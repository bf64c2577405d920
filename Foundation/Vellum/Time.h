// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <limits>

namespace Vellum {

/// Ticks a second: every frame and sample rate in use is a whole number of ticks.
constexpr std::int64_t kTicksPerSecond = 254016000000;

/// The end of time, 100 hours; also the sentinel for "no time".
constexpr std::int64_t kTime_Max = 91445760000000000;

/// A frame rate, held as the duration of a frame in ticks. A duration of 0 is the zero rate.
class FrameRate {
public:
    constexpr FrameRate() = default;
    [[nodiscard]] static constexpr FrameRate Create(std::int64_t ticksPerFrame) { return FrameRate(ticksPerFrame); }
    /// The exact duration for `numerator` / `denominator` frames a second, rounded half up where it isn't whole. The
    /// zero rate for a fraction that isn't positive, and for one whose frame is longer than 64 bits of ticks.
    [[nodiscard]] static constexpr FrameRate FromFraction(std::int64_t numerator, std::int64_t denominator) {
        __extension__ using Wide = __int128;
        if (numerator <= 0 || denominator <= 0) return {};
        const Wide twice = 2 * static_cast<Wide>(kTicksPerSecond) * denominator + numerator;
        const Wide ticks = twice / (2 * static_cast<Wide>(numerator));
        if (ticks > std::numeric_limits<std::int64_t>::max()) return {};
        return FrameRate(static_cast<std::int64_t>(ticks));
    }

    [[nodiscard]] constexpr std::int64_t GetTicksPerFrame() const { return mTicksPerFrame; }

    /// Makes frames `factor` times as long: half the rate for 2.
    constexpr FrameRate& operator*=(std::int64_t factor) {
        mTicksPerFrame *= factor;
        return *this;
    }
    /// The rate at which `factor` frames come where one came. Odd durations lose the half tick.
    [[nodiscard]] constexpr FrameRate Faster(std::int64_t factor) const { return FrameRate(mTicksPerFrame / factor); }

    friend constexpr bool operator==(FrameRate a, FrameRate b) { return a.mTicksPerFrame == b.mTicksPerFrame; }
    friend constexpr bool operator!=(FrameRate a, FrameRate b) { return !(a == b); }

private:
    constexpr explicit FrameRate(std::int64_t ticksPerFrame) : mTicksPerFrame(ticksPerFrame) {}

    std::int64_t mTicksPerFrame = 0;
};

constexpr FrameRate kFrameRate_Zero;

/// Half a frame in ticks: truncate(ticks * 0.5 + 0.5), so that odd durations round up.
[[nodiscard]] constexpr std::int64_t HalfFrameTicks(std::int64_t frameTicks) {
    // Halved last, which is exact: the same to the bit.
    return static_cast<std::int64_t>((static_cast<double>(frameTicks) + 1.0) * 0.5);
}

/// A time in ticks.
class TickTime {
public:
    constexpr explicit TickTime(std::int64_t ticks) : mTicks(ticks) {}
    /// The time of frame `count` at a rate.
    constexpr TickTime(std::int64_t count, FrameRate rate) : mTicks(count * rate.GetTicksPerFrame()) {}

    [[nodiscard]] constexpr std::int64_t GetTicks() const { return mTicks; }

    /// Moves the time back to the start of the frame that it lies in (floor, also below 0). The zero rate changes
    /// nothing.
    constexpr void AlignToFrame(FrameRate rate) {
        const std::int64_t frame = rate.GetTicksPerFrame();
        if (frame <= 0) return;
        const std::int64_t rest = mTicks % frame;
        mTicks -= rest < 0 ? rest + frame : rest;
    }

private:
    std::int64_t mTicks;
};

}  // namespace Vellum
