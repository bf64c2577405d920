// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// The selection's record as the device holds it. Speaks C, for device files too; field names are those of the record.
typedef struct SecondaryParameters {
    float range0LowRamp, range0Low, range0HighRamp, range0High;  ///< hue, in turns
    float range1LowRamp, range1Low, range1HighRamp, range1High;  ///< saturation
    float range2LowRamp, range2Low, range2HighRamp, range2High;  ///< luma
    float blurRadiusX, blurRadiusY;                              ///< Gaussian, in pixels of the frame
    float maskAdjust;                                            ///< above 0 thins the edge
    int invertSelection;
    unsigned char fullCircle;  ///< equal hue edges stand for one whole turn
    unsigned char reserved[3];
} SecondaryParameters;
