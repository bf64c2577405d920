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

DEVICE_FUNCTION void FetchLanes(Lanes4* lanes, AnyFrame frame, int format, const int* index) {
    for (int i = 0; i < LANES; i += 4)
        PutFour(lanes, i, LoadVector(frame, format, index[i]), LoadVector(frame, format, index[i + 1]),
                LoadVector(frame, format, index[i + 2]), LoadVector(frame, format, index[i + 3]));
}

DEVICE_FUNCTION Vector4 LoadVectorOrClear(AnyFrame frame, int format, int index) {
    // Reads the first pixel rather than branch; a mask clears it.
    const Vector4 pixel = LoadVector(frame, format, index < 0 ? 0 : index);
    const Index4 keep = Index4{} + ~(index >> 31);
    return (Vector4)((Index4)pixel & keep);
}

DEVICE_FUNCTION void FetchLanesOrClear(Lanes4* lanes, AnyFrame frame, int format, const int* index) {
    for (int i = 0; i < LANES; i += 4)
        PutFour(lanes, i, LoadVectorOrClear(frame, format, index[i]), LoadVectorOrClear(frame, format, index[i + 1]),
                LoadVectorOrClear(frame, format, index[i + 2]), LoadVectorOrClear(frame, format, index[i + 3]));
}

DEVICE_FUNCTION void ReadLanes(Lanes4* lanes, AnyFrame frame, int format, int index, int count) {
    if (count >= LANES) {
        for (int i = 0; i < LANES; i += 4)
            PutFour(lanes, i, LoadVector(frame, format, index + i), LoadVector(frame, format, index + i + 1),
                    LoadVector(frame, format, index + i + 2), LoadVector(frame, format, index + i + 3));
        return;
    }
    for (int i = 0; i < LANES; ++i) SetLane(lanes, i, i < count ? LoadPixel(frame, format, index + i) : Splat4(0.0f));
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
