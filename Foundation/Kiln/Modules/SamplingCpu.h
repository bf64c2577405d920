// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// The CPU's way to filter: a filter's taps lie side by side in memory, so two pixels are taken with one load, and no
/// lane waits for a gather. Where the picture isn't turned, a tile of it is premultiplied once for several lines, and
/// the sums down its columns are shared by all lanes. See Sampling.h for what the functions do.

typedef float Vector8 __attribute__((vector_size(32)));
typedef int Index8 __attribute__((vector_size(32)));
typedef float Vector16 __attribute__((vector_size(64)));

/// A filter that reaches further is sampled tap by tap.
#define MOST_TAPS 32
#define MOST_TILE_PIXELS 8192
#define MOST_TILE_COLUMNS 512

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

DEVICE_FUNCTION Vector4 LowHalf(Vector8 pair) { return __builtin_shufflevector(pair, pair, 0, 1, 2, 3); }
DEVICE_FUNCTION Vector4 HighHalf(Vector8 pair) { return __builtin_shufflevector(pair, pair, 4, 5, 6, 7); }
DEVICE_FUNCTION Vector4 AddHalves(Vector8 pair) { return LowHalf(pair) + HighHalf(pair); }

/// Two neighbouring pixels.
DEVICE_FUNCTION Vector8 LoadPair(const uchar* address, int format) {
    Vector8 pair;
    if (format == 0) {
#ifdef __F16C__
        SoftCuda::HalfVector8i halves;
        __builtin_memcpy(&halves, address, sizeof halves);
        pair = __builtin_ia32_vcvtph2ps256(halves);
#else
        pair = __builtin_shufflevector(SoftCuda::LoadHalf4(address), SoftCuda::LoadHalf4(address + 8), 0, 1, 2, 3, 4, 5,
                                       6, 7);
#endif
    } else {
        __builtin_memcpy(&pair, address, sizeof pair);
    }
    return pair;
}

/// Two pixels premultiplied. In two steps, which are cheaper than one shuffle of two operands.
DEVICE_FUNCTION Vector8 WeighPair(Vector8 pair) {
    const Vector8 ones = {1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f};
    const Vector8 alphas = __builtin_shufflevector(pair, pair, 3, 3, 3, 3, 7, 7, 7, 7);
    return pair * __builtin_shufflevector(alphas, ones, 0, 1, 2, 11, 4, 5, 6, 15);
}

/// Collects the bits in which pixels differ from opaque ones: those of alpha stay 0 while all are opaque.
DEVICE_FUNCTION Index8 NoteAlpha(Index8 found, Vector8 pair) {
    const Vector8 ones = {1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f};
    return found | ((Index8)pair ^ (Index8)ones);
}
DEVICE_FUNCTION int FoundAllOpaque(Index8 found) { return (found[3] | found[7]) == 0; }

DEVICE_FUNCTION Vector4 LoadWeighed(AnyFrame in, int format, int index) {
    const Vector4 pixel = LoadVector(in, format, index);
    return pixel * __builtin_shuffle(pixel, Vector4{1.0f, 1.0f, 1.0f, 1.0f}, Index4{3, 3, 3, 4});
}

DEVICE_FUNCTION Vector8 WeightsOfPair(const LaneTaps* taps, int tap, int i) {
    const float a = taps->weight[tap][i], b = taps->weight[tap + 1][i];
    return Vector8{a, a, a, a, b, b, b, b};
}

DEVICE_FUNCTION void PutLanes(Lanes4* lanes, const Vector4* pixels) {
#define PIXEL_OF_LANE(lane) pixels[lane]
    FILL_LANES(lanes, PIXEL_OF_LANE);
#undef PIXEL_OF_LANE
}

/// All taps of all lanes lie inside the region.
/// @param weigh 0: the pixels are taken as they are, and the result tells whether that was right: all are opaque
DEVICE_FUNCTION int SampleInside(Lanes4* sum, AnyFrame in, int format, Region region, const LaneTaps* across, int pairs,
                                 const LaneTaps* down, int rows, int weigh) {
    const std::ptrdiff_t rowBytes = static_cast<std::ptrdiff_t>(region.pitch) * PixelBytes(format);
    int index[LANES];
    Vector4 pixels[LANES];
    Index8 found = {};
    EACH_LANE(i) index[i] = (region.top + down->first[i]) * region.pitch + region.left + across->first[i];
    for (int i = 0; i < LANES; ++i) {
        const uchar* corner = PixelAddress(in, format, index[i]);
        Vector4 total = {};
        for (int k = 0; k < pairs; ++k) {
            const uchar* address = corner + 2 * k * PixelBytes(format);
            Vector8 column = {};
            for (int j = 0; j < rows; ++j) {
                const Vector8 pair = LoadPair(address + j * rowBytes, format);
                if (weigh == 0) found = NoteAlpha(found, pair);
                column += (weigh == 0 ? pair : WeighPair(pair)) * down->weight[j][i];
            }
            total += LowHalf(column) * across->weight[2 * k][i];
            total += HighHalf(column) * across->weight[2 * k + 1][i];
        }
        pixels[i] = total;
    }
    if (weigh == 0 && !FoundAllOpaque(found)) return 0;
    PutLanes(sum, pixels);
    if (weigh == 0) EACH_LANE(i) sum->w[i] = 1.0f;
    return weigh == 0;
}

