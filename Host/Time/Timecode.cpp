// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Time/Timecode.h"

#include <cmath>
#include <cstdio>

#include "Vellum/Time.h"

namespace Vantrel::Host {

std::string TimecodeOf(std::int64_t frame, std::int64_t ticksPerFrame) {
    const auto rate = static_cast<std::int64_t>(
        std::llround(static_cast<double>(Vellum::kTicksPerSecond) / static_cast<double>(ticksPerFrame)));
    char text[48];
    (void)std::snprintf(text, sizeof text, "%02lld:%02lld:%02lld:%02lld", static_cast<long long>(frame / rate / 3600),
                        static_cast<long long>(frame / rate / 60 % 60), static_cast<long long>(frame / rate % 60),
                        static_cast<long long>(frame % rate));
    return text;
}

}  // namespace Vantrel::Host
