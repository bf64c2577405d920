// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

// Compiled once for each instruction-set level; STRIP_LEVEL names the function that it defines. Nothing in this file
// may be a symbol that another level's copy shares.

#include <immintrin.h>

#include "SoftCuda/Half.h"
#include "SoftCuda/KernelAbi.h"
#include "SoftCuda/StripIo.h"

namespace SoftCuda {

namespace {

constexpr std::ptrdiff_t kPlane = kPlaneStride;
constexpr std::ptrdiff_t kHalfPixel = 8;
constexpr std::ptrdiff_t kFloatPixel = 16;

void PutPixel(float* planes, int i, HalfVector4 pixel) {
    for (int plane = 0; plane < 4; ++plane) planes[plane * kPlane + i] = pixel[plane];
}

HalfVector4 GetPixel(const float* planes, int i) {
    return HalfVector4{planes[i], planes[kPlane + i], planes[2 * kPlane + i], planes[3 * kPlane + i]};
}

void LoadFloatTail(float* planes, const std::uint8_t* pixels, int first, int count) {
    for (int i = first; i < count; ++i) {
        HalfVector4 pixel;
        std::memcpy(&pixel, pixels + i * kFloatPixel, sizeof pixel);
        PutPixel(planes, i, pixel);
    }
}

void StoreFloatTail(std::uint8_t* pixels, const float* planes, int first, int count) {
    for (int i = first; i < count; ++i) {
        const HalfVector4 pixel = GetPixel(planes, i);
        std::memcpy(pixels + i * kFloatPixel, &pixel, sizeof pixel);
    }
}

void LoadHalfTail(float* planes, const std::uint8_t* pixels, int first, int count) {
    for (int i = first; i < count; ++i) PutPixel(planes, i, LoadHalf4(pixels + i * kHalfPixel));
}

void StoreHalfTail(std::uint8_t* pixels, const float* planes, int first, int count) {
    for (int i = first; i < count; ++i) StoreHalf4(pixels + i * kHalfPixel, GetPixel(planes, i));
}

#ifdef __AVX2__

constexpr int kGroup = 8;

__m256 LoadPair(const std::uint8_t* low, const std::uint8_t* high) {
    return _mm256_insertf128_ps(_mm256_castps128_ps256(_mm_loadu_ps(reinterpret_cast<const float*>(low))),
                                _mm_loadu_ps(reinterpret_cast<const float*>(high)), 1);
}

void LoadFloat(float* planes, const std::uint8_t* pixels, int count) {
    int i = 0;
    for (; i + kGroup <= count; i += kGroup) {
        const std::uint8_t* p = pixels + i * kFloatPixel;
        const __m256 a = LoadPair(p, p + 64), b = LoadPair(p + 16, p + 80);
        const __m256 c = LoadPair(p + 32, p + 96), d = LoadPair(p + 48, p + 112);
        const __m256d ab0 = _mm256_castps_pd(_mm256_unpacklo_ps(a, b)),
                      ab1 = _mm256_castps_pd(_mm256_unpackhi_ps(a, b));
        const __m256d cd0 = _mm256_castps_pd(_mm256_unpacklo_ps(c, d)),
                      cd1 = _mm256_castps_pd(_mm256_unpackhi_ps(c, d));
        _mm256_store_ps(planes + i, _mm256_castpd_ps(_mm256_unpacklo_pd(ab0, cd0)));
        _mm256_store_ps(planes + kPlane + i, _mm256_castpd_ps(_mm256_unpackhi_pd(ab0, cd0)));
        _mm256_store_ps(planes + 2 * kPlane + i, _mm256_castpd_ps(_mm256_unpacklo_pd(ab1, cd1)));
        _mm256_store_ps(planes + 3 * kPlane + i, _mm256_castpd_ps(_mm256_unpackhi_pd(ab1, cd1)));
    }
    LoadFloatTail(planes, pixels, i, count);
}

template <bool kFresh>
void Put(std::uint8_t* target, __m256 value) {
    if constexpr (kFresh)
        _mm256_stream_ps(reinterpret_cast<float*>(target), value);
    else
        _mm256_storeu_ps(reinterpret_cast<float*>(target), value);
}

template <bool kFresh>
void StoreFloat(std::uint8_t* pixels, const float* planes, int count) {
    int i = 0;
    if (kFresh && (reinterpret_cast<std::uintptr_t>(pixels) & 31U) != 0)
        return StoreFloat<false>(pixels, planes, count);
    for (; i + kGroup <= count; i += kGroup) {
        const __m256 x = _mm256_load_ps(planes + i), y = _mm256_load_ps(planes + kPlane + i);
        const __m256 z = _mm256_load_ps(planes + 2 * kPlane + i), w = _mm256_load_ps(planes + 3 * kPlane + i);
        const __m256d xy0 = _mm256_castps_pd(_mm256_unpacklo_ps(x, y)),
                      xy1 = _mm256_castps_pd(_mm256_unpackhi_ps(x, y));
        const __m256d zw0 = _mm256_castps_pd(_mm256_unpacklo_ps(z, w)),
                      zw1 = _mm256_castps_pd(_mm256_unpackhi_ps(z, w));
        const __m256 p04 = _mm256_castpd_ps(_mm256_unpacklo_pd(xy0, zw0));
        const __m256 p15 = _mm256_castpd_ps(_mm256_unpackhi_pd(xy0, zw0));
        const __m256 p26 = _mm256_castpd_ps(_mm256_unpacklo_pd(xy1, zw1));
        const __m256 p37 = _mm256_castpd_ps(_mm256_unpackhi_pd(xy1, zw1));
        std::uint8_t* p = pixels + i * kFloatPixel;
        Put<kFresh>(p, _mm256_permute2f128_ps(p04, p15, 0x20));
        Put<kFresh>(p + 32, _mm256_permute2f128_ps(p26, p37, 0x20));
        Put<kFresh>(p + 64, _mm256_permute2f128_ps(p04, p15, 0x31));
        Put<kFresh>(p + 96, _mm256_permute2f128_ps(p26, p37, 0x31));
    }
    StoreFloatTail(pixels, planes, i, count);
}

void LoadHalf(float* planes, const std::uint8_t* pixels, int count) {
    int i = 0;
    for (; i + kGroup <= count; i += kGroup) {
        const auto* p = reinterpret_cast<const __m128i*>(pixels + i * kHalfPixel);
        const __m128i a = _mm_loadu_si128(p), b = _mm_loadu_si128(p + 1);
        const __m128i c = _mm_loadu_si128(p + 2), d = _mm_loadu_si128(p + 3);
        const __m128i even0 = _mm_unpacklo_epi16(a, b), odd0 = _mm_unpackhi_epi16(a, b);
        const __m128i even1 = _mm_unpacklo_epi16(c, d), odd1 = _mm_unpackhi_epi16(c, d);
        const __m128i xy0 = _mm_unpacklo_epi16(even0, odd0), zw0 = _mm_unpackhi_epi16(even0, odd0);
        const __m128i xy1 = _mm_unpacklo_epi16(even1, odd1), zw1 = _mm_unpackhi_epi16(even1, odd1);
        _mm256_store_ps(planes + i, _mm256_cvtph_ps(_mm_unpacklo_epi64(xy0, xy1)));
        _mm256_store_ps(planes + kPlane + i, _mm256_cvtph_ps(_mm_unpackhi_epi64(xy0, xy1)));
        _mm256_store_ps(planes + 2 * kPlane + i, _mm256_cvtph_ps(_mm_unpacklo_epi64(zw0, zw1)));
        _mm256_store_ps(planes + 3 * kPlane + i, _mm256_cvtph_ps(_mm_unpackhi_epi64(zw0, zw1)));
    }
    LoadHalfTail(planes, pixels, i, count);
}

template <bool kFresh>
void StoreHalf(std::uint8_t* pixels, const float* planes, int count) {
    int i = 0;
    if (kFresh && (reinterpret_cast<std::uintptr_t>(pixels) & 31U) != 0) return StoreHalf<false>(pixels, planes, count);
    const auto halves = [](const float* plane) {
        return _mm256_cvtps_ph(_mm256_load_ps(plane), _MM_FROUND_TO_NEAREST_INT);
    };
    for (; i + kGroup <= count; i += kGroup) {
        const __m128i x = halves(planes + i), y = halves(planes + kPlane + i);
        const __m128i z = halves(planes + 2 * kPlane + i), w = halves(planes + 3 * kPlane + i);
        const __m128i xy0 = _mm_unpacklo_epi16(x, y), xy1 = _mm_unpackhi_epi16(x, y);
        const __m128i zw0 = _mm_unpacklo_epi16(z, w), zw1 = _mm_unpackhi_epi16(z, w);
        const auto pair = [](__m128i xy, __m128i zw) {
            return _mm256_castsi256_ps(_mm256_insertf128_si256(_mm256_castsi128_si256(_mm_unpacklo_epi32(xy, zw)),
                                                               _mm_unpackhi_epi32(xy, zw), 1));
        };
        Put<kFresh>(pixels + i * kHalfPixel, pair(xy0, zw0));
        Put<kFresh>(pixels + i * kHalfPixel + 32, pair(xy1, zw1));
    }
    StoreHalfTail(pixels, planes, i, count);
}

void RoundStrip(float* planes, int count) {
    for (int plane = 0; plane < 4; ++plane) {
        float* values = planes + plane * kPlane;
        for (int i = 0; i < count; i += kGroup)
            _mm256_store_ps(values + i,
                            _mm256_cvtph_ps(_mm256_cvtps_ph(_mm256_load_ps(values + i), _MM_FROUND_TO_NEAREST_INT)));
    }
}

#else

constexpr int kGroup = 4;

template <bool kFresh>
void Put(std::uint8_t* target, __m128 value) {
    if constexpr (kFresh)
        _mm_stream_ps(reinterpret_cast<float*>(target), value);
    else
        _mm_storeu_ps(reinterpret_cast<float*>(target), value);
}

void LoadFloat(float* planes, const std::uint8_t* pixels, int count) {
    int i = 0;
    for (; i + kGroup <= count; i += kGroup) {
        const auto* p = reinterpret_cast<const float*>(pixels + i * kFloatPixel);
        __m128 a = _mm_loadu_ps(p), b = _mm_loadu_ps(p + 4), c = _mm_loadu_ps(p + 8), d = _mm_loadu_ps(p + 12);
        _MM_TRANSPOSE4_PS(a, b, c, d);
        _mm_store_ps(planes + i, a);
        _mm_store_ps(planes + kPlane + i, b);
        _mm_store_ps(planes + 2 * kPlane + i, c);
        _mm_store_ps(planes + 3 * kPlane + i, d);
    }
    LoadFloatTail(planes, pixels, i, count);
}

template <bool kFresh>
void StoreFloat(std::uint8_t* pixels, const float* planes, int count) {
    int i = 0;
    if (kFresh && (reinterpret_cast<std::uintptr_t>(pixels) & 15U) != 0)
        return StoreFloat<false>(pixels, planes, count);
    for (; i + kGroup <= count; i += kGroup) {
        __m128 a = _mm_load_ps(planes + i), b = _mm_load_ps(planes + kPlane + i);
        __m128 c = _mm_load_ps(planes + 2 * kPlane + i), d = _mm_load_ps(planes + 3 * kPlane + i);
        _MM_TRANSPOSE4_PS(a, b, c, d);
        std::uint8_t* p = pixels + i * kFloatPixel;
        Put<kFresh>(p, a);
        Put<kFresh>(p + 16, b);
        Put<kFresh>(p + 32, c);
        Put<kFresh>(p + 48, d);
    }
    StoreFloatTail(pixels, planes, i, count);
}

void LoadHalf(float* planes, const std::uint8_t* pixels, int count) { LoadHalfTail(planes, pixels, 0, count); }

template <bool kFresh>
void StoreHalf(std::uint8_t* pixels, const float* planes, int count) {
    StoreHalfTail(pixels, planes, 0, count);
}

void RoundStrip(float* planes, int count) {
    for (int plane = 0; plane < 4; ++plane)
        for (int i = 0; i < count; ++i) {
            float& value = planes[plane * kPlane + i];
            value = HalfToFloat(FloatToHalf(value));
        }
}

#endif

constexpr StripIo kIo = {
    {LoadHalf, LoadFloat}, {StoreHalf<false>, StoreFloat<false>}, {StoreHalf<true>, StoreFloat<true>}, RoundStrip};

}  // namespace

const StripIo& STRIP_LEVEL();
const StripIo& STRIP_LEVEL() { return kIo; }

}  // namespace SoftCuda