/// The commonest sizes with their bounds known, so that their loops are unrolled.
DEVICE_FUNCTION int SampleInsideBySize(Lanes4* sum, AnyFrame in, int format, Region region, const LaneTaps* across,
                                       int columns, const LaneTaps* down, int rows, int weigh) {
    if (columns == 4 && rows == 4) return SampleInside(sum, in, format, region, across, 2, down, 4, weigh);
    if (columns == 2 && rows == 2) return SampleInside(sum, in, format, region, across, 1, down, 2, weigh);
    return SampleInside(sum, in, format, region, across, columns / 2, down, rows, weigh);
}

/// Is it worth trying without weights? Asks the first and the last lane. (Filters that reach further gain nothing.)
DEVICE_FUNCTION int LooksOpaque(AnyFrame in, int format, Region region, const LaneTaps* across, const LaneTaps* down) {
    int opaque = 1;
    for (int i = 0; i < LANES; i += LANES - 1) {
        const int index = (region.top + down->first[i]) * region.pitch + region.left + across->first[i];
        opaque &= LoadVector(in, format, index)[3] == 1.0f;
    }
    return opaque;
}

/// Positions along a line or a slanted one are in order: the outermost lanes are the extremes.
DEVICE_FUNCTION int TapsLieInside(const LaneTaps* taps, int count, int size) {
    const int a = taps->first[0], b = taps->first[LANES - 1];
    return MinInt(a, b) >= 0 && MaxInt(a, b) + count <= size;
}

DEVICE_FUNCTION int SampleFiltered(Lanes4* sum, AnyFrame in, int format, Region region, int filter, Reach across,
                                   Reach down, const float* u, const float* v) {
    const int columns = (across.taps + 1) & ~1;
    LaneTaps tapsAcross, tapsDown;
    if (columns <= MOST_TAPS && down.taps <= MOST_TAPS) {
        WeighTaps(&tapsAcross, filter, across, columns, u);
        WeighTaps(&tapsDown, filter, down, down.taps, v);
        if (TapsLieInside(&tapsAcross, columns, region.width) && TapsLieInside(&tapsDown, down.taps, region.height)) {
            if (columns <= 4 && LooksOpaque(in, format, region, &tapsAcross, &tapsDown) &&
                SampleInsideBySize(sum, in, format, region, &tapsAcross, columns, &tapsDown, down.taps, 0))
                return 1;
            return SampleInsideBySize(sum, in, format, region, &tapsAcross, columns, &tapsDown, down.taps, 1);
        }
    }
    SampleTaps(sum, in, format, region, filter, across, down, u, v);
    return 0;
}

/// A part of the region, premultiplied; where it goes beyond the region the border goes on.
typedef struct Tile {
    int low, columns;  // its first column, and how many
    int top;           // its first row
    int pairs;         // of taps across; 0 when the part is too large to be held
    int opaque;        // all of it
    int first[LANES];
    Vector8 weights[LANES][MOST_TAPS / 2];
    Vector4 pixels[MOST_TILE_PIXELS];
} Tile;

DEVICE_FUNCTION Index8 FillTileRow(Vector4* row, AnyFrame in, int format, Region region, int line, int low, int columns,
                                   std::ptrdiff_t ahead, Index8 found) {
    const int from = ClampInt(low, 0, region.width - 1), to = ClampInt(low + columns, from + 1, region.width);
    const uchar* address = PixelAddress(in, format, line + from);
    const Vector8 ones = {1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f, 1.0f};
    int column = from - low;
    for (; column + 1 < to - low; column += 2, address += 2 * PixelBytes(format)) {
        __builtin_prefetch(address + ahead);
        const Vector8 pair = LoadPair(address, format), weighed = WeighPair(pair);
        found = NoteAlpha(found, pair);
        __builtin_memcpy(&row[column], &weighed, sizeof weighed);
    }
    if (column < to - low) {
        row[column] = LoadWeighed(in, format, line + low + column);
        found = NoteAlpha(found, LoadVector(in, format, line + low + column)[3] == 1.0f ? ones : Vector8{});
    }
    for (int c = 0; c < from - low; ++c) row[c] = row[from - low];
    for (int c = to - low; c < columns; ++c) row[c] = row[to - low - 1];
    return found;
}

