// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Timeline/EffectTables.h"

#include <algorithm>
#include <utility>

#include "Vantrel/EffectTable.h"

namespace Vantrel::Host {
namespace {

/// The engine's list of an effect. Indices that nobody reads are filled, so that every index up to the highest one
/// exists.
EffectTable FromEngine(const EffectRow& effect) {
    EffectTable table;
    table.matchName = effect.matchName;
    table.timeDependent = effect.changesWithTime;
    for (std::size_t i = 0; i < effect.parameterCount; ++i) {
        const ParameterRow& row = effect.parameters[i];
        while (static_cast<std::int32_t>(table.parameters.size()) < row.index) {
            Parameter filler;
            filler.index = static_cast<std::int32_t>(table.parameters.size());
            table.parameters.push_back(filler);
        }
        Parameter parameter;
        parameter.index = row.index;
        parameter.name = row.name;
        parameter.type = row.type;
        parameter.value = row.value;
        parameter.choiceName = row.choiceName;
        table.parameters.push_back(std::move(parameter));
    }
    return table;
}

std::vector<EffectTable> MakeTables() {
    std::vector<EffectTable> tables;
    for (const EffectRow* effect : kEffectTable) tables.push_back(FromEngine(*effect));
    return tables;
}

}  // namespace

const Parameter* EffectTable::Find(const std::string& nameOrIndex) const {
    if (nameOrIndex.empty()) return nullptr;
    const auto found = std::find_if(parameters.begin(), parameters.end(), [&](const Parameter& parameter) {
        return parameter.name == nameOrIndex || std::to_string(parameter.index) == nameOrIndex;
    });
    return found != parameters.end() ? &*found : nullptr;
}

const EffectTable* FindEffectTable(const std::string& matchName) {
    const std::vector<EffectTable>& tables = GetEffectTables();
    const auto found = std::find_if(tables.begin(), tables.end(),
                                    [&](const EffectTable& table) { return table.matchName == matchName; });
    return found != tables.end() ? &*found : nullptr;
}

const std::vector<EffectTable>& GetEffectTables() {
    static const std::vector<EffectTable> kTables = MakeTables();
    return kTables;
}

}  // namespace Vantrel::Host
