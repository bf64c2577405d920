// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// Conversions between 16-bit and 32-bit floats, rounding to the nearest even: the processor's own where the code is
/// compiled for one that has them, else in integer arithmetic with the same results. All are inlined, so that code for
/// different instruction sets shares no symbol.

#include <cstdint>
#include <cstring>

namespace SoftCuda {

typedef float HalfVector4 __attribute__((vector_size(16)));

static inline __attribute__((always_inline)) float HalfToFloat(std::uint16_t half) {
    // Shifted into place the exponent is short by 112, which a multiplication makes good for subnormals as well.
    constexpr float kRebias = 0x1p112F;
    const std::uint32_t magnitude = static_cast<std::uint32_t>(half & 0x7FFFU) << 13;
    const float scaled = __builtin_bit_cast(float, magnitude) * kRebias;
    auto bits = __builtin_bit_cast(std::uint32_t, scaled);
    bits = magnitude >= 0x0F800000U ? (magnitude | 0x7F800000U) : bits;
    return __builtin_bit_cast(float, bits | (static_cast<std::uint32_t>(half & 0x8000U) << 16));
}

static inline __attribute__((always_inline)) std::uint16_t FloatToHalf(float value) {
    const auto bits = __builtin_bit_cast(std::uint32_t, value);
    const std::uint32_t sign = (bits >> 16) & 0x8000U;
    const std::uint32_t magnitude = bits & 0x7FFFFFFFU;
    // Adding one half aligns a subnormal's last place with the float's, so the addition does the rounding.
    const float aligned = __builtin_bit_cast(float, magnitude) + 0.5F;
    const std::uint32_t subnormal = __builtin_bit_cast(std::uint32_t, aligned) - 0x3F000000U;
    const std::uint32_t normal = (magnitude - 0x38000000U + 0xFFFU + ((magnitude >> 13) & 1U)) >> 13;
    const std::uint32_t special = magnitude > 0x7F800000U ? (0x7E00U | ((magnitude >> 13) & 0x3FFU)) : 0x7C00U;
    const std::uint32_t finite = magnitude < 0x38800000U ? subnormal : normal;
    return static_cast<std::uint16_t>(sign | (magnitude >= 0x477FF000U ? special : finite));
}

#ifdef __F16C__
typedef short HalfVector8i __attribute__((vector_size(16)));

static inline __attribute__((always_inline)) HalfVector4 LoadHalf4(const void* source) {
    long long bits;
    std::memcpy(&bits, source, sizeof bits);
    typedef long long Pair __attribute__((vector_size(16)));
    return __builtin_ia32_vcvtph2ps((HalfVector8i)Pair{bits, 0});
}

static inline __attribute__((always_inline)) void StoreHalf4(void* target, HalfVector4 value) {
    const HalfVector8i halves = __builtin_ia32_vcvtps2ph(value, 0);
    std::memcpy(target, &halves, 8);
}
#else
static inline __attribute__((always_inline)) HalfVector4 LoadHalf4(const void* source) {
    std::uint16_t halves[4];
    std::memcpy(halves, source, sizeof halves);
    return HalfVector4{HalfToFloat(halves[0]), HalfToFloat(halves[1]), HalfToFloat(halves[2]), HalfToFloat(halves[3])};
}

static inline __attribute__((always_inline)) void StoreHalf4(void* target, HalfVector4 value) {
    const std::uint16_t halves[4] = {FloatToHalf(value[0]), FloatToHalf(value[1]), FloatToHalf(value[2]),
                                     FloatToHalf(value[3])};
    std::memcpy(target, halves, sizeof halves);
}
#endif

}  // namespace SoftCuda