DEVICE_FUNCTION void BeginTile(Tile* tile, AnyFrame in, int format, Region region, int filter, Reach across, Reach down,
                               const float* u, float firstV, float lastV) {
    const int taps = (across.taps + 1) & ~1;
    const int low = FirstTap(across, Min(u[0], u[LANES - 1])), high = FirstTap(across, Max(u[0], u[LANES - 1])) + taps;
    const int top = FirstTap(down, Min(firstV, lastV)), bottom = FirstTap(down, Max(firstV, lastV)) + down.taps;
    const int columns = (high - low + 3) & ~3;
    tile->pairs = 0;
    if (taps > MOST_TAPS || down.taps > MOST_TAPS || columns > MOST_TILE_COLUMNS || low >= region.width || high <= 0)
        return;
    if (columns * (bottom - top) > MOST_TILE_PIXELS) return;
    tile->low = low;
    tile->columns = columns;
    tile->top = top;
    tile->pairs = taps / 2;
    LaneTaps lanes;
    WeighTaps(&lanes, filter, across, taps, u);
    EACH_LANE(i) tile->first[i] = lanes.first[i] - low;
    for (int i = 0; i < LANES; ++i)
        for (int k = 0; k < taps / 2; ++k) tile->weights[i][k] = WeightsOfPair(&lanes, 2 * k, i);
    Index8 found = {};
    const std::ptrdiff_t rowBytes = static_cast<std::ptrdiff_t>(region.pitch) * PixelBytes(format);
    for (int row = top; row < bottom; ++row) {
        const int line = (region.top + ClampInt(row, 0, region.height - 1)) * region.pitch + region.left;
        found = FillTileRow(&tile->pixels[(row - top) * columns], in, format, region, line, low, columns,
                            row + 2 < bottom ? 2 * rowBytes : 0, found);
    }
    tile->opaque = FoundAllOpaque(found);
}

/// Sums down the tile's columns.
DEVICE_FUNCTION void SumColumns(Vector4* sums, const Tile* tile, int filter, Reach down, float v, int taps) {
    const int first = FirstTap(down, v);
    float weights[MOST_TAPS];
    float total = 0.0f;
    for (int j = 0; j < taps; ++j) {
        weights[j] = FilterWeight(filter, ((float)(first + j) + 0.5f - v) * down.inverse);
        total += weights[j];
    }
    if (down.stretch > 1.0f)
        for (int j = 0; j < taps; ++j) weights[j] /= total;
    const Vector4* corner = &tile->pixels[(first - tile->top) * tile->columns];
    for (int c = 0; c < tile->columns; c += 4) {
        Vector16 sum = {};
        for (int j = 0; j < taps; ++j) {
            Vector16 four;
            __builtin_memcpy(&four, corner + j * tile->columns + c, sizeof four);
            sum += four * weights[j];
        }
        __builtin_memcpy(&sums[c], &sum, sizeof sum);
    }
}

DEVICE_FUNCTION void SumPairs(Vector4* pixels, const Vector4* columns, const Tile* tile, int pairs) {
    for (int i = 0; i < LANES; ++i) {
        const Vector4* reached = &columns[tile->first[i]];
        Vector8 sum = {};
        for (int k = 0; k < pairs; ++k) {
            Vector8 pair;
            __builtin_memcpy(&pair, reached + 2 * k, sizeof pair);
            sum += pair * tile->weights[i][k];
        }
        pixels[i] = AddHalves(sum);
    }
}

DEVICE_FUNCTION int SampleTileLine(Lanes4* sum, const Tile* tile, AnyFrame in, int format, Region region, int filter,
                                   Reach across, Reach down, const float* u, const float* v) {
    if (tile->pairs == 0) {
        SampleTaps(sum, in, format, region, filter, across, down, u, v);
        return 0;
    }
    Vector4 columns[MOST_TILE_COLUMNS], pixels[LANES];
    // The commonest sizes, a halved picture's among them, with their bounds known: the loops over taps are unrolled.
    if (down.taps == 4)
        SumColumns(columns, tile, filter, down, v[0], 4);
    else if (down.taps == 2)
        SumColumns(columns, tile, filter, down, v[0], 2);
    else if (down.taps == 9)
        SumColumns(columns, tile, filter, down, v[0], 9);
    else
        SumColumns(columns, tile, filter, down, v[0], down.taps);
    if (tile->pairs == 2)
        SumPairs(pixels, columns, tile, 2);
    else if (tile->pairs == 1)
        SumPairs(pixels, columns, tile, 1);
    else if (tile->pairs == 5)
        SumPairs(pixels, columns, tile, 5);
    else
        SumPairs(pixels, columns, tile, tile->pairs);
    PutLanes(sum, pixels);
    if (tile->opaque != 0) EACH_LANE(i) sum->w[i] = 1.0f;
    return tile->opaque;
}
