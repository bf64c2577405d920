// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// The colour bars of SMPTE EG 1 as numbers, for nodes and device files. Three bands, top to bottom: a band is its
/// lower edge as a fraction of the height and eight stripes, left to right, each its right edge as a fraction of the
/// width, then blue, green and red. -I, +Q and the step below black lie outside of 0..1 and stay there.

#define BARS_STRIPES 8
#define BARS_BAND_SIZE (1 + 4 * BARS_STRIPES)
#define BARS_SIZE (3 * BARS_BAND_SIZE)

// clang-format off
#define BARS_PATTERN { \
    0.66f, \
    0.1428f, 0.75f, 0.75f, 0.75f,        0.2857f, 0.0f, 0.75f, 0.75f, \
    0.4286f, 0.75f, 0.75f, 0.0f,         0.5714f, 0.0f, 0.75f, 0.0f, \
    0.7143f, 0.75f, 0.0f, 0.75f,         0.8571f, 0.0f, 0.0f, 0.75f, \
    1.0f, 0.75f, 0.0f, 0.0f,             0.0f, 0.0f, 0.0f, 0.0f, \
    0.75f, \
    0.1428f, 0.75f, 0.0f, 0.0f,          0.2857f, 0.0f, 0.0f, 0.0f, \
    0.4286f, 0.75f, 0.0f, 0.75f,         0.5714f, 0.0f, 0.0f, 0.0f, \
    0.7143f, 0.75f, 0.75f, 0.0f,         0.8571f, 0.0f, 0.0f, 0.0f, \
    1.0f, 0.75f, 0.75f, 0.75f,           0.0f, 0.0f, 0.0f, 0.0f, \
    1.0f, \
    0.1786f, 0.4133f, 0.2477f, -0.0022f, 0.3571f, 1.0f, 1.0f, 1.0f, \
    0.5358f, 0.468f, -0.0019f, 0.253f,   0.7144f, 0.0f, 0.0f, 0.0f, \
    0.7626f, -0.04f, -0.04f, -0.04f,     0.8095f, 0.0f, 0.0f, 0.0f, \
    0.8571f, 0.04f, 0.04f, 0.04f,        1.0f, 0.0f, 0.0f, 0.0f }
// clang-format on
