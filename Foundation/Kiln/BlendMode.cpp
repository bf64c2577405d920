// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Kiln/BlendMode.h"

#include <array>
#include <cstddef>
#include <cstring>

namespace Kiln {
namespace {

constexpr std::array<const char*, kBlend_Count> kNames = {
    "color",        "color_burn",   "color_dodge", "darken",      "darker_color", "difference",    "dissolve",
    "exclusion",    "hard_light",   "hard_mix",    "hue",         "lighten",      "lighter_color", "linear_burn",
    "linear_dodge", "linear_light", "luminosity",  "multiply",    "normal",       "overlay",       "pin_light",
    "saturation",   "screen",       "soft_light",  "vivid_light", "subtract",     "divide"};

}  // namespace

const char* GetBlendModeName(std::int32_t mode) {
    return mode >= 0 && mode < kBlend_Count ? kNames[static_cast<std::size_t>(mode)] : nullptr;
}

std::int32_t FindBlendMode(const char* name) {
    for (std::size_t mode = 0; mode < kNames.size(); ++mode) {
        if (std::strcmp(kNames[mode], name) == 0) return static_cast<std::int32_t>(mode);
    }
    return -1;
}

}  // namespace Kiln
