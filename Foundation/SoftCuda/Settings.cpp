// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "SoftCuda/Settings.h"

#include <sched.h>
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>

#include "SoftCuda/KernelAbi.h"
#include "SoftCuda/PerThread.h"

namespace SoftCuda {

namespace {

long ReadNumber(const char* name, long fallback, long low, long high) {
    const char* text = std::getenv(name);
    if (text == nullptr || *text == '\0') return fallback;
    char* end = nullptr;
    const long value = std::strtol(text, &end, 10);
    return *end == '\0' ? std::clamp(value, low, high) : fallback;
}

int CountProcessors() {
    cpu_set_t set;
    if (sched_getaffinity(0, sizeof set, &set) != 0) return 1;
    return std::max(1, CPU_COUNT(&set));
}

bool HasLevel(int level) {
    __builtin_cpu_init();
    // The levels by name are unknown to some compilers. Processors with these have the rest of their level as well.
    const bool has3 = __builtin_cpu_supports("avx2") != 0 && __builtin_cpu_supports("fma") != 0 &&
                      __builtin_cpu_supports("bmi") != 0 && __builtin_cpu_supports("bmi2") != 0;
    const bool has4 = __builtin_cpu_supports("avx512f") != 0 && __builtin_cpu_supports("avx512bw") != 0 &&
                      __builtin_cpu_supports("avx512cd") != 0 && __builtin_cpu_supports("avx512dq") != 0 &&
                      __builtin_cpu_supports("avx512vl") != 0;
    return level == 0 || (has3 && (level == 1 || has4));
}

}  // namespace

Settings ReadSettings() {
    Settings settings;
    settings.devices = static_cast<int>(ReadNumber("SOFTCUDA_DEVICES", 1, 1, 4));
    const auto pages = static_cast<std::size_t>(std::max(0L, sysconf(_SC_PHYS_PAGES)));
    const auto machine = pages * static_cast<std::size_t>(sysconf(_SC_PAGESIZE));
    const auto share = machine / 2 / static_cast<std::size_t>(settings.devices);
    constexpr long kMegabyte = 1L << 20;
    settings.memoryBytes =
        static_cast<std::size_t>(ReadNumber("SOFTCUDA_MEMORY_MB", static_cast<long>(share) / kMegabyte, 1, 1L << 30)) *
        kMegabyte;
    settings.threads = static_cast<int>(ReadNumber("SOFTCUDA_THREADS", CountProcessors(), 1, 256));
    settings.fusing = ReadNumber("SOFTCUDA_FUSE", 1, 0, 1) != 0;
    settings.failEvery = static_cast<unsigned>(ReadNumber("SOFTCUDA_FAIL_EVERY", 0, 0, 1L << 30));
    return settings;
}

int ChooseLevel() {
    int wanted = kLevelCount - 1;
    if (const char* text = std::getenv("SOFTCUDA_LEVEL")) {
        for (int level = 0; level < kLevelCount; ++level)
            if (std::strcmp(text, kLevelNames[level]) == 0) wanted = level;
    }
    while (wanted > 0 && !HasLevel(wanted)) --wanted;
    return wanted;
}

Counters& GetCounters() {
    static Counters counters;
    return counters;
}

void SetMessage(std::string message) { GetPerThread<std::string>() = std::move(message); }
const char* GetMessage() { return GetPerThread<std::string>().c_str(); }

}  // namespace SoftCuda
