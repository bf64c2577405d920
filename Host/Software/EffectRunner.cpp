// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/EffectRunner.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdio>
#include <stdexcept>

namespace Vantrel::Host::Software {

namespace {

std::string FormatNumber(double value) {
    std::array<char, 32> text{};
    (void)std::snprintf(text.data(), text.size(), "%.9g", value);
    return text.data();
}

std::string FormatColor(const ParameterValue& value) {
    std::array<char, 16> text{};
    std::array<unsigned, 4> bytes{};
    for (std::size_t c = 0; c < bytes.size(); ++c) {
        bytes[c] = static_cast<unsigned>(std::lround(std::clamp(value[c], 0.0, 1.0) * 255.0));
    }
    (void)std::snprintf(text.data(), text.size(), "0x%02X%02X%02X%02X", bytes[0], bytes[1], bytes[2], bytes[3]);
    return text.data();
}

std::string FormatParameter(const EffectDetail& effect, const std::string& name, std::int64_t time) {
    for (const Parameter& parameter : effect.parameters) {
        const ParameterValue value = parameter.At(time);
        if (parameter.type == ParameterType::kPoint) {
            if (name == parameter.name + ".x") return FormatNumber(value[0]);
            if (name == parameter.name + ".y") return FormatNumber(value[1]);
        } else if (name == parameter.name) {
            return parameter.type == ParameterType::kColor ? FormatColor(value) : FormatNumber(value[0]);
        }
    }
    throw std::runtime_error("the filter graph \"" + effect.filterGraph + "\" names {" + name +
                             "}, which is no parameter of its effect");
}

}  // namespace

std::string FillInParameters(const EffectDetail& effect, std::int64_t time) {
    const std::string& graph = effect.filterGraph;
    std::string filled;
    for (std::size_t at = 0; at < graph.size();) {
        const std::size_t open = graph.find('{', at);
        const std::size_t close = graph.find('}', open == std::string::npos ? graph.size() : open);
        filled += graph.substr(at, open == std::string::npos ? open : open - at);
        if (open == std::string::npos) break;
        if (close == std::string::npos) throw std::runtime_error("the filter graph \"" + graph + "\" lacks a brace");
        filled += FormatParameter(effect, graph.substr(open + 1, close - open - 1), time);
        at = close + 1;
    }
    return filled;
}

void EffectRunner::Run(const Node& node, EffectContext context, LayerPicture& layer) {
    const EffectDetail& effect = *node.AsEffect();
    const std::int64_t time = context.time;
    if (const EffectFunction function = FindEffectFunction(effect.matchName)) {
        context.matchName = effect.matchName;
        context.value = [&node, time](std::int32_t index) {
            const Parameter* parameter = node.FindParameter(index);
            return parameter ? parameter->At(time) : ParameterValue{};
        };
        function(context, layer);
    } else if (!effect.filterGraph.empty()) {
        mGraphs.Run(FillInParameters(effect, time), time, layer);
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
