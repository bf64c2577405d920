// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// Two floats in one kernel argument of 8 bytes; included behind Dialect.h.

#if defined(__OPENCL_VERSION__)
typedef float2 Float2;
#else
typedef struct __attribute__((aligned(8))) Float2 {
    float x, y;
} Float2;
#endif
