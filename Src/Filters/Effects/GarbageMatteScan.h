// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/Filters/Effects/GarbageMatteTable.h"

/// How a polygon masks a run of pixels of one line; part of device files, included behind Kiln/Device/Dialect.h.
///
/// A pixel's coverage is the exact area of it that lies inside by the even-odd rule. The line is cut where corners lie
/// and where edges cross each other. In such a strip the edges keep their order from left to right, the inside lies
/// between the first and the second, the third and the fourth, and an edge's share is the area to its right: added for
/// each first and taken off for each second.

#define MATTE_RUN 32

/// The edges that matter to a run, seen from its line: `x` at the line's upper border, moving by `slope` a line, there
/// from `low` to `high`, which lie in 0..1.
typedef struct LineEdges {
    float x[MATTE_CORNERS], slope[MATTE_CORNERS], low[MATTE_CORNERS], high[MATTE_CORNERS];
    int count;
} LineEdges;

/// An edge that doesn't pass a line's height has no part in it, nor has one whose ends are no places.
DEVICE_FUNCTION int IsEdge(PolyPoint a, PolyPoint b) {
    const float far = 1e9f;
    return (a.y < b.y || b.y < a.y) && Abs(a.x) < far && Abs(b.x) < far && Abs(a.y) < far && Abs(b.y) < far &&
           Abs(a.slope) < 1e30f;
}

/// Collects what a run needs. Edges to the right of it don't concern it; those that pass the whole line to its left
/// only turn inside and outside round. @return whether the run's beginning lies inside, as far as these say.
DEVICE_FUNCTION int CollectEdges(LineEdges* edges, GLOBAL const PolyPoint* points, int count, float left, float right,
                                 float top) {
    int inside = 0;
    edges->count = 0;
    for (int i = 0; i < count; ++i) {
        const PolyPoint a = points[i], b = points[i + 1];
        if (!IsEdge(a, b)) continue;
        const float low = Max(Min(a.y, b.y) - top, 0.0f), high = Min(Max(a.y, b.y) - top, 1.0f);
        if (!(low < high)) continue;
        const float x = a.x + (top - a.y) * a.slope;
        const float first = x + low * a.slope, last = x + high * a.slope;
        if (Min(first, last) >= right) continue;
        if (Max(first, last) <= left && low == 0.0f && high == 1.0f) {
            inside = 1 - inside;
            continue;
        }
        const int n = edges->count;
        edges->x[n] = x;
        edges->slope[n] = a.slope;
        edges->low[n] = low;
        edges->high[n] = high;
        edges->count = n + 1;
    }
    return inside;
}

/// Where the strip that begins at `from` ends: at the next corner or crossing.
DEVICE_FUNCTION float EndOfStrip(const LineEdges* edges, float from) {
    float end = 1.0f;
    for (int i = 0; i < edges->count; ++i) {
        if (edges->low[i] > from) end = Min(end, edges->low[i]);
        if (edges->high[i] > from) end = Min(end, edges->high[i]);
        for (int j = 0; j < i; ++j) {
            const float crossing = (edges->x[i] - edges->x[j]) / (edges->slope[j] - edges->slope[i]);
            if (crossing > from && crossing < end) end = crossing;
        }
    }
    return end;
}

/// The area to the right of an edge within a pixel, in a strip of height 1: the mean of a distance that goes evenly
/// from `a` to `b`, within 0..1.
DEVICE_FUNCTION float AreaBeyond(float a, float b) {
    const float low = Min(a, b), high = Max(a, b);
    const float first = Saturate(low), last = Saturate(high);
    const float sum = (first + last) * 0.5f * (last - first) + Max(high - 1.0f, 0.0f) - Max(low - 1.0f, 0.0f);
    return high - low > 1e-6f ? sum / (high - low) : first;
}

/// Adds a strip's shares to the coverage of the run's pixels.
DEVICE_FUNCTION void CoverStrip(float* coverage, const LineEdges* edges, float from, float end, float left,
                                int inside) {
    const float middle = 0.5f * (from + end);
    for (int i = 0; i < edges->count; ++i) {
        if (!(edges->low[i] <= middle && edges->high[i] >= middle)) continue;
        const float x = edges->x[i] + middle * edges->slope[i];
        int order = inside;
        for (int j = 0; j < edges->count; ++j) {
            const float other = edges->x[j] + middle * edges->slope[j];
            const int isLeft = other < x || (other == x && j < i);
            if (edges->low[j] <= middle && edges->high[j] >= middle && isLeft) ++order;
        }
        const float height = (order & 1) != 0 ? from - end : end - from;
        const float first = left + 1.0f - (edges->x[i] + from * edges->slope[i]);
        const float last = left + 1.0f - (edges->x[i] + end * edges->slope[i]);
        for (int p = 0; p < MATTE_RUN; ++p) coverage[p] += height * AreaBeyond(first + (float)p, last + (float)p);
    }
}

/// Masks the pixels from `x` to `end` of line y, at most MATTE_RUN of them.
DEVICE_FUNCTION void MaskRun(WorkFrame frame, int pitch, int format, GLOBAL const PolyPoint* points, int count, int x,
                             int end, int y) {
    LineEdges edges;
    const int inside = CollectEdges(&edges, points, count, (float)x, (float)end, (float)y);
    if (edges.count == 0 && inside != 0) return;
    float coverage[MATTE_RUN];
    for (int p = 0; p < MATTE_RUN; ++p) coverage[p] = (float)inside;
    float from = 0.0f;
    // As many strips as 16 edges can have corners and crossings; rounding makes no more of them.
    for (int strip = 0; edges.count != 0 && strip < 160 && from < 1.0f; ++strip) {
        const float next = EndOfStrip(&edges, from);
        CoverStrip(coverage, &edges, from, next, (float)x, inside);
        from = next;
    }
    for (int p = 0; p < end - x; ++p) {
        // What rounding left of nothing and of all.
        const float share = coverage[p] > 1e-4f ? coverage[p] : 0.0f;
        if (share > 1.0f - 1e-4f) continue;
        Float4 pixel = LoadPixel(frame, format, y * pitch + x + p);
        pixel.w = share > 0.0f ? pixel.w * share : 0.0f;
        StorePixel(frame, format, y * pitch + x + p, pixel);
    }
}
