// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <iterator>

#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// Adds noise, evenly distributed over -amount..amount: c' = c + amount (2 u - 1). With color noise each channel has
/// its own u, else all three have one. u is made of bits of a hash, so that a frame looks the same whenever it is
/// rendered, and no two alike; in 32-bit arithmetic, with f the frame's number as the bits of a float,
///
///     scramble(h): h ^= h >> 16, h *= 0x7FEB352D, h ^= h >> 15, h *= 0x846CA68B, h ^= h >> 16
///     h = scramble(scramble(f ^ scramble(y)) + 0x9E3779B9 x)
///     u = top 24 bits / 2^24 of h for blue, of 0xC2B2AE35 h for green, of 0x85EBCA6B h for red
///
/// (the mixing function is C. Wellons' "lowbias32"). Clipping limits the result to 0..1. Alpha stays. The defaults
/// change nothing.
inline constexpr ParameterRow kNoiseParameters[] = {
    {0, "amount", ParameterType::kFloat, "%", 0, 100, {0}, nullptr, ParameterConversion::kPercent},
    {1, "color", ParameterType::kBool, "", 0, 1, {1}},
    {2, "clip", ParameterType::kBool, "", 0, 1, {0}},
};
inline constexpr EffectRow kNoiseEffect = {"TQ.XQVE Noise",
                                           "Noise",
                                           "Adds noise that changes from frame to frame.",
                                           kNoiseParameters,
                                           std::size(kNoiseParameters),
                                           true};

}  // namespace Vantrel
