// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/EffectRunner.h"

#include <cmath>
#include <stdexcept>

namespace Vantrel::Host::Software {

ParameterValue EffectContext::Value(std::int32_t index) const {
    const Parameter* parameter = effect.FindParameter(index);
    return parameter ? parameter->At(time) : ParameterValue{};
}

std::int32_t EffectContext::Integer(std::int32_t index) const {
    return static_cast<std::int32_t>(std::lround(Number(index)));
}

void EffectRunner::Run(const EffectContext& context, LayerPicture& layer) {
    const EffectDetail& effect = *context.effect.AsEffect();
    if (const EffectFunction function = FindEffectFunction(effect.matchName)) {
        function(context, layer);
    } else {
        NotePassedThrough(effect.matchName);
    }
}

void EffectRunner::NotePassedThrough(const std::string& matchName) {
    if (mStrict) throw std::runtime_error("\"" + matchName + "\" has no software version");
    const std::lock_guard<std::mutex> hold(mMutex);
    mPassedThrough.insert(matchName);
}

std::vector<std::string> EffectRunner::GetPassedThrough() const {
    const std::lock_guard<std::mutex> hold(mMutex);
    return {mPassedThrough.begin(), mPassedThrough.end()};
}

}  // namespace Vantrel::Host::Software
