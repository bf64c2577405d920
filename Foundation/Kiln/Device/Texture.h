// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// Sampling textures. Positions are in texels, with texel centres at halves. A texture argument is declared as
/// `Texture name`.

#include "Kiln/Device/TextureDescriptor.h"

typedef GLOBAL const TextureDescriptor* Texture;

/// Where an index beyond the edges reads; -1 for the border, which is transparent black.
DEVICE_FUNCTION int TextureIndex(int i, int size, int mode) {
    if (mode == TEXTURE_ADDRESS_CLAMP) return ClampInt(i, 0, size - 1);
    if (mode == TEXTURE_ADDRESS_BORDER) return i < 0 || i >= size ? -1 : i;
    const int period = mode == TEXTURE_ADDRESS_MIRROR ? 2 * size : size;
    const int remainder = i % period;
    const int wrapped = remainder < 0 ? remainder + period : remainder;
    return wrapped < size ? wrapped : period - 1 - wrapped;
}

#if defined(__OPENCL_VERSION__)
DEVICE_FUNCTION AnyFrame TextureTexels(Texture texture) { return (AnyFrame)texture + TEXTURE_TEXELS_OFFSET; }
#else
DEVICE_FUNCTION AnyFrame TextureTexels(Texture texture) {
    return texture->texels != 0 ? (const uchar*)texture->texels : (const uchar*)texture + TEXTURE_TEXELS_OFFSET;
}
#endif

DEVICE_FUNCTION Float4 LoadTexel(Texture texture, int x, int y) {
    const int column = TextureIndex(x, texture->width, texture->addressMode);
    const int row = TextureIndex(y, texture->height, texture->addressMode);
    if (column < 0 || row < 0) return Splat4(0.0f);
    return LoadPixel(TextureTexels(texture), texture->format, row * texture->pitch + column);
}

/// A tap's part in a sum over several: colour counts by its coverage, so that what is transparent doesn't bleed.
DEVICE_FUNCTION Float4 CoveredTap(Float4 texel, float weight) {
    const float covered = texel.w * weight;
    return Make4(texel.x * covered, texel.y * covered, texel.z * covered, covered);
}
/// The colour of such a sum, straight again.
DEVICE_FUNCTION Float4 StraightSum(Float4 sum) {
    const float scale = sum.w != 0.0f ? 1.0f / sum.w : 0.0f;
    return Make4(sum.x * scale, sum.y * scale, sum.z * scale, sum.w);
}

/// As the texture's filter mode says.
DEVICE_FUNCTION Float4 SampleTexture(Texture texture, float x, float y) {
    if (texture->filterMode == TEXTURE_FILTER_POINT) return LoadTexel(texture, (int)Floor(x), (int)Floor(y));
    const float left = Floor(x - 0.5f), top = Floor(y - 0.5f);
    const float fx = x - 0.5f - left, fy = y - 0.5f - top;
    const int column = (int)left, row = (int)top;
    Float4 sum = CoveredTap(LoadTexel(texture, column, row), (1.0f - fx) * (1.0f - fy));
    sum = Add4(sum, CoveredTap(LoadTexel(texture, column + 1, row), fx * (1.0f - fy)));
    sum = Add4(sum, CoveredTap(LoadTexel(texture, column, row + 1), (1.0f - fx) * fy));
    return StraightSum(Add4(sum, CoveredTap(LoadTexel(texture, column + 1, row + 1), fx * fy)));
}

/// Fetches LANES texels by column and row.
DEVICE_FUNCTION void FetchTexels(Lanes4* lanes, Texture texture, const int* column, const int* row) {
    int index[LANES];
    const int mode = texture->addressMode;
    EACH_LANE(i) {
        const int x = TextureIndex(column[i], texture->width, mode);
        const int y = TextureIndex(row[i], texture->height, mode);
        index[i] = (x | y) < 0 ? -1 : y * texture->pitch + x;
    }
    if (texture->format == 0)
        FetchLanesOrClear(lanes, TextureTexels(texture), 0, index);
    else
        FetchLanesOrClear(lanes, TextureTexels(texture), 1, index);
}

/// As SampleTexture, at LANES positions.
DEVICE_FUNCTION void SampleTextureLanes(Lanes4* lanes, Texture texture, const float* x, const float* y) {
    int column[LANES], row[LANES];
    if (texture->filterMode == TEXTURE_FILTER_POINT) {
        EACH_LANE(i) {
            column[i] = (int)Floor(x[i]);
            row[i] = (int)Floor(y[i]);
        }
        FetchTexels(lanes, texture, column, row);
        return;
    }
    ClearLanes(lanes);
    for (int tap = 0; tap < 4; ++tap) {
        float weight[LANES];
        Lanes4 texels;
        EACH_LANE(i) {
            const float left = Floor(x[i] - 0.5f), top = Floor(y[i] - 0.5f);
            const float fx = x[i] - 0.5f - left, fy = y[i] - 0.5f - top;
            column[i] = (int)left + (tap & 1);
            row[i] = (int)top + (tap >> 1);
            weight[i] = ((tap & 1) != 0 ? fx : 1.0f - fx) * ((tap & 2) != 0 ? fy : 1.0f - fy);
        }
        FetchTexels(&texels, texture, column, row);
        EACH_LANE(i) SetLane(lanes, i, Add4(GetLane(lanes, i), CoveredTap(GetLane(&texels, i), weight[i])));
    }
    EACH_LANE(i) SetLane(lanes, i, StraightSum(GetLane(lanes, i)));
}
