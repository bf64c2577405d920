// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// Reading a picture between its pixels, for kernels in lanes. Positions are in pixels from the picture's upper left
/// corner, pixel centres at halves; beyond the border the border's pixels go on. Sums are premultiplied: their colour
/// is weighed by alpha, and StraightenLanes divides it out again.

#define FILTER_NEAREST 0
#define FILTER_BILINEAR 1
#define FILTER_BICUBIC 2

/// The picture that is read, inside a frame.
typedef struct Region {
    int pitch;
    int left, top, width, height;
} Region;

/// How a filter spreads in one direction.
typedef struct Reach {
    float stretch;  // the filter's unit in pixels, at least 1
    float inverse;
    float radius;  // in pixels
    int taps;      // that the filter reaches at most
} Reach;

/// @param footprint how many of the picture's pixels one pixel of the result covers
DEVICE_FUNCTION Reach MakeReach(int filter, float footprint) {
    // The tent is soft enough to bear a slight reduction as it is, at a quarter of the taps.
    const float stretch = Max(filter == FILTER_BILINEAR ? footprint - 0.5f : footprint, 1.0f);
    Reach reach;
    reach.stretch = stretch;
    reach.inverse = 1.0f / stretch;
    reach.radius = filter == FILTER_BICUBIC ? 2.0f * stretch : stretch;
    // A stretched filter may begin anywhere between two pixels, and so meet one more than twice its radius.
    const int whole = (int)Ceil(2.0f * reach.radius);
    reach.taps = stretch > 1.0f ? whole + 1 : whole;
    return reach;
}

DEVICE_FUNCTION float FilterWeight(int filter, float distance) {
    const float t = Abs(distance);
    if (filter == FILTER_BILINEAR) return Max(1.0f - t, 0.0f);
    // Keys' cubic with a = -1/2 (Catmull-Rom).
    const float inner = (1.5f * t - 2.5f) * t * t + 1.0f;
    const float outer = ((-0.5f * t + 2.5f) * t - 4.0f) * t + 2.0f;
    const float beyond = t < 2.0f ? outer : 0.0f;
    return t < 1.0f ? inner : beyond;
}

/// The first pixel that the filter reaches from a position.
DEVICE_FUNCTION int FirstTap(Reach reach, float position) { return (int)Ceil(position - reach.radius - 0.5f); }

DEVICE_FUNCTION void SampleNearest(Lanes4* sum, AnyFrame in, int format, Region region, const float* u,
                                   const float* v) {
    int index[LANES];
    EACH_LANE(i) {
        const int column = ClampInt((int)Floor(u[i]), 0, region.width - 1);
        const int row = ClampInt((int)Floor(v[i]), 0, region.height - 1);
        index[i] = (region.top + row) * region.pitch + region.left + column;
    }
    FetchLanes(sum, in, format, index);
}

/// The filtered picture at LANES positions, tap by tap.
DEVICE_FUNCTION void SampleTaps(Lanes4* sum, AnyFrame in, int format, Region region, int filter, Reach across,
                                Reach down, const float* u, const float* v) {
    float total[LANES];
    ClearLanes(sum);
    EACH_LANE(i) total[i] = 0.0f;
    for (int j = 0; j < down.taps; ++j) {
        int line[LANES];
        float rowWeight[LANES];
        EACH_LANE(i) {
            const int row = FirstTap(down, v[i]) + j;
            rowWeight[i] = FilterWeight(filter, ((float)row + 0.5f - v[i]) * down.inverse);
            line[i] = (region.top + ClampInt(row, 0, region.height - 1)) * region.pitch + region.left;
        }
        for (int k = 0; k < across.taps; ++k) {
            int index[LANES];
            float weight[LANES];
            EACH_LANE(i) {
                const int column = FirstTap(across, u[i]) + k;
                weight[i] = rowWeight[i] * FilterWeight(filter, ((float)column + 0.5f - u[i]) * across.inverse);
                index[i] = line[i] + ClampInt(column, 0, region.width - 1);
                total[i] += weight[i];
            }
            Lanes4 taps;
            FetchLanes(&taps, in, format, index);
            EACH_LANE(i) {
                const float share = weight[i] * taps.w[i];
                sum->x[i] += share * taps.x[i];
                sum->y[i] += share * taps.y[i];
                sum->z[i] += share * taps.z[i];
                sum->w[i] += share;
            }
        }
    }
    // A stretched filter's weights add up to about its stretch; the others' to 1 but for rounding.
    EACH_LANE(i) {
        const float inverse = 1.0f / total[i];
        sum->x[i] *= inverse;
        sum->y[i] *= inverse;
        sum->z[i] *= inverse;
        sum->w[i] *= inverse;
    }
}

