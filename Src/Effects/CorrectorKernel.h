// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/Effects/ColorPixels.h"

/// The kernels of the correctors, for device files. All take these arguments first, and begin with the pixel `p` and
/// the share of it that is selected.
#define CORRECTOR_ARGUMENTS                                                                                    \
    WorkFrame frame, WorkPitch pitch, GLOBAL const float *mask, int maskPitch, FormatFlag format, Width width, \
        Height height
#define CORRECTOR_PIXEL(p, share) \
    PIXEL_IN_PLACE(p, x, y);      \
    const float share = SelectedShare(mask, y * maskPitch + x)

/// The kernels that are alike in all correctors: the tonal ranges, and the selection.
#define TONAL_RANGE_KERNEL(name)                                                          \
    POINTWISE_KERNEL(name, CORRECTOR_ARGUMENTS, float t0, float t1, float t2, float t3) { \
        PIXEL_IN_PLACE(p, x, y);                                                          \
        STORE_WORK(TonalView(p, t0, t1, t2, t3));                                         \
    }
#define MASK_KERNEL(name)                         \
    POINTWISE_KERNEL(name, CORRECTOR_ARGUMENTS) { \
        CORRECTOR_PIXEL(p, share);                \
        STORE_WORK(GreyPixel(p, share));          \
    }
