// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// How a pointwise kernel gets at its pixels where each thread has its own: in CUDA, and in OpenCL where a file asks
/// for it. Arguments go by their fixed names.

#define POSITION(x, y)                                                  \
    const int x = THREAD_X, y = THREAD_Y;                               \
    if (x >= width || y >= height) return; /* grids are whole blocks */ \
    const int threadX_ = x, threadY_ = y
#define SOURCE_PIXEL(p) const Float4 p = LoadPixel(in, format, threadY_ * inPitch + threadX_)
#define SECOND_PIXEL(p) const Float4 p = LoadPixel(in2, format, threadY_ * in2Pitch + threadX_)
#define THIRD_PIXEL(p) const Float4 p = LoadPixel(in3, format, threadY_ * in3Pitch + threadX_)
#define WORK_PIXEL(p) const Float4 p = LoadPixel(frame, format, threadY_ * pitch + threadX_)
#define STORE(value) StorePixel(out, format, threadY_* outPitch + threadX_, value)
#define STORE_WORK(value) StorePixel(frame, format, threadY_* pitch + threadX_, value)
