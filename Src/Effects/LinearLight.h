// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

/// From display values to linear ones and back (IEC 61966-2-1), beyond 0..1 too. Part of device files, included behind
/// Kiln/Device/Dialect.h.
DEVICE_FUNCTION float LinearLevel(float c) {
    const float power = Pow((c + 0.055f) * (1.0f / 1.055f), 2.4f);
    return c > 0.04045f ? power : c * (1.0f / 12.92f);
}

DEVICE_FUNCTION float DisplayLevel(float c) {
    const float power = 1.055f * Pow(c, 1.0f / 2.4f) - 0.055f;
    return c > 0.0031308f ? power : c * 12.92f;
}
