// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// Kernels that read where they like, and the lanes they work in. A thread handles LANES neighbouring pixels (or
/// columns): one on a GPU, several on a CPU, held in small private arrays and worked on by loops over EACH_LANE, which
/// the compiler turns into vector code. Lanes past the picture's edge compute like the others and aren't written.

#if !defined(PIXEL)
#define PIXEL(p, x, y) \
    POSITION(x, y);    \
    SOURCE_PIXEL(p)
#define PIXEL_IN_PLACE(p, x, y) \
    POSITION(x, y);             \
    WORK_PIXEL(p)
#endif

#define EACH_LANE(i) for (int i = 0; i < LANES; ++i)
#if !defined(LANE_POSITION_IN)
#define LANE_POSITION_IN(x, y, lanes, itemsX, itemsY) \
    const int x = THREAD_X * LANES, y = THREAD_Y;     \
    if (x >= (itemsX) || y >= (itemsY)) return;       \
    const int lanes = x + LANES <= (itemsX) ? LANES : (itemsX)-x
#endif
#define LANE_POSITION(x, y, lanes) LANE_POSITION_IN(x, y, lanes, width, height)

/// LANES pixels: x holds their blue, y green, z red, w alpha.
typedef struct Lanes4 {
    float x[LANES], y[LANES], z[LANES], w[LANES];
} Lanes4;

DEVICE_FUNCTION Float4 GetLane(const Lanes4* lanes, int i) {
    return Make4(lanes->x[i], lanes->y[i], lanes->z[i], lanes->w[i]);
}

DEVICE_FUNCTION void SetLane(Lanes4* lanes, int i, Float4 value) {
    lanes->x[i] = value.x;
    lanes->y[i] = value.y;
    lanes->z[i] = value.z;
    lanes->w[i] = value.w;
}

DEVICE_FUNCTION void ClearLanes(Lanes4* lanes) { EACH_LANE(i) SetLane(lanes, i, Splat4(0.0f)); }

/// sum += pixels * weight, lane by lane.
DEVICE_FUNCTION void AddLanes(Lanes4* sum, const Lanes4* pixels, const float* weight) {
    EACH_LANE(i) {
        sum->x[i] += pixels->x[i] * weight[i];
        sum->y[i] += pixels->y[i] * weight[i];
        sum->z[i] += pixels->z[i] * weight[i];
        sum->w[i] += pixels->w[i] * weight[i];
    }
}

#if defined(DIALECT_LEVEL)
#include "Kiln/Device/PixelsCpu.h"
#else
/// Fetches the pixel at index[i] for each lane. All lanes are read: the indices have to be inside the frame.
DEVICE_FUNCTION void FetchLanes(Lanes4* lanes, AnyFrame frame, int format, const int* index) {
    EACH_LANE(i) SetLane(lanes, i, LoadPixel(frame, format, index[i]));
}

/// As FetchLanes, but a negative index stands for a transparent black pixel.
DEVICE_FUNCTION void FetchLanesOrClear(Lanes4* lanes, AnyFrame frame, int format, const int* index) {
    EACH_LANE(i) SetLane(lanes, i, index[i] < 0 ? Splat4(0.0f) : LoadPixel(frame, format, index[i]));
}

/// Reads `count` neighbouring pixels from `index` on; the other lanes are zero.
DEVICE_FUNCTION void ReadLanes(Lanes4* lanes, AnyFrame frame, int format, int index, int count) {
    if (count == LANES) {
        EACH_LANE(i) SetLane(lanes, i, LoadPixel(frame, format, index + i));
        return;
    }
    EACH_LANE(i) SetLane(lanes, i, i < count ? LoadPixel(frame, format, index + i) : Splat4(0.0f));
}

/// Writes the first `count` lanes to neighbouring pixels from `index` on.
DEVICE_FUNCTION void WriteLanes(TargetFrame frame, int format, int index, int count, const Lanes4* lanes) {
    if (count == LANES) {
        EACH_LANE(i) StorePixel(frame, format, index + i, GetLane(lanes, i));
        return;
    }
    EACH_LANE(i) {
        if (i < count) StorePixel(frame, format, index + i, GetLane(lanes, i));
    }
}
#endif

/// 8-bit pixels, 0 to 255 for 0.0 to 1.0; blue first.
DEVICE_FUNCTION Float4 LoadPixel8(GLOBAL const uchar* pixels, int index) {
    GLOBAL const uchar* p = pixels + 4 * index;
    return Make4((float)p[0] * (1.0f / 255.0f), (float)p[1] * (1.0f / 255.0f), (float)p[2] * (1.0f / 255.0f),
                 (float)p[3] * (1.0f / 255.0f));
}

DEVICE_FUNCTION void StorePixel8(GLOBAL uchar* pixels, int index, Float4 value) {
    GLOBAL uchar* p = pixels + 4 * index;
    p[0] = (uchar)(int)(Saturate(value.x) * 255.0f + 0.5f);
    p[1] = (uchar)(int)(Saturate(value.y) * 255.0f + 0.5f);
    p[2] = (uchar)(int)(Saturate(value.z) * 255.0f + 0.5f);
    p[3] = (uchar)(int)(Saturate(value.w) * 255.0f + 0.5f);
}
