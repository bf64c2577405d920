// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// The recursion of the single-channel blur, for device files:
///
///     forward  y[i] = a0 x[i] + a1 x[i-1] + b1 y[i-1] + b2 y[i-2]
///     backward y[i] = a2 x[i+1] + a3 x[i+2] + b1 y[i+1] + b2 y[i+2]
///
/// and the blurred value is their sum. Outside, x keeps the value at the edge, and y what it settles at for that.
typedef struct RecursionState {
    float input1[LANES], input2[LANES], output1[LANES], output2[LANES];
} RecursionState;

DEVICE_FUNCTION void StartForward(RecursionState* s, const float* edge, float a0, float a1, float b1, float b2) {
    const float settled = (a0 + a1) / (1.0f - b1 - b2);
    EACH_LANE(i) {
        s->input1[i] = edge[i];
        s->output1[i] = edge[i] * settled;
        s->output2[i] = edge[i] * settled;
    }
}

/// The next output is left in output1.
DEVICE_FUNCTION void StepForward(RecursionState* s, const float* x, float a0, float a1, float b1, float b2) {
    EACH_LANE(i) {
        const float y = a0 * x[i] + a1 * s->input1[i] + b1 * s->output1[i] + b2 * s->output2[i];
        s->input1[i] = x[i];
        s->output2[i] = s->output1[i];
        s->output1[i] = y;
    }
}

DEVICE_FUNCTION void StartBackward(RecursionState* s, const float* edge, float a2, float a3, float b1, float b2) {
    const float settled = (a2 + a3) / (1.0f - b1 - b2);
    EACH_LANE(i) {
        s->input1[i] = edge[i];
        s->input2[i] = edge[i];
        s->output1[i] = edge[i] * settled;
        s->output2[i] = edge[i] * settled;
    }
}

/// Gives the output of the place whose input `x` is, and goes on to the one before.
DEVICE_FUNCTION void StepBackward(RecursionState* s, const float* x, float a2, float a3, float b1, float b2) {
    EACH_LANE(i) {
        const float y = a2 * s->input1[i] + a3 * s->input2[i] + b1 * s->output1[i] + b2 * s->output2[i];
        s->input2[i] = s->input1[i];
        s->input1[i] = x[i];
        s->output2[i] = s->output1[i];
        s->output1[i] = y;
    }
}
