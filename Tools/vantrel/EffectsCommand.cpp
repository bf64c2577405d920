// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cstdio>
#include <iostream>
#include <memory>

#include <nlohmann/json.hpp>

#include "Commands.h"
#include "Vantrel/EffectTable.h"
#include "Vantrel/TransitionTable.h"

namespace Vantrel::Tool {

namespace {

const char* NameOf(ParameterType type) {
    switch (type) {
        case ParameterType::kBool:
            return "bool";
        case ParameterType::kByte:
        case ParameterType::kShort:
        case ParameterType::kInt:
        case ParameterType::kInt64:
            return "integer";
        case ParameterType::kFloat:
        case ParameterType::kDouble:
            return "number";
        case ParameterType::kColor:
            return "color";
        case ParameterType::kPoint:
            return "point";
    }
    return "";
}

std::size_t ComponentsOf(const ParameterRow& row) {
    return row.type == ParameterType::kColor ? 4 : row.type == ParameterType::kPoint ? 2 : 1;
}

/// A transition's colour has no alpha.
std::size_t ComponentsOf(const TransitionProperty& row) { return row.type == ParameterType::kColor ? 3 : 1; }

template <class Row>
nlohmann::json DefaultOf(const Row& row) {
    if (row.type == ParameterType::kBool) return row.value[0] != 0;
    if (ComponentsOf(row) == 1) return row.value[0];
    nlohmann::json list = nlohmann::json::array();
    for (std::size_t i = 0; i < ComponentsOf(row); ++i) list.push_back(row.value[i]);
    return list;
}

template <class Row>
nlohmann::json ChoicesOf(const Row& row) {
    nlohmann::json names = nlohmann::json::array();
    for (auto choice = static_cast<std::int32_t>(row.minimum); choice <= static_cast<std::int32_t>(row.maximum);
         ++choice) {
        const char* name = row.choiceName(choice);
        names.push_back(name ? nlohmann::json(name) : nlohmann::json(nullptr));
    }
    return names;
}

/// A parameter or a property.
template <class Row>
nlohmann::json DescribeRow(const Row& row) {
    nlohmann::json entry = {{"name", row.name},       {"type", NameOf(row.type)}, {"unit", row.unit},
                            {"minimum", row.minimum}, {"maximum", row.maximum},   {"default", DefaultOf(row)}};
    if (row.choiceName) entry["choices"] = ChoicesOf(row);
    return entry;
}

/// An effect or a transition.
template <class Row>
nlohmann::json DescribeHead(const Row& row, const char* kind) {
    return {{"kind", kind}, {"matchName", row.matchName}, {"label", row.label}, {"summary", row.summary}};
}

void PrintJson() {
    nlohmann::json list = nlohmann::json::array();
    for (const EffectRow* effect : kEffectTable) {
        nlohmann::json parameters = nlohmann::json::array();
        for (std::size_t i = 0; i < effect->parameterCount; ++i) {
            nlohmann::json entry = DescribeRow(effect->parameters[i]);
            entry["index"] = effect->parameters[i].index;
            entry["goesTo"] = effect->parameters[i].goesTo;
            parameters.push_back(entry);
        }
        nlohmann::json entry = DescribeHead(*effect, "effect");
        entry["parameters"] = parameters;
        list.push_back(entry);
    }
    for (const TransitionRow& transition : kTransitionTable) {
        nlohmann::json entry = DescribeHead(transition, "transition");
        entry["properties"] = nlohmann::json::array();
        for (std::size_t i = 0; i < transition.propertyCount; ++i) {
            entry["properties"].push_back(DescribeRow(transition.properties[i]));
        }
        list.push_back(entry);
    }
    std::cout << list.dump(2) << "\n";
}

template <class Row>
void PrintRow(const Row& row) {
    const std::string unit = row.unit[0] != '\0' ? std::string(" ") + row.unit : "";
    std::printf("%-34s %-8s %g to %g%s, default %s\n", row.name, NameOf(row.type), row.minimum, row.maximum,
                unit.c_str(), DefaultOf(row).dump().c_str());
}

void PrintText() {
    for (const EffectRow* effect : kEffectTable) {
        std::printf("%s (%s)\n    %s\n", effect->matchName, effect->label, effect->summary);
        for (std::size_t i = 0; i < effect->parameterCount; ++i) {
            std::printf("    %2d  ", effect->parameters[i].index);
            PrintRow(effect->parameters[i]);
        }
    }
    for (const TransitionRow& transition : kTransitionTable) {
        std::printf("%s (%s, a transition)\n    %s\n", transition.matchName, transition.label, transition.summary);
        for (std::size_t i = 0; i < transition.propertyCount; ++i) {
            std::printf("        ");
            PrintRow(transition.properties[i]);
        }
    }
}

}  // namespace

void AddEffectsCommand(CLI::App& app, int& status) {
    CLI::App* command =
        app.add_subcommand("effects", "List the effects and transitions that render on a device, with what can be set");
    const auto json = std::make_shared<bool>(false);
    command->add_flag("--json", *json, "As JSON");
    command->callback([json, &status] {
        if (*json) {
            PrintJson();
        } else {
            PrintText();
        }
        status = kExit_Done;
    });
}

}  // namespace Vantrel::Tool
