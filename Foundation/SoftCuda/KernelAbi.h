// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// What a device module for the CPU looks like from outside: a shared object that exports, for each instruction-set
/// level and each kernel, one constant KernelRecord, and for each module global a GlobalRecord. The driver finds them
/// by name; nothing in a module runs when it is loaded.

#include <cstddef>
#include <cstdint>

namespace SoftCuda {

constexpr std::uint32_t kKernelAbi = 1;
constexpr int kLevelCount = 3;
/// Best last. Symbols are "softcuda_kernel_<level>_<kernel>" and "softcuda_global_<level>_<name>".
constexpr const char* kLevelNames[kLevelCount] = {"v2", "v3", "v4"};

/// What an argument means to the driver; the order of the frame roles is that of the pitches.
enum class Role : std::uint8_t {
    kPlain,
    kPointer,          ///< device memory that the kernel may read and write as it likes
    kConstantPointer,  ///< device memory that it only reads
    kFormat,           ///< 0: frames are of 16-bit floats, else of 32-bit floats
    kWidth,
    kHeight,
    kTarget,  ///< written, never read
    kSource,
    kSecond,
    kThird,
    kWork,  ///< read and written
    kTargetPitch,
    kSourcePitch,
    kSecondPitch,
    kThirdPitch,
    kWorkPitch
};

/// An argument's place in the packed parameters: aligned to its own size, as the driver API packs them.
struct ArgumentRecord {
    std::uint16_t offset;
    std::uint8_t size;
    Role role;
};

/// A strip is up to kStripPixels neighbouring pixels of a line, in four planes of floats (blue, green, red, alpha).
constexpr int kStripPixels = 256;
/// From plane to plane, in floats. Not the size of a plane: planes exactly 1 KB apart would meet in the same cache
/// sets.
constexpr int kPlaneStride = kStripPixels + 16;
constexpr int kStripFloats = 4 * kPlaneStride;
/// Strips are run in whole groups of this many pixels; those past the line's end are computed and dropped.
constexpr int kStripGroup = 16;

/// The strips of one call, each 64-byte aligned; null where the kernel has no such frame. None overlaps another.
struct StripCall {
    float* target;  ///< receives what the kernel stores, in its target or in its work frame
    const float* source;
    const float* second;
    const float* third;
    const float* work;
    int x, y;   ///< of the strip's first pixel
    int count;  ///< a multiple of kStripGroup
};

/// Threads [x0, x1) by [y0, y1) of a launch.
struct RangeCall {
    int x0, x1, y0, y1;
};

enum class KernelKind : std::uint32_t { kPointwise, kLanes, kThreads };

struct KernelRecord {
    std::uint32_t abi;
    KernelKind kind;
    const char* name;
    const ArgumentRecord* arguments;
    std::uint32_t argumentCount;
    std::uint32_t parameterBytes;  ///< up to the end of the last argument
    std::uint32_t lanes;           ///< items that one thread handles; x0 of a RangeCall is a multiple of it
    void (*runStrip)(const StripCall& call, const unsigned char* parameters);
    void (*runRange)(const RangeCall& call, const unsigned char* parameters);
};

struct GlobalRecord {
    void* address;
    std::size_t bytes;
};

}  // namespace SoftCuda
