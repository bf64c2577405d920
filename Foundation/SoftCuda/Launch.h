// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstdint>

#include "SoftCuda/DriverApi.h"
#include "SoftCuda/KernelAbi.h"

namespace SoftCuda {

constexpr std::size_t kMaxParameterBytes = 1024;

/// Frame arguments in the order of their roles, kTarget to kWork.
constexpr int kFrameRoles = 5;
constexpr int kTargetFrame = 0;
constexpr int kWorkFrame = 4;

/// Bytes from begin to before end.
struct AddressRange {
    std::uintptr_t begin = 0;
    std::uintptr_t end = 0;

    [[nodiscard]] bool Overlaps(const AddressRange& other) const { return begin < other.end && other.begin < end; }
};

struct FrameUse {
    std::uint8_t* base = nullptr;  ///< null: the kernel has no such frame
    int pitch = 0;                 ///< in pixels

    friend bool operator==(const FrameUse& a, const FrameUse& b) { return a.base == b.base && a.pitch == b.pitch; }
};

/// A kernel, its arguments as they were at the call, and the threads asked for.
struct Launch {
    const KernelRecord* kernel = nullptr;
    int level = 0;
    AddressRange module;  ///< where the kernel's module lies, its globals included
    int threadsX = 0;
    int threadsY = 0;
    alignas(16) std::array<unsigned char, kMaxParameterBytes> parameters;

    // What the roles say; filled by ReadRoles.
    int format = 1;  ///< 0 for 16-bit, 1 for 32-bit floats
    int width = -1;  ///< of the threads that do something, -1 when no argument tells
    int height = -1;
    std::array<FrameUse, kFrameRoles> frames;

    [[nodiscard]] bool IsPointwise() const { return kernel->kind == KernelKind::kPointwise; }
    [[nodiscard]] std::size_t GetBytesPerPixel() const { return format == 0 ? 8 : 16; }
    /// What a frame covers, from its first to behind its last pixel.
    [[nodiscard]] std::size_t GetFrameBytes(const FrameUse& frame) const;
};

/// Works out the roles of the arguments and checks that the frames lie within live memory. On failure the message says
/// which argument.
CUresult ReadRoles(Launch& launch);

/// Runs a gather or thread kernel on the pool.
void RunRange(const Launch& launch);

}  // namespace SoftCuda
