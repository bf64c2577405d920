// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Vellum/Timecode.h"

#include <algorithm>

#include <gtest/gtest.h>

namespace Vellum {
namespace {

TEST(Timecode, FramesAreNumberedAsEachDisplayDoes) {
    const FrameRate rate24 = FrameRate::FromFraction(24, 1), ntsc = FrameRate::FromFraction(30000, 1001);
    const FrameRate rate25 = FrameRate::FromFraction(25, 1), ntsc60 = FrameRate::FromFraction(60000, 1001);
    const struct {
        std::int64_t frame;
        FrameRate rate;
        std::int32_t display;
        const char* text;
    } kRows[] = {
        {0, rate25, kTimeDisplay_25, "00:00:00:00"},
        {25 * 3600 - 1, rate25, kTimeDisplay_25, "00:59:59:24"},
        {25LL * 3600 * 101, rate25, kTimeDisplay_25, "101:00:00:00"},
        {-26, rate25, kTimeDisplay_25, "-00:00:01:01"},
        {1799, ntsc, kTimeDisplay_2997Drop, "00:00:59;29"},
        {1800, ntsc, kTimeDisplay_2997Drop, "00:01:00;02"},
        {17981, ntsc, kTimeDisplay_2997Drop, "00:09:59;29"},
        {17982, ntsc, kTimeDisplay_2997Drop, "00:10:00;00"},
        {107892, ntsc, kTimeDisplay_2997Drop, "01:00:00;00"},
        {107892, ntsc, kTimeDisplay_2997, "00:59:56:12"},
        {3600, ntsc60, kTimeDisplay_5994Drop, "00:01:00;04"},
        {35964, ntsc60, kTimeDisplay_5994Drop, "00:10:00;00"},
        {3600, ntsc60, kTimeDisplay_5994, "00:01:00:00"},
        {49, rate24, kTimeDisplay_23976, "00:00:02:01"},
        {1234, rate24, kTimeDisplay_Frames, "1234"},
        {95, rate24, kTimeDisplay_Film16, "2+15"},
        {95, rate24, kTimeDisplay_Film35, "5+15"},
        {7, FrameRate(), kTimeDisplay_30, "00:00:00:00"},
    };
    for (const auto& row : kRows) {
        const TickTime start(row.frame, row.rate);
        EXPECT_EQ(TimeToTimecode(start, row.rate, row.display), row.text);
        if (row.frame < 0) continue;
        const TickTime end(start.GetTicks() + std::max<std::int64_t>(row.rate.GetTicksPerFrame(), 1) - 1);
        EXPECT_EQ(TimeToTimecode(end, row.rate, row.display), row.text) << "to the frame's end";
    }
}

}  // namespace
}  // namespace Vellum
