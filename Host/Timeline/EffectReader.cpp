// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cmath>

#include "Host/Timeline/EffectTables.h"
#include "Host/Timeline/FieldReaders.h"
#include "Marl/BinaryData.h"

namespace Vantrel::Host {
namespace {

/// Slower and faster than anything means; beyond it in-points leave the range of times.
constexpr double kSlowest = 1e-5;
constexpr double kFastest = 1e5;

bool IsIndex(const std::string& key) {
    return !key.empty() && key.size() < 5 &&
           std::all_of(key.begin(), key.end(), [](char c) { return c >= '0' && c <= '9'; });
}

/// The type of a value whose effect isn't known.
ParameterType GuessType(const JsonCursor& value) {
    const nlohmann::json& json = value.Value();
    if (json.is_boolean()) return ParameterType::kBool;
    if (!json.is_array()) return ParameterType::kDouble;
    return json.size() == 2 ? ParameterType::kPoint : ParameterType::kColor;
}

class ParameterReader {
public:
    ParameterReader(const std::string& matchName, Parameter& parameter)
        : mMatchName(matchName), mParameter(parameter) {}

    void Read(const JsonCursor& at) const {
        mParameter.keys.clear();
        if (!at.Value().is_object()) {
            mParameter.value = ReadValue(at);
            return;
        }
        at.WarnOfOthers({"keyframes"});
        const JsonCursor keys = at.Get("keyframes");
        keys.ExpectArray();
        if (keys.Size() == 0) keys.Fail(Describe() + " has no keyframes");
        for (std::size_t i = 0; i < keys.Size(); ++i) ReadKey(keys.Element(i));
        mParameter.value = mParameter.keys.front().value;
    }

private:
    [[nodiscard]] std::string Describe() const { return "\"" + mParameter.name + "\" of \"" + mMatchName + "\""; }

    [[noreturn]] void FailType(const JsonCursor& at) const {
        at.Fail(Describe() + " is of type " + GetParameterTypeName(mParameter.type) + ", found " + at.KindName());
    }

    [[nodiscard]] std::int32_t FindChoice(const JsonCursor& at) const {
        std::string accepted;
        for (std::int32_t choice = 0; const char* name = mParameter.choiceName(choice); ++choice) {
            if (at.Text() == name) return choice;
            accepted += (accepted.empty() ? "" : ", ") + std::string(name);
        }
        at.Fail(Describe() + " has no choice \"" + at.Text() + "\"; accepted are " + accepted);
    }

    [[nodiscard]] ParameterValue ReadValue(const JsonCursor& at) const {
        const nlohmann::json& json = at.Value();
        ParameterValue value{};
        if (mParameter.type == ParameterType::kPoint || mParameter.type == ParameterType::kColor) {
            if (!json.is_array()) FailType(at);
            const bool point = mParameter.type == ParameterType::kPoint;
            const std::vector<double> numbers = point ? at.Numbers(2) : at.Numbers(4, 3);
            if (!point) value[3] = 1.0;
            std::copy(numbers.begin(), numbers.end(), value.begin());
            return value;
        }
        if (json.is_string() && mParameter.choiceName != nullptr) {
            value[0] = FindChoice(at);
            return value;
        }
        if (json.is_boolean() && mParameter.type == ParameterType::kBool) {
            value[0] = json.get<bool>() ? 1 : 0;
            return value;
        }
        if (!json.is_number()) FailType(at);
        value[0] = at.Number();
        if (mParameter.type == ParameterType::kBool && value[0] != 0 && value[0] != 1) FailType(at);
        return value;
    }

    [[nodiscard]] std::array<Handle, 4> ReadHandle(const JsonCursor& at) const {
        at.ExpectArray();
        if (at.Size() != 2) at.Fail("a handle is [time, value]");
        const double along = at.Element(0).Number();
        if (std::fabs(along) > 1) at.Element(0).Fail("a handle's time is a fraction of the span between two keys");
        std::array<Handle, 4> handles;
        const JsonCursor by = at.Element(1);
        const auto components = static_cast<std::size_t>(CountComponents(mParameter.type));
        const bool each = by.Value().is_array();
        const std::vector<double> values = each ? by.Numbers(components) : std::vector<double>(components, by.Number());
        for (std::size_t i = 0; i < components; ++i) handles[i] = {along, values[i]};
        return handles;
    }

    void ReadKey(const JsonCursor& at) const {
        at.ExpectObject();
        at.WarnOfOthers({"t", "value", "interp", "in", "out"});
        Keyframe key;
        const JsonCursor time = at.Get("t");
        key.time = ReadTime(time).ticks;
        key.value = ReadValue(at.Get("value"));
        if (const auto interp = at.Find("interp")) {
            key.interpolation = static_cast<Interpolation>(interp->Choice({"hold", "linear", "bezier"}));
        }
        if (const auto out = at.Find("out")) key.out = ReadHandle(*out);
        if (const auto in = at.Find("in")) key.in = ReadHandle(*in);
        if (!mParameter.keys.empty() && key.time <= mParameter.keys.back().time) {
            time.Fail("the keyframes of " + Describe() + " must rise in time");
        }
        mParameter.keys.push_back(key);
    }

