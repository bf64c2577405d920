// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <map>

#include "Host/Software/EffectRunner.h"
#include "Host/Software/Effects/Invert.h"
#include "Vantrel/Effects/Invert.h"

/// The one place that knows which scalar function is which effect: it reads parameters and calls.
namespace Vantrel::Host::Software {

namespace {

void RunInvert(const EffectContext& context, LayerPicture& layer) {
    Invert(layer.picture, context.Integer(kInvert_Channel), context.Number(kInvert_Blend) / 100.0);
}

}  // namespace

EffectFunction FindEffectFunction(const std::string& matchName) {
    static const std::map<std::string, EffectFunction> kFunctions = {
        {"TQ.XQVE Invert", RunInvert},
    };
    const auto found = kFunctions.find(matchName);
    return found == kFunctions.end() ? nullptr : found->second;
}

}  // namespace Vantrel::Host::Software
