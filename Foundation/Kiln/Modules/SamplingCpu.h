// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// The CPU's way to filter: a filter's taps lie side by side in memory, so two pixels are taken with one load, and no lane
/// waits for a gather. A turned picture costs a fifth of the way tap by tap; on a line the sums down the columns are
/// shared by all lanes. See Sampling.h for what the functions do.

typedef float Vector8 __attribute__((vector_size(32)));
typedef int Index8 __attribute__((vector_size(32)));

/// A filter that reaches further is sampled tap by tap.
#define MOST_TAPS 32
#define MOST_COLUMNS (LANES * 6 + 2 * MOST_TAPS)

typedef struct LaneTaps {
    int first[LANES];
    float weight[MOST_TAPS][LANES];
} LaneTaps;

/// `count` taps from the first on; those past the filter's reach weigh nothing.
DEVICE_FUNCTION void WeighTaps(LaneTaps* taps, int filter, Reach reach, int count, const float* position) {
    float total[LANES];
    EACH_LANE(i) {
        taps->first[i] = FirstTap(reach, position[i]);
        total[i] = 0.0f;
    }
    for (int k = 0; k < count; ++k) {
        EACH_LANE(i) {
            const float distance = ((float)(taps->first[i] + k) + 0.5f - position[i]) * reach.inverse;
            const float weight = FilterWeight(filter, distance);
            taps->weight[k][i] = weight;
            total[i] += weight;
        }
    }
    if (reach.stretch <= 1.0f) return;
    for (int k = 0; k < count; ++k) EACH_LANE(i) taps->weight[k][i] /= total[i];
}

DEVICE_FUNCTION int PixelBytes(int format) { return format == 0 ? 8 : 16; }

DEVICE_FUNCTION const uchar* PixelAddress(AnyFrame in, int format, int index) {
    return in.address + static_cast<std::ptrdiff_t>(index) * PixelBytes(format);
}

DEVICE_FUNCTION Vector4 AddHalves(Vector8 pair) {
    return __builtin_shufflevector(pair, pair, 0, 1, 2, 3) + __builtin_shufflevector(pair, pair, 4, 5, 6, 7);
}

/// Two neighbouring pixels, premultiplied.
DEVICE_FUNCTION Vector8 LoadWeighedPair(const uchar* address, int format) {
    Vector8 pair;
    if (format == 0)
        pair = __builtin_shufflevector(SoftCuda::LoadHalf4(address), SoftCuda::LoadHalf4(address + 8), 0, 1, 2, 3, 4, 5, 6,
                                       7);
    else
        __builtin_memcpy(&pair, address, sizeof pair);
    const Vector8 ones = {1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f};
    return pair * __builtin_shuffle(pair, ones, Index8{3, 3, 3, 8, 7, 7, 7, 12});
}

DEVICE_FUNCTION Vector4 LoadWeighed(AnyFrame in, int format, int index) {
    const Vector4 pixel = LoadVector(in, format, index);
    return pixel * __builtin_shuffle(pixel, Vector4{1.0f, 1.0f, 1.0f, 1.0f}, Index4{3, 3, 3, 4});
}

DEVICE_FUNCTION Vector8 WeightsOfPair(const LaneTaps* taps, int tap, int i) {
    const float a = taps->weight[tap][i], b = taps->weight[tap + 1][i];
    return Vector8{a, a, a, a, b, b, b, b};
}

DEVICE_FUNCTION void PutLanes(Lanes4* lanes, const Vector4* pixels) {
    for (int i = 0; i < LANES; i += 4) PutFour(lanes, i, pixels[i], pixels[i + 1], pixels[i + 2], pixels[i + 3]);
}

/// All taps of all lanes lie inside the region.
DEVICE_FUNCTION void SampleInside(Lanes4* sum, AnyFrame in, int format, Region region, const LaneTaps* across,
                                  int pairs, const LaneTaps* down, int rows) {
    const std::ptrdiff_t rowBytes = static_cast<std::ptrdiff_t>(region.pitch) * PixelBytes(format);
    int index[LANES];
    Vector4 pixels[LANES];
    EACH_LANE(i) index[i] = (region.top + down->first[i]) * region.pitch + region.left + across->first[i];
    for (int i = 0; i < LANES; ++i) {
        const uchar* corner = PixelAddress(in, format, index[i]);
        Vector8 total = {};
        for (int k = 0; k < pairs; ++k) {
            const uchar* address = corner + 2 * k * PixelBytes(format);
            Vector8 column = {};
            for (int j = 0; j < rows; ++j)
                column += LoadWeighedPair(address + j * rowBytes, format) * down->weight[j][i];
            total += column * WeightsOfPair(across, 2 * k, i);
        }
        pixels[i] = AddHalves(total);
    }
    PutLanes(sum, pixels);
}

