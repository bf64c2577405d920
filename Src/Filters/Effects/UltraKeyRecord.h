// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// A keyer's record as the device holds it. Speaks C, for device files too. Ramps are of Vantrel/Effects/UltraKey.h.
typedef struct UltraKeyParams {
    float spillRange;        ///< ramp
    float spillAmount;       ///< -1 none, 0 all of it
    float tolerance;         ///< fraction
    float desaturation;      ///< ramp
    float transparency;      ///< ramp
    float shadow;            ///< 0 to -2
    float highlight;         ///< 0 to 2
    float restoredLuma;      ///< 0 to 2
    float pedestalGain;      ///< 1 + pedestal
    float pedestal;          ///< fraction
    float analysis[9];       ///< rows: two chromas and luma, of linear red, green, blue
    float output[12];        ///< for red, green, blue and 1: what chromas and luma weigh, the colour matrix included
    float reserved[4];       ///< nobody's
    float contrastGain;      ///< 1 + contrast
    float contrastOffset;    ///< keeps the mid point
    float keyChroma[2];      ///< both over luma
    float keyLuma;           ///< above 0
    float keyInverseLength;  ///< of the chroma; huge for a key without a hue
} UltraKeyParams;

/// The furthest that a stage reaches, in pixels; also the room that a device thread keeps for neighbours.
#define ULTRA_KEY_REACH 31
