// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cstdio>
#include <iostream>
#include <memory>

#include <nlohmann/json.hpp>

#include "Commands.h"
#include "Vantrel/EffectTable.h"

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

std::size_t ComponentsOf(ParameterType type) {
    return type == ParameterType::kColor ? 4 : type == ParameterType::kPoint ? 2 : 1;
}

nlohmann::json DefaultOf(const ParameterRow& row) {
    if (row.type == ParameterType::kBool) return row.value[0] != 0;
    if (ComponentsOf(row.type) == 1) return row.value[0];
    nlohmann::json list = nlohmann::json::array();
    for (std::size_t i = 0; i < ComponentsOf(row.type); ++i) list.push_back(row.value[i]);
    return list;
}

nlohmann::json ChoicesOf(const ParameterRow& row) {
    nlohmann::json names = nlohmann::json::array();
    if (!row.choiceName) return names;
    for (auto choice = static_cast<std::int32_t>(row.minimum); choice <= static_cast<std::int32_t>(row.maximum);
         ++choice) {
        const char* name = row.choiceName(choice);
        names.push_back(name ? nlohmann::json(name) : nlohmann::json(nullptr));
    }
    return names;
}

void PrintJson() {
    nlohmann::json effects = nlohmann::json::array();
    for (const EffectRow* effect : kEffectTable) {
        nlohmann::json parameters = nlohmann::json::array();
        for (std::size_t i = 0; i < effect->parameterCount; ++i) {
            const ParameterRow& row = effect->parameters[i];
            nlohmann::json entry = {{"index", row.index},       {"name", row.name},       {"type", NameOf(row.type)},
                                    {"unit", row.unit},         {"minimum", row.minimum}, {"maximum", row.maximum},
                                    {"default", DefaultOf(row)}};
            if (row.choiceName) entry["choices"] = ChoicesOf(row);
            parameters.push_back(entry);
        }
        effects.push_back({{"matchName", effect->matchName},
                           {"label", effect->label},
                           {"summary", effect->summary},
                           {"parameters", parameters}});
    }
    std::cout << effects.dump(2) << "\n";
}

void PrintText() {
    for (const EffectRow* effect : kEffectTable) {
        std::printf("%s (%s)\n    %s\n", effect->matchName, effect->label, effect->summary);
        for (std::size_t i = 0; i < effect->parameterCount; ++i) {
            const ParameterRow& row = effect->parameters[i];
            const std::string unit = row.unit[0] != '\0' ? std::string(" ") + row.unit : "";
            std::printf("    %2d  %-16s %-8s %g to %g%s, default %s\n", row.index, row.name, NameOf(row.type),
                        row.minimum, row.maximum, unit.c_str(), DefaultOf(row).dump().c_str());
        }
    }
}

}  // namespace

void AddEffectsCommand(CLI::App& app, int& status) {
    CLI::App* command =
        app.add_subcommand("effects", "List the effects that render on a device, with their parameters");
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