/// Positions along a line or a slanted one are in order: the outermost lanes are the extremes.
DEVICE_FUNCTION int TapsLieInside(const LaneTaps* taps, int count, int size) {
    const int a = taps->first[0], b = taps->first[LANES - 1];
    return MinInt(a, b) >= 0 && MaxInt(a, b) + count <= size;
}

DEVICE_FUNCTION void SampleFiltered(Lanes4* sum, AnyFrame in, int format, Region region, int filter,
                                    Reach across, Reach down, const float* u, const float* v) {
    const int columns = (across.taps + 1) & ~1;
    LaneTaps tapsAcross, tapsDown;
    if (columns <= MOST_TAPS && down.taps <= MOST_TAPS) {
        WeighTaps(&tapsAcross, filter, across, columns, u);
        WeighTaps(&tapsDown, filter, down, down.taps, v);
        if (TapsLieInside(&tapsAcross, columns, region.width) && TapsLieInside(&tapsDown, down.taps, region.height)) {
            // The two commonest sizes with their bounds known, so that their loops are unrolled.
            if (columns == 4 && down.taps == 4)
                SampleInside(sum, in, format, region, &tapsAcross, 2, &tapsDown, 4);
            else if (columns == 2 && down.taps == 2)
                SampleInside(sum, in, format, region, &tapsAcross, 1, &tapsDown, 2);
            else
                SampleInside(sum, in, format, region, &tapsAcross, columns / 2, &tapsDown, down.taps);
            return;
        }
    }
    SampleTaps(sum, in, format, region, filter, across, down, u, v);
}

typedef struct RowTaps {
    int index[MOST_TAPS];  // of the row's first pixel
    float weight[MOST_TAPS];
} RowTaps;

DEVICE_FUNCTION void WeighRows(RowTaps* rows, int filter, Reach reach, Region region, float v) {
    const int first = FirstTap(reach, v);
    float total = 0.0f;
    for (int j = 0; j < reach.taps; ++j) {
        rows->index[j] = (region.top + ClampInt(first + j, 0, region.height - 1)) * region.pitch + region.left;
        rows->weight[j] = FilterWeight(filter, ((float)(first + j) + 0.5f - v) * reach.inverse);
        total += rows->weight[j];
    }
    if (reach.stretch <= 1.0f) return;
    for (int j = 0; j < reach.taps; ++j) rows->weight[j] /= total;
}

/// The rows' sums for the columns `low` to `high`, which may lie outside.
DEVICE_FUNCTION void SumColumns(Vector4* columns, AnyFrame in, int format, Region region, const RowTaps* rows,
                                int count, int low, int high) {
    const int from = ClampInt(low, 0, region.width - 1), to = ClampInt(high, from + 1, region.width);
    int column = from;
    for (; column + 1 < to; column += 2) {
        Vector8 pair = {};
        for (int j = 0; j < count; ++j)
            pair += LoadWeighedPair(PixelAddress(in, format, rows->index[j] + column), format) * rows->weight[j];
        __builtin_memcpy(&columns[column - low], &pair, sizeof pair);
    }
    if (column < to) {
        Vector4 last = {};
        for (int j = 0; j < count; ++j) last += LoadWeighed(in, format, rows->index[j] + column) * rows->weight[j];
        columns[column - low] = last;
    }
    for (int c = low; c < from; ++c) columns[c - low] = columns[from - low];
    for (int c = to; c < high; ++c) columns[c - low] = columns[to - 1 - low];
}

DEVICE_FUNCTION void SampleLine(Lanes4* sum, AnyFrame in, int format, Region region, int filter,
                                Reach across, Reach down, const float* u, const float* v) {
    const int taps = (across.taps + 1) & ~1;
    const int low = FirstTap(across, Min(u[0], u[LANES - 1])), high = FirstTap(across, Max(u[0], u[LANES - 1])) + taps;
    if (taps > MOST_TAPS || down.taps > MOST_TAPS || high - low > MOST_COLUMNS || low >= region.width || high <= 0) {
        SampleTaps(sum, in, format, region, filter, across, down, u, v);
        return;
    }
    LaneTaps tapsAcross;
    RowTaps rows;
    Vector4 columns[MOST_COLUMNS], pixels[LANES];
    WeighTaps(&tapsAcross, filter, across, taps, u);
    WeighRows(&rows, filter, down, region, v[0]);
    if (down.taps == 4)
        SumColumns(columns, in, format, region, &rows, 4, low, high);
    else if (down.taps == 2)
        SumColumns(columns, in, format, region, &rows, 2, low, high);
    else
        SumColumns(columns, in, format, region, &rows, down.taps, low, high);
    for (int i = 0; i < LANES; ++i) {
        const Vector4* reached = &columns[tapsAcross.first[i] - low];
        Vector8 pixel = {};
        for (int k = 0; k < taps; k += 2) {
            Vector8 pair;
            __builtin_memcpy(&pair, reached + k, sizeof pair);
            pixel += pair * WeightsOfPair(&tapsAcross, k, i);
        }
        pixels[i] = AddHalves(pixel);
    }
    PutLanes(sum, pixels);
}
