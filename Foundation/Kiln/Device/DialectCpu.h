// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// Dialect.h for the CPU driver. A module is compiled once for each instruction-set level (DIALECT_LEVEL: v2, v3, v4).
/// The kernel's body becomes a function that is inlined into the loops of KernelThunks.h, where the compiler vectorises
/// it.

#include "Kiln/Device/KernelThunks.h"

#ifndef CPU_LANES
#define CPU_LANES 32
#endif
#define LANES CPU_LANES

#define GLOBAL
#define DEVICE_FUNCTION static inline __attribute__((always_inline))
#define CONSTANT_TABLE static const

typedef unsigned char uchar;
typedef unsigned short ushort;
typedef unsigned int uint;
typedef unsigned long ulong;

#define Make4(x, y, z, w) (Float4{(x), (y), (z), (w)})

#define AsFloat(bits) __builtin_bit_cast(float, static_cast<int>(bits))
#define AsInt(value) __builtin_bit_cast(int, static_cast<float>(value))
#define Floor(x) __builtin_floorf(x)
#define Ceil(x) __builtin_ceilf(x)
#define Sqrt(x) __builtin_sqrtf(x)
#define Abs(x) __builtin_fabsf(x)

#define DIALECT_SYMBOL_OF(kind, level, name) softcuda_##kind##_##level##_##name
#define DIALECT_SYMBOL(kind, level, name) DIALECT_SYMBOL_OF(kind, level, name)
#define DIALECT_EXPORT extern "C" __attribute__((visibility("default")))

#define DIALECT_KERNEL(Thunk, Cell, laneCount, Name, ...)                                    \
    static inline void Name##Body(const Cell cell_, __VA_ARGS__);                            \
    DIALECT_EXPORT const SoftCuda::KernelRecord DIALECT_SYMBOL(kernel, DIALECT_LEVEL, Name); \
    constexpr SoftCuda::KernelRecord DIALECT_SYMBOL(kernel, DIALECT_LEVEL, Name) =           \
        Thunk<&Name##Body, laneCount>::MakeRecord(#Name);                                    \
    __attribute__((always_inline)) static inline void Name##Body([[maybe_unused]] const Cell cell_, __VA_ARGS__)

#define POINTWISE_KERNEL(Name, ...) DIALECT_KERNEL(PointwiseThunk, StripCell, 1, Name, __VA_ARGS__)
#define GATHER_KERNEL(Name, ...) DIALECT_KERNEL(RangeThunk, ThreadCell, LANES, Name, __VA_ARGS__)
#define THREAD_KERNEL(Name, ...) DIALECT_KERNEL(RangeThunk, ThreadCell, 1, Name, __VA_ARGS__)
#define THREAD_X (cell_.x)
#define THREAD_Y (cell_.y)

#define MODULE_GLOBAL(Type, name) \
    static Type name;             \
    DIALECT_GLOBAL_RECORD(name)
#define MODULE_GLOBAL_ARRAY(Type, name, count) \
    static Type name[count];                   \
    DIALECT_GLOBAL_RECORD(name)
#define DIALECT_GLOBAL_RECORD(name)                                                          \
    DIALECT_EXPORT const SoftCuda::GlobalRecord DIALECT_SYMBOL(global, DIALECT_LEVEL, name); \
    const SoftCuda::GlobalRecord DIALECT_SYMBOL(global, DIALECT_LEVEL, name) = {&name, sizeof(name)}
#define USE_GLOBAL(Type, pointer, argument, name) \
    (void)(argument);                             \
    const Type* const pointer = (const Type*)&name

// The arguments' fixed names are spoken although only GPU code needs them, so that a wrong one fails here as well.
#define DIALECT_FRAME_NAMES(frame, pitch) (void)(frame), (void)(pitch), (void)(format)
// Parameters named like a member of the cell would rename that as well.
#define POSITION(column, row)      \
    (void)(width), (void)(height); \
    [[maybe_unused]] const int column = cell_.x + cell_.lane, row = cell_.y
#define SOURCE_PIXEL(p)               \
    DIALECT_FRAME_NAMES(in, inPitch); \
    const Float4 p = LoadStrip(cell_.source, cell_.lane)
#define SECOND_PIXEL(p)                 \
    DIALECT_FRAME_NAMES(in2, in2Pitch); \
    const Float4 p = LoadStrip(cell_.second, cell_.lane)
#define THIRD_PIXEL(p)                  \
    DIALECT_FRAME_NAMES(in3, in3Pitch); \
    const Float4 p = LoadStrip(cell_.third, cell_.lane)
#define WORK_PIXEL(p)                  \
    DIALECT_FRAME_NAMES(frame, pitch); \
    const Float4 p = LoadStrip(cell_.work, cell_.lane)
#define STORE(value) (DIALECT_FRAME_NAMES(out, outPitch), StoreStrip(cell_.target, cell_.lane, value))
#define STORE_WORK(value) (DIALECT_FRAME_NAMES(frame, pitch), StoreStrip(cell_.target, cell_.lane, value))

#define LANE_POSITION_IN(column, row, lanes, itemsX, itemsY) \
    const int column = cell_.x, row = cell_.y;               \
    if (column >= (itemsX) || row >= (itemsY)) return;       \
    [[maybe_unused]] const int lanes = column + LANES <= (itemsX) ? LANES : (itemsX)-column
