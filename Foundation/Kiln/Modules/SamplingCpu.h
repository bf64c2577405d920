// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once
DEVICE_FUNCTION void SampleFiltered(Lanes4* sum, float* total, AnyFrame in, int format, Region region, int filter,
                                    Reach across, Reach down, const float* u, const float* v) {
    SampleTaps(sum, total, in, format, region, filter, across, down, u, v);
}
DEVICE_FUNCTION void SampleLine(Lanes4* sum, float* total, AnyFrame in, int format, Region region, int filter,
                                Reach across, Reach down, const float* u, float v) {
    float line[LANES];
    EACH_LANE(i) line[i] = v;
    SampleTaps(sum, total, in, format, region, filter, across, down, u, line);
}
