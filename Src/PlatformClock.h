// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace Vantrel {

/// The two clocks of the platform, under the names by which they are commonly known.
class PlatformClock {
public:
    virtual ~PlatformClock() = default;
    /// Of high resolution, and monotonic.
    [[nodiscard]] virtual std::int64_t QueryPerformanceCounter() const = 0;
    /// Counts a second; 0 or below when there is no such counter.
    [[nodiscard]] virtual std::int64_t QueryPerformanceFrequency() const = 0;
    /// Coarse milliseconds, which wrap around.
    [[nodiscard]] virtual std::uint32_t GetTickCount() const = 0;

    [[nodiscard]] static const PlatformClock& System();
};

}  // namespace Vantrel