    const std::string& mMatchName;
    Parameter& mParameter;
};

void ReadEffect(const JsonCursor& at, Item& item) {
    Effect effect;
    effect.path = at.Path();
    if (const auto name = at.Find("name")) effect.name = name->Text();
    if (const auto name = at.Find("effect_name")) effect.matchName = name->Text();
    const auto own = FindOwnMetadata(at);
    if (own) {
        own->WarnOfOthers({"match_name", "params", "lavfi", "opaque_data"});
        if (const auto name = own->Find("match_name")) effect.matchName = name->Text();
        if (const auto graph = own->Find("lavfi")) effect.filterGraph = graph->Text();
        if (const auto opaque = own->Find("opaque_data")) {
            Marl::BinaryData decoded;
            effect.opaqueData = opaque->Text();
            if (Marl::DecodeBinaryDataFromUTF8String(effect.opaqueData, decoded) != 0) opaque->Fail("not valid base64");
        }
    }
    constexpr const char* kGraphPrefix = "lavfi:";
    if (effect.matchName.rfind(kGraphPrefix, 0) == 0 && effect.filterGraph.empty()) {
        effect.filterGraph = effect.matchName.substr(std::string(kGraphPrefix).size());
    }
    const bool intrinsic = effect.matchName == kMotionMatchName || effect.matchName == kOpacityMatchName;
    const bool second = std::any_of(item.effects.begin(), item.effects.end(),
                                    [&](const Effect& other) { return other.matchName == effect.matchName; });
    if (intrinsic && second) at.Fail("\"" + effect.matchName + "\" stands more than once on \"" + item.name + "\"");
    effect.parameters = ReadParameters(effect.matchName, own ? own->Find("params") : std::nullopt);
    if (const EffectTable* table = FindEffectTable(effect.matchName)) effect.timeDependent = table->timeDependent;
    item.effects.push_back(std::move(effect));
}

void ReadWarp(const JsonCursor& at, const std::string& schema, Item& item) {
    if (schema == "FreezeFrame") {
        item.freeze = true;
        return;
    }
    const JsonCursor scalar = at.Get("time_scalar");
    const double speed = scalar.Number();
    if (speed == 0) {
        item.freeze = true;
        return;
    }
    if (std::fabs(speed) < kSlowest || std::fabs(speed) > kFastest) {
        scalar.Fail("a speed is 0 or lies between 0.00001 and 100000 in magnitude");
    }
    item.speed *= speed;
    if (std::fabs(item.speed) < kSlowest || std::fabs(item.speed) > kFastest) {
        scalar.Fail("the speeds of \"" + item.name + "\" multiply to less than 0.00001 or more than 100000");
    }
}

}  // namespace

std::vector<Parameter> ReadParameters(const std::string& matchName, const std::optional<JsonCursor>& params) {
    const EffectTable* table = FindEffectTable(matchName);
    std::vector<Parameter> parameters;
    if (table != nullptr) parameters = table->parameters;
    if (!params) return parameters;
    params->ExpectObject();
    for (const auto& member : params->Value().items()) {
        const std::string& key = member.key();
        const JsonCursor at = params->Get(key);
        if (table != nullptr) {
            const Parameter* known = table->Find(key);
            if (known == nullptr)
                at.Fail(std::string("\"").append(matchName).append("\" has no parameter \"").append(key).append("\""));
            ParameterReader(matchName, parameters[static_cast<std::size_t>(known->index)]).Read(at);
            continue;
        }
        Parameter parameter;
        parameter.name = key;
        const JsonCursor sample = at.Value().is_object() && at.Find("keyframes") && at.Get("keyframes").Size() > 0
                                      ? at.Get("keyframes").Element(0).Get("value")
                                      : at;
        parameter.type = GuessType(sample);
        parameter.index = IsIndex(key) ? std::stoi(key) : -1;
        ParameterReader(matchName, parameter).Read(at);
        parameters.push_back(std::move(parameter));
    }
    // Names of an unknown effect get the indices that its numbers leave free.
    std::int32_t next = 0;
    for (const Parameter& parameter : parameters) next = std::max(next, parameter.index + 1);
    for (Parameter& parameter : parameters) {
        if (parameter.index < 0) parameter.index = next++;
    }
    std::sort(parameters.begin(), parameters.end(),
              [](const Parameter& a, const Parameter& b) { return a.index < b.index; });
    return parameters;
}

void ReadEffects(const JsonCursor& object, Item& item) {
    const auto effects = object.Find("effects");
    if (!effects) return;
    effects->ExpectArray();
    for (std::size_t i = 0; i < effects->Size(); ++i) {
        const JsonCursor at = effects->Element(i);
        const std::string schema = at.GetSchema().name;
        if (const auto enabled = at.Find("enabled"); enabled && !enabled->Bool()) continue;
        if (schema == "Effect") {
            ReadEffect(at, item);
        } else if (schema == "LinearTimeWarp" || schema == "FreezeFrame") {
            ReadWarp(at, schema, item);
        } else if (schema == "TimeEffect") {
            at.Warn("a TimeEffect says nothing about time and is left out");
        } else {
            at.Fail("unknown schema \"" + schema + "\" of an effect");
        }
    }
}

}  // namespace Vantrel::Host
