// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/Effects/ColorPixels.h"

/// The kernels of the correctors, for device files. All take these arguments first.
#define CORRECTOR_ARGUMENTS                                                                                    \
    WorkFrame frame, WorkPitch pitch, GLOBAL const float *mask, int maskPitch, FormatFlag format, Width width, \
        Height height

/// A kernel that is made for pictures with and without a selection, and again for values whose powers all are 1, which
/// spares the light case the powers.
#define CORRECTOR_CHOICE(hasPowers) (((hasPowers) ? 2 : 0) + (mask ? 1 : 0))
#define CORRECTOR_KERNEL(Name, hasPowers, ...) \
    POINTWISE_CHOICES(Name, 4, CORRECTOR_CHOICE(hasPowers), CORRECTOR_ARGUMENTS, __VA_ARGS__)

/// Declares the pixel `p`, the share of it that is selected, and whether there are powers.
#define CORRECTOR_PIXEL(p, share, powers, hasPowers) \
    CHOICE(CORRECTOR_CHOICE(hasPowers));             \
    PIXEL_IN_PLACE(p, x, y);                         \
    const int powers = choice & 2;                   \
    const float share = (choice & 1) != 0 ? mask[y * maskPitch + x] : 1.0f

/// The kernels that are alike in all correctors: the tonal ranges, and the selection.
#define TONAL_RANGE_KERNEL(name)                                                          \
    POINTWISE_KERNEL(name, CORRECTOR_ARGUMENTS, float t0, float t1, float t2, float t3) { \
        PIXEL_IN_PLACE(p, x, y);                                                          \
        STORE_WORK(TonalView(p, t0, t1, t2, t3));                                         \
    }
#define MASK_KERNEL(name)                                                \
    POINTWISE_KERNEL(name, CORRECTOR_ARGUMENTS) {                        \
        PIXEL_IN_PLACE(p, x, y);                                         \
        STORE_WORK(GreyPixel(p, mask ? mask[y * maskPitch + x] : 1.0f)); \
    }
