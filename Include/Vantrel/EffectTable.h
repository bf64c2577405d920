// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstring>

#include "Vantrel/Effects/Intrinsics.h"
#include "Vantrel/Effects/Invert.h"
#include "Vantrel/Effects/LumaCorrector.h"

/// The effects and their parameters as data, the one place where an index, a name or a default is told: nodes read by
/// these indices, hosts read files and list effects by these rows. An effect is a header in Vantrel/Effects and a line
/// here.
namespace Vantrel {

inline constexpr const EffectRow* kEffectTable[] = {
    &kMotionEffect,
    &kOpacityEffect,
    &kInvertEffect,
    &kLumaCorrectorEffect,
};

/// The effect of that match name, or null.
[[nodiscard]] inline const EffectRow* FindEffect(const char* matchName) {
    for (const EffectRow* effect : kEffectTable) {
        if (std::strcmp(effect->matchName, matchName) == 0) return effect;
    }
    return nullptr;
}

}  // namespace Vantrel
