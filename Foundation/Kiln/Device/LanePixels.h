// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// How a pointwise kernel gets at its pixels in OpenCL, where a thread has LANES neighbouring ones. They are read
/// before its body and written behind it, so that on a CPU the body is a loop of arithmetic that becomes vector code;
/// PIXEL, PIXEL_IN_PLACE and POSITION open that loop, STORE and STORE_WORK close it. Arguments go by their fixed names.
/// Only lanes inside the picture are computed: a body may read tables of its size.

#define OPEN_LANES_(y)                                   \
    LANE_POSITION_IN(firstX_, y, lanes_, width, height); \
    const int y_ = y;                                    \
    Lanes4 result_
#define EACH_LANE_INSIDE_ for (int lane_ = 0; lane_ < lanes_; ++lane_)
#define READ_LANES_(frame, pitch) \
    Lanes4 pixels_;               \
    ReadLanes(&pixels_, frame, format, y_*(pitch) + firstX_, lanes_)
#define CLOSE_LANES_(value, frame, pitch) \
    SetLane(&result_, lane_, value);      \
    }                                     \
    WriteLanes(frame, format, y_*(pitch) + firstX_, lanes_, &result_)
#define FURTHER_PIXEL_(p, frame, pitch) const Float4 p = LoadPixel(frame, format, y_ * (pitch) + firstX_ + lane_)

#define OPEN_PIXELS_(p, x, y, frame, pitch) \
    OPEN_LANES_(y);                         \
    READ_LANES_(frame, pitch);              \
    EACH_LANE_INSIDE_ {                     \
        const int x = firstX_ + lane_;      \
        const Float4 p = GetLane(&pixels_, lane_)

#define POSITION(x, y)  \
    OPEN_LANES_(y);     \
    EACH_LANE_INSIDE_ { \
        const int x = firstX_ + lane_
#define PIXEL(p, x, y) OPEN_PIXELS_(p, x, y, in, inPitch)
#define PIXEL_IN_PLACE(p, x, y) OPEN_PIXELS_(p, x, y, frame, pitch)
#define SOURCE_PIXEL(p) FURTHER_PIXEL_(p, in, inPitch)
#define SECOND_PIXEL(p) FURTHER_PIXEL_(p, in2, in2Pitch)
#define THIRD_PIXEL(p) FURTHER_PIXEL_(p, in3, in3Pitch)
#define WORK_PIXEL(p) FURTHER_PIXEL_(p, frame, pitch)
#define STORE(value) CLOSE_LANES_(value, out, outPitch)
#define STORE_WORK(value) CLOSE_LANES_(value, frame, pitch)
