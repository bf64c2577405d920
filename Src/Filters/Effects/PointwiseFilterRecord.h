// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// What a pointwise filter does, as the device holds it. Speaks C, for device files too. The values of each type: the
/// functions that fill them (PointwiseFilterRecords.cpp) and that use them (PointwiseFilterHostNode.kernel) are in the
/// order of the types; the formulas are in the effects' headers.
typedef struct PointwiseFilterRecord {
    int type;
    float r1, r2, r3, r4, r5, r6, r7, r8, r9, r10, r11;
} PointwiseFilterRecord;

enum PointwiseFilterType {
    kPointwise_AlphaAdjust = 0,
    kPointwise_BlackAndWhite = 1,
    kPointwise_BrightnessContrast = 2,
    kPointwise_ColorBalance = 3,
    kPointwise_ColorPass = 4,
    kPointwise_ColorReplace = 5,
    kPointwise_EdgeFeather = 6,
    kPointwise_Extract = 7,
    kPointwise_FastCorrector = 8,
    kPointwise_FastCorrectorLuma = 9,
    kPointwise_FastCorrectorMask = 10,
    kPointwise_GammaCorrection = 11,
    kPointwise_HorizontalFlip = 12,
    kPointwise_Noise = 13,
    kPointwise_ProcAmp = 14,
    kPointwise_Tint = 15,
    kPointwise_VerticalFlip = 16
};