/// Divides the colour of a sum by its alpha. An alpha that is 1 but for rounding becomes 1, one that the cubic's
/// negative weights brought out of 0..1 comes back into it, and where no more than rounding is left the pixel is
/// transparent black.
DEVICE_FUNCTION void StraightenLanes(Lanes4* sum) {
    EACH_LANE(i) {
        const float alpha = sum->w[i];
        const int seen = alpha >= 1e-5f;
        const float inverse = 1.0f / alpha;
        const float x = sum->x[i] * inverse, y = sum->y[i] * inverse, z = sum->z[i] * inverse;
        sum->x[i] = seen ? x : 0.0f;
        sum->y[i] = seen ? y : 0.0f;
        sum->z[i] = seen ? z : 0.0f;
        const float bounded = seen ? alpha : 0.0f;
        sum->w[i] = alpha > 0.999998f ? 1.0f : bounded;
    }
}

/// A cubic's negative weights can cancel nearly all of an alpha and leave colour over, which the division then blows
/// up. Where less than a quarter of alpha carries a colour beyond -2..2, the colour is brought back between those of
/// the taps that are seen. That is rare: all others pay for the question alone.
DEVICE_FUNCTION void RestrainLanes(Lanes4* pixels, AnyFrame in, int format, Region region, Reach across, Reach down,
                                   const float* u, const float* v) {
    int wild[LANES];
    int any = 0;
    EACH_LANE(i) {
        const float largest = Max(Max(Abs(pixels->x[i]), Abs(pixels->y[i])), Abs(pixels->z[i]));
        wild[i] = largest > 2.0f && pixels->w[i] < 0.25f;
        any |= wild[i];
    }
    if (any == 0) return;
    Lanes4 least, most;
    EACH_LANE(i) {
        SetLane(&least, i, Splat4(3e38f));
        SetLane(&most, i, Splat4(-3e38f));
    }
    for (int tap = 0; tap < across.taps * down.taps; ++tap) {
        int index[LANES], counts[LANES];
        EACH_LANE(i) {
            const int column = FirstTap(across, u[i]) + tap % across.taps,
                      row = FirstTap(down, v[i]) + tap / across.taps;
            const float fromColumn = Abs((float)column + 0.5f - u[i]) * across.inverse;
            const float fromRow = Abs((float)row + 0.5f - v[i]) * down.inverse;
            index[i] = (region.top + ClampInt(row, 0, region.height - 1)) * region.pitch + region.left +
                       ClampInt(column, 0, region.width - 1);
            // Just short of the filter's end at 2, where rounding would decide.
            counts[i] = Max(fromColumn, fromRow) < 1.99f;
        }
        Lanes4 taps;
        FetchLanes(&taps, in, format, index);
        EACH_LANE(i) {
            const Float4 color = GetLane(&taps, i);
            const int seen = counts[i] && color.w > 0.0f;
            SetLane(&least, i, Select4(seen, Min4(color, GetLane(&least, i)), GetLane(&least, i)));
            SetLane(&most, i, Select4(seen, Max4(color, GetLane(&most, i)), GetLane(&most, i)));
        }
    }
    EACH_LANE(i) {
        pixels->x[i] = wild[i] ? Clamp(pixels->x[i], least.x[i], most.x[i]) : pixels->x[i];
        pixels->y[i] = wild[i] ? Clamp(pixels->y[i], least.y[i], most.y[i]) : pixels->y[i];
        pixels->z[i] = wild[i] ? Clamp(pixels->z[i], least.z[i], most.z[i]) : pixels->z[i];
    }
}

/// Lines that one thread samples of a picture that isn't turned: neighbouring ones share most of what they read.
#define TILE_LINES 8

#if defined(DIALECT_LEVEL)
#include "Kiln/Modules/SamplingCpu.h"
#else
/// The filtered picture at LANES positions. Returns 1 when all that was read is known to be opaque: the sums are
/// straight already.
DEVICE_FUNCTION int SampleFiltered(Lanes4* sum, AnyFrame in, int format, Region region, int filter, Reach across,
                                   Reach down, const float* u, const float* v) {
    SampleTaps(sum, in, format, region, filter, across, down, u, v);
    return 0;
}

typedef struct Tile {
    int unused;
} Tile;

/// Makes ready to sample lines at the positions u from firstV to lastV.
DEVICE_FUNCTION void BeginTile(Tile* tile, AnyFrame in, int format, Region region, int filter, Reach across, Reach down,
                               const float* u, float firstV, float lastV) {
    tile->unused = 0;
}

/// As SampleFiltered for one of the tile's lines: v is the same for all lanes.
DEVICE_FUNCTION int SampleTileLine(Lanes4* sum, const Tile* tile, AnyFrame in, int format, Region region, int filter,
                                   Reach across, Reach down, const float* u, const float* v) {
    SampleTaps(sum, in, format, region, filter, across, down, u, v);
    return 0;
}
#endif

/// Makes sums straight.
DEVICE_FUNCTION void FinishLanes(Lanes4* pixels, AnyFrame in, int format, Region region, int filter, Reach across,
                                 Reach down, const float* u, const float* v) {
    StraightenLanes(pixels);
    if (filter == FILTER_BICUBIC) RestrainLanes(pixels, in, format, region, across, down, u, v);
}
