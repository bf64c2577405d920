// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace SoftCuda {

/// How strips come from frames and go back to them; one set for each instruction-set level. `planes` is a strip as
/// KernelAbi.h describes it, `pixels` a frame's first pixel of it.
struct StripIo {
    using Load = void (*)(float* planes, const std::uint8_t* pixels, int count);
    using Store = void (*)(std::uint8_t* pixels, const float* planes, int count);

    Load load[2];                             ///< by format flag: 16-bit, 32-bit
    Store store[2];                           ///< through the caches
    Store storeFresh[2];                      ///< past them, for frames that weren't read; ends with EndStores
    void (*round)(float* planes, int count);  ///< to what a 16-bit frame would hold
};

/// @param level index into kLevelNames, of a level that the processor has.
[[nodiscard]] const StripIo& GetStripIo(int level);

/// Makes what storeFresh wrote visible to other threads.
void EndStores();

}  // namespace SoftCuda
