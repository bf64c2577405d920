// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Timeline/EffectTables.h"

#include <algorithm>
#include <initializer_list>
#include <utility>

#include "Vantrel/EffectTable.h"

namespace Vantrel::Host {
namespace {

using Type = ParameterType;

/// Puts a table together; indices that nobody reads are filled so that every index up to the highest one exists.
class Builder {
public:
    explicit Builder(const char* matchName) { mTable.matchName = matchName; }

    Builder& Row(std::int32_t index, std::string name, Type type, ParameterValue value = {},
                 const char* (*choiceName)(std::int32_t) = nullptr) & {
        while (static_cast<std::int32_t>(mTable.parameters.size()) < index) {
            Parameter filler;
            filler.index = static_cast<std::int32_t>(mTable.parameters.size());
            mTable.parameters.push_back(filler);
        }
        Parameter parameter;
        parameter.index = index;
        parameter.name = std::move(name);
        parameter.type = type;
        parameter.value = value;
        parameter.choiceName = choiceName;
        mTable.parameters.push_back(std::move(parameter));
        return *this;
    }

    /// Rows from `first` on of one type, with their names and values.
    Builder& Rows(std::int32_t first, Type type, std::initializer_list<std::pair<const char*, double>> rows) & {
        for (const auto& [name, value] : rows) Row(first++, name, type, {value});
        return *this;
    }

    Builder& DependsOnTime() & {
        mTable.timeDependent = true;
        return *this;
    }

    [[nodiscard]] EffectTable Finish() & { return std::move(mTable); }

private:
    EffectTable mTable;
};

EffectTable Timecode() {
    Builder table("TQ.XQVE Lspr Timecode");
    table.Row(0, "position", Type::kPoint, {0.5, 0.9})
        .Rows(1, Type::kFloat, {{"size", 20}, {"opacity", 100}})
        .Row(3, "field_symbol", Type::kBool)
        .Rows(4, Type::kInt, {{"format", 0}, {"source", 0}, {"time_display", 0}})
        .Row(7, "offset", Type::kFloat)
        .Rows(8, Type::kInt, {{"starting_frame", 0}, {"label", 0}})
        .DependsOnTime();
    return table.Finish();
}

/// An effect that the engine lists itself.
EffectTable FromEngine(const EffectRow& effect) {
    Builder table(effect.matchName);
    for (std::size_t i = 0; i < effect.parameterCount; ++i) {
        const ParameterRow& row = effect.parameters[i];
        table.Row(row.index, row.name, row.type, row.value, row.choiceName);
    }
    if (effect.changesWithTime) table.DependsOnTime();
    return table.Finish();
}

/// What the engine lists goes before what is known here of the other effects.
std::vector<EffectTable> MakeTables() {
    std::vector<EffectTable> tables;
    for (const EffectRow* effect : kEffectTable) tables.push_back(FromEngine(*effect));
    tables.push_back(Timecode());
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
