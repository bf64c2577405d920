// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// Dialect.h for CUDA C++: nvcc, NVRTC, or clang without the vendor's headers.

#define LANES 1

#if defined(__clang__) && !defined(__NVCC__)
#define __global__ __attribute__((global))
#define __device__ __attribute__((device))
#define __constant__ __attribute__((constant))
#define __forceinline__ __attribute__((always_inline))
struct __attribute__((aligned(16))) float4 {
    float x, y, z, w;
};
struct __attribute__((aligned(8))) uint2 {
    unsigned x, y;
};
#define AsFloat(bits) __builtin_bit_cast(float, (int)(bits))
#define AsInt(value) __builtin_bit_cast(int, (float)(value))
#define Floor(x) __nvvm_floor_f(x)
#define Ceil(x) __nvvm_ceil_f(x)
#define Sqrt(x) __nvvm_sqrt_rn_f(x)
#define Abs(x) __nvvm_fabs_f(x)
#define DIALECT_INDEX(axis) \
    (int)(__nvvm_read_ptx_sreg_ctaid_##axis() * __nvvm_read_ptx_sreg_ntid_##axis() + __nvvm_read_ptx_sreg_tid_##axis())
#define THREAD_X DIALECT_INDEX(x)
#define THREAD_Y DIALECT_INDEX(y)
#else
#define AsFloat(bits) __int_as_float(bits)
#define AsInt(value) __float_as_int(value)
#define Floor(x) floorf(x)
#define Ceil(x) ceilf(x)
#define Sqrt(x) sqrtf(x)
#define Abs(x) fabsf(x)
#define THREAD_X ((int)(blockIdx.x * blockDim.x + threadIdx.x))
#define THREAD_Y ((int)(blockIdx.y * blockDim.y + threadIdx.y))
#endif

#define GLOBAL
#define DEVICE_FUNCTION static __device__ __forceinline__
#define CONSTANT_TABLE static __constant__ const

typedef unsigned char uchar;
typedef unsigned short ushort;
typedef unsigned int uint;
typedef unsigned long ulong;
typedef float4 Float4;

DEVICE_FUNCTION Float4 Make4(float x, float y, float z, float w) {
    Float4 made;
    made.x = x;
    made.y = y;
    made.z = z;
    made.w = w;
    return made;
}

typedef const uchar* SourceFrame;
typedef const uchar* SecondFrame;
typedef const uchar* ThirdFrame;
typedef uchar* TargetFrame;
typedef uchar* WorkFrame;
typedef const uchar* AnyFrame;
typedef int FormatFlag, Width, Height, TargetPitch, SourcePitch, SecondPitch, ThirdPitch, WorkPitch;

#define POINTWISE_KERNEL(Name, ...) extern "C" __global__ void Name(__VA_ARGS__)
#define GATHER_KERNEL(Name, ...) extern "C" __global__ void Name(__VA_ARGS__)
#define THREAD_KERNEL(Name, ...) extern "C" __global__ void Name(__VA_ARGS__)

#define MODULE_GLOBAL(Type, name) \
    extern "C" {                  \
    __constant__ Type name;       \
    }
#define MODULE_GLOBAL_ARRAY(Type, name, count) \
    extern "C" {                               \
    __constant__ Type name[count];             \
    }
#define USE_GLOBAL(Type, pointer, argument, name) \
    (void)(argument);                             \
    const Type* const pointer = (const Type*)&name

// The conversions are written in PTX because the vendor's header for halves isn't there under NVRTC and clang.
DEVICE_FUNCTION float DialectHalfToFloat(uint bits) {
    float value;
    asm("{ .reg .b16 h; cvt.u16.u32 h, %1; cvt.f32.f16 %0, h; }" : "=f"(value) : "r"(bits));
    return value;
}

DEVICE_FUNCTION uint DialectFloatToHalf(float value) {
    uint bits;
    asm("{ .reg .b16 h; cvt.rn.f16.f32 h, %1; cvt.u32.u16 %0, h; }" : "=r"(bits) : "f"(value));
    return bits;
}

DEVICE_FUNCTION Float4 LoadPixel(AnyFrame frame, int format, int index) {
    if (format != 0) return ((const Float4*)frame)[index];
    const uint2 bits = ((const uint2*)frame)[index];
    return Make4(DialectHalfToFloat(bits.x & 0xFFFFu), DialectHalfToFloat(bits.x >> 16),
                 DialectHalfToFloat(bits.y & 0xFFFFu), DialectHalfToFloat(bits.y >> 16));
}

DEVICE_FUNCTION void StorePixel(TargetFrame frame, int format, int index, Float4 value) {
    if (format != 0) {
        ((Float4*)frame)[index] = value;
        return;
    }
    uint2 bits;
    bits.x = DialectFloatToHalf(value.x) | (DialectFloatToHalf(value.y) << 16);
    bits.y = DialectFloatToHalf(value.z) | (DialectFloatToHalf(value.w) << 16);
    ((uint2*)frame)[index] = bits;
}

#include "Kiln/Device/ThreadPixels.h"
