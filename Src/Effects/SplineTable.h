// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#define SPLINE_POINTS 16

/// A curve as the device holds it. Speaks C, for device files too; field names are those of the record.
typedef struct SplineTable {
    float x[SPLINE_POINTS];
    float y[SPLINE_POINTS];
    float solution[SPLINE_POINTS];  ///< second derivatives; what lies beyond `count` means nothing
    unsigned long count;            ///< 64 bits on all targets
} SplineTable;
