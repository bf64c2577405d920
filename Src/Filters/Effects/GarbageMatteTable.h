// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// A garbage matte's polygon as devices hold it. Speaks C, for device files too.

#define MATTE_CORNERS 16

/// A corner in pixels, and by how much the edge to the next one moves across in a line; of a level edge that is no
/// number or an endless one.
typedef struct PolyPoint {
    float x;
    float y;
    float slope;
} PolyPoint;

/// The polygon is closed by the corner behind its last; the others behind that are the same.
typedef struct PolyTable {
    PolyPoint points[MATTE_CORNERS + 1];
    int layout;  ///< on OpenCL: twice the frame's pitch in pixels, and 1 more where its pixels are 32-bit floats
} PolyTable;
