// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/PlatformClock.h"

#include <chrono>
#include <ctime>

namespace Vantrel {
namespace {

class SystemClock final : public PlatformClock {
public:
    std::int64_t QueryPerformanceCounter() const override {
        return std::chrono::steady_clock::now().time_since_epoch().count();
    }
    std::int64_t QueryPerformanceFrequency() const override {
        using Period = std::chrono::steady_clock::period;
        return Period::den / Period::num;
    }
    std::uint32_t GetTickCount() const override {
        timespec now{};
        clock_gettime(CLOCK_MONOTONIC_COARSE, &now);
        return static_cast<std::uint32_t>(std::int64_t{now.tv_sec} * 1000 + now.tv_nsec / 1000000);
    }
};

}  // namespace

const PlatformClock& PlatformClock::System() {
    static const SystemClock clock;
    return clock;
}

}  // namespace Vantrel
