// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// Curves for device files, in the lanes idiom: a curve is the same for all lanes, so that each of its segments is one
/// plain loop over them, and no pixel searches for its own. Formulas: Vantrel/Effects/Curves.h.

#include "Src/Effects/CorrectorKernel.h"
#include "Src/Effects/SplineTable.h"

/// As many as the colours of all lanes, which pay a segment's preparation once.
#define CURVE_VALUES (3 * LANES)

/// A curve that adds nothing.
DEVICE_FUNCTION int IsDiagonal(GLOBAL const SplineTable* curve, int count) {
    int diagonal = 1;
    for (int k = 0; k < count; ++k) {
        if (curve->x[k] != curve->y[k]) diagonal = 0;
    }
    return diagonal;
}

/// Adds to each of the first `size` values what the curve adds at it: `size` is a constant, at most CURVE_VALUES. The
/// spline of y - x adds what the spline of y would give, and nothing at all on a straight diagonal. Each segment counts
/// with its rise up to the value: all of it for what lies beyond, nothing for what lies before, so what is beyond the
/// ends keeps the offset of the end, and what isn't a number stays so.
DEVICE_FUNCTION void ApplyCurve(float* values, int size, GLOBAL const SplineTable* curve) {
    float sum[CURVE_VALUES];
    const int count = ClampInt((int)curve->count, 0, SPLINE_POINTS);
    if (IsDiagonal(curve, count)) return;
    const float start = curve->y[0] - curve->x[0];
    for (int i = 0; i < size; ++i) sum[i] = start;
    int last = 0;
    for (int k = 1; k < count; ++k) {
        const float left = curve->x[last];
        const float span = curve->x[k] - left;
        if (span > 0.0f) {
            const float rise = (curve->y[k] - curve->x[k]) - (curve->y[last] - left);
            const float bend0 = curve->solution[last], bend1 = curve->solution[k];
            const float slope = rise / span - span * (2.0f * bend0 + bend1) * (1.0f / 6.0f);
            const float square = 0.5f * bend0;
            const float cube = (bend1 - bend0) / (6.0f * span);
            for (int i = 0; i < size; ++i) {
                const float t = Clamp(values[i] - left, 0.0f, span);
                sum[i] += t * (slope + t * (square + t * cube));
            }
            last = k;
        }
    }
    for (int i = 0; i < size; ++i) values[i] += sum[i];
}

/// The corrected pixels where the selection is whole, the pixels themselves where there is none. `index` is that of the
/// first lane in the mask.
DEVICE_FUNCTION void MixSelectedLanes(Lanes4* corrected, const Lanes4* pixels, GLOBAL const float* mask, int index,
                                      int lanes) {
    if (mask == 0) return;
    EACH_LANE(i) {
        const float share = mask[index + MinInt(i, lanes - 1)];
        SetLane(corrected, i, MixSelected(GetLane(pixels, i), GetLane(corrected, i), share));
    }
}

DEVICE_FUNCTION void GreyLanes(Lanes4* pixels) {
    EACH_LANE(i) {
        const Float4 p = GetLane(pixels, i);
        SetLane(pixels, i, GreyPixel(p, PixelLuma(p)));
    }
}

/// The two kernels that a curve effect has besides the mask's: `correct` changes the Lanes4 `corrected`, and `finish`
/// makes of it what is shown.
#define CURVE_BODY(correct, finish)                                       \
    LANE_POSITION(x, y, lanes);                                           \
    Lanes4 pixels, corrected;                                             \
    ReadLanes(&pixels, frame, format, y* pitch + x, lanes);               \
    EACH_LANE(i) SetLane(&corrected, i, GetLane(&pixels, i));             \
    correct;                                                              \
    MixSelectedLanes(&corrected, &pixels, mask, y* maskPitch + x, lanes); \
    finish;                                                               \
    WriteLanes(frame, format, y* pitch + x, lanes, &corrected)
