// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <cstddef>
#include <string>

namespace SoftCuda {

/// What the environment asks for. Read by cuInit while no context is alive.
struct Settings {
    int devices = 1;              ///< SOFTCUDA_DEVICES, 1 to 4
    std::size_t memoryBytes = 0;  ///< of each device: SOFTCUDA_MEMORY_MB, or its share of half the machine's memory
    int threads = 1;              ///< SOFTCUDA_THREADS, or the processors that this process may run on
    bool fusing = true;           ///< SOFTCUDA_FUSE
    unsigned failEvery = 0;       ///< SOFTCUDA_FAIL_EVERY
};

[[nodiscard]] Settings ReadSettings();

/// The best instruction-set level that the processor has, or less if SOFTCUDA_LEVEL says so; 0 is v2. Asked at each
/// module load.
[[nodiscard]] int ChooseLevel();

/// The figures behind SoftCudaGetCounters.
struct Counters {
    std::atomic<unsigned long long> launches{0};
    std::atomic<unsigned long long> pointwise{0};
    std::atomic<unsigned long long> passes{0};
    std::atomic<unsigned long long> fused{0};
    std::atomic<unsigned long long> timerFlushes{0};
    std::atomic<unsigned long long> refusedAllocations{0};
};
[[nodiscard]] Counters& GetCounters();

/// Why the last call on this thread failed, for messages; what a code alone can't say.
void SetMessage(std::string message);
[[nodiscard]] const char* GetMessage();

}  // namespace SoftCuda
