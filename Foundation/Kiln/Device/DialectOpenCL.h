// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// Dialect.h for OpenCL C 1.2. On a device that is a CPU the program is built with -D OPENCL_LANES=16; the default of 1
/// is put before this text.

#pragma OPENCL FP_CONTRACT ON

#define LANES OPENCL_LANES

#define GLOBAL __global
// A loop with a call in it, of a function too long to be inlined by itself, becomes no vector code.
#define DEVICE_FUNCTION static inline __attribute__((always_inline))
#define CONSTANT_TABLE __constant

typedef float4 Float4;
#define Make4(x, y, z, w) ((float4)((x), (y), (z), (w)))

typedef __global const uchar* SourceFrame;
typedef __global const uchar* SecondFrame;
typedef __global const uchar* ThirdFrame;
typedef __global uchar* TargetFrame;
typedef __global uchar* WorkFrame;
typedef __global const uchar* AnyFrame;
typedef int FormatFlag, Width, Height, TargetPitch, SourcePitch, SecondPitch, ThirdPitch, WorkPitch;

#define AsFloat(bits) as_float(bits)
#define AsInt(value) as_int(value)
#define Floor(x) floor(x)
#define Ceil(x) ceil(x)
#define Sqrt(x) sqrt(x)
#define Abs(x) fabs(x)

#define POINTWISE_KERNEL(Name, ...) __kernel void Name(__VA_ARGS__)
#define GATHER_KERNEL(Name, ...) __kernel void Name(__VA_ARGS__)
#define THREAD_KERNEL(Name, ...) __kernel void Name(__VA_ARGS__)
#define THREAD_X ((int)get_global_id(0))
#define THREAD_Y ((int)get_global_id(1))

#define MODULE_GLOBAL(Type, name)
#define MODULE_GLOBAL_ARRAY(Type, name, count)
#define USE_GLOBAL(Type, pointer, argument, name) __global const Type* const pointer = argument

DEVICE_FUNCTION Float4 LoadPixel(AnyFrame frame, int format, int index) {
    if (format == 0) return vload_half4((size_t)index, (__global const half*)frame);
    return ((__global const float4*)frame)[index];
}

DEVICE_FUNCTION void StorePixel(TargetFrame frame, int format, int index, Float4 value) {
    if (format == 0)
        vstore_half4(value, (size_t)index, (__global half*)frame);
    else
        ((__global float4*)frame)[index] = value;
}

#if defined(PIXEL_PER_THREAD)
#include "Kiln/Device/ThreadPixels.h"
#else
#include "Kiln/Device/LanePixels.h"
#endif
