// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// The CPU's way to fetch lanes: whole pixels are loaded and four of them transposed at a time, which is cheaper than
/// gathering single floats. See Pixels.h for what each function does.

static_assert(LANES % 4 == 0, "lanes come in fours");

DEVICE_FUNCTION void PutFour(Lanes4* lanes, int i, Vector4 a, Vector4 b, Vector4 c, Vector4 d) {
    Transpose4(a, b, c, d);
    __builtin_memcpy(&lanes->x[i], &a, sizeof a);
    __builtin_memcpy(&lanes->y[i], &b, sizeof b);
    __builtin_memcpy(&lanes->z[i], &c, sizeof c);
    __builtin_memcpy(&lanes->w[i], &d, sizeof d);
}

#ifdef __AVX__
typedef float EightFloats __attribute__((vector_size(32)));
typedef int EightInts __attribute__((vector_size(32)));

DEVICE_FUNCTION EightFloats Pair4(Vector4 low, Vector4 high) {
    return __builtin_shufflevector(low, high, 0, 1, 2, 3, 4, 5, 6, 7);
}

/// Eight pixels, of which each argument holds two: i and i + 4.
DEVICE_FUNCTION void PutEight(Lanes4* lanes, int i, EightFloats a, EightFloats b, EightFloats c, EightFloats d) {
    const EightInts low = {0, 8, 1, 9, 4, 12, 5, 13}, high = {2, 10, 3, 11, 6, 14, 7, 15};
    const EightInts even = {0, 1, 8, 9, 4, 5, 12, 13}, odd = {2, 3, 10, 11, 6, 7, 14, 15};
    const EightFloats ab0 = __builtin_shuffle(a, b, low), ab1 = __builtin_shuffle(a, b, high);
    const EightFloats cd0 = __builtin_shuffle(c, d, low), cd1 = __builtin_shuffle(c, d, high);
    const EightFloats planes[4] = {__builtin_shuffle(ab0, cd0, even), __builtin_shuffle(ab0, cd0, odd),
                                   __builtin_shuffle(ab1, cd1, even), __builtin_shuffle(ab1, cd1, odd)};
    __builtin_memcpy(&lanes->x[i], &planes[0], sizeof planes[0]);
    __builtin_memcpy(&lanes->y[i], &planes[1], sizeof planes[1]);
    __builtin_memcpy(&lanes->z[i], &planes[2], sizeof planes[2]);
    __builtin_memcpy(&lanes->w[i], &planes[3], sizeof planes[3]);
}

#define FILL_LANES(lanes, PIXEL_AT)                                                                      \
    int i = 0;                                                                                           \
    for (; i + 8 <= LANES; i += 8)                                                                       \
        PutEight(lanes, i, Pair4(PIXEL_AT(i), PIXEL_AT(i + 4)), Pair4(PIXEL_AT(i + 1), PIXEL_AT(i + 5)), \
                 Pair4(PIXEL_AT(i + 2), PIXEL_AT(i + 6)), Pair4(PIXEL_AT(i + 3), PIXEL_AT(i + 7)));      \
    for (; i < LANES; i += 4) PutFour(lanes, i, PIXEL_AT(i), PIXEL_AT(i + 1), PIXEL_AT(i + 2), PIXEL_AT(i + 3))
#else
#define FILL_LANES(lanes, PIXEL_AT) \
    for (int i = 0; i < LANES; i += 4) PutFour(lanes, i, PIXEL_AT(i), PIXEL_AT(i + 1), PIXEL_AT(i + 2), PIXEL_AT(i + 3))
#endif

DEVICE_FUNCTION void FetchLanes(Lanes4* lanes, AnyFrame frame, int format, const int* index) {
#define INDEXED_PIXEL(lane) LoadVector(frame, format, index[lane])
    FILL_LANES(lanes, INDEXED_PIXEL);
#undef INDEXED_PIXEL
}

DEVICE_FUNCTION Vector4 LoadVectorOrClear(AnyFrame frame, int format, int index) {
    // Reads the first pixel rather than branch; a mask clears it.
    const Vector4 pixel = LoadVector(frame, format, index < 0 ? 0 : index);
    const Index4 keep = Index4{} + ~(index >> 31);
    return (Vector4)((Index4)pixel & keep);
}

DEVICE_FUNCTION void FetchLanesOrClear(Lanes4* lanes, AnyFrame frame, int format, const int* index) {
#define INDEXED_PIXEL(lane) LoadVectorOrClear(frame, format, index[lane])
    FILL_LANES(lanes, INDEXED_PIXEL);
#undef INDEXED_PIXEL
}

DEVICE_FUNCTION void ReadLanes(Lanes4* lanes, AnyFrame frame, int format, int index, int count) {
    if (count < LANES) {
        for (int i = 0; i < LANES; ++i)
            SetLane(lanes, i, i < count ? LoadPixel(frame, format, index + i) : Splat4(0.0f));
        return;
    }
#define NEIGHBOUR_PIXEL(lane) LoadVector(frame, format, index + (lane))
    FILL_LANES(lanes, NEIGHBOUR_PIXEL);
#undef NEIGHBOUR_PIXEL
}

DEVICE_FUNCTION void WriteLanes(WritableFrame frame, int format, int index, int count, const Lanes4* lanes) {
    if (count < LANES) {
        for (int i = 0; i < count; ++i) StorePixel(frame, format, index + i, GetLane(lanes, i));
        return;
    }
    for (int i = 0; i < LANES; i += 4) {
        Vector4 a, b, c, d;
        __builtin_memcpy(&a, &lanes->x[i], sizeof a);
        __builtin_memcpy(&b, &lanes->y[i], sizeof b);
        __builtin_memcpy(&c, &lanes->z[i], sizeof c);
        __builtin_memcpy(&d, &lanes->w[i], sizeof d);
        Transpose4(a, b, c, d);
        StoreVector(frame, format, index + i, a);
        StoreVector(frame, format, index + i + 1, b);
        StoreVector(frame, format, index + i + 2, c);
        StoreVector(frame, format, index + i + 3, d);
    }
}
