// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

namespace Vantrel {

/// What a parameter holds, numbered as the type word of the host's parameter record.
enum class ParameterType : std::int32_t {
    kBool = 1,
    kByte,
    kShort,
    kInt,
    kInt64,
    kFloat,
    kDouble,
    kColor,  ///< red, green, blue, alpha in 0..1
    kPoint   ///< x, y
};

/// What becomes of a number on its way from the host to the effect, in single precision.
enum class ParameterConversion : std::int32_t {
    kAsIs = 0,
    kPercent,  ///< divided by 100
    kLevel     ///< of an 8-bit signal: divided by 255
};

/// One parameter of an effect.
struct ParameterRow {
    std::int32_t index;  ///< in the effect's parameter list
    const char* name;    ///< lower case with underscores, as files write it
    ParameterType type;  ///< the accessor that reads it
    const char* unit;    ///< "%", "degrees", "pixels", ...; empty for a plain number
    double minimum;      ///< what makes sense; values beyond it are taken as they are
    double maximum;
    std::array<double, 4> value;  ///< that of an effect just applied; one, two (point) or four (colour) numbers
    /// The name of a choice, null for a number that is none; a null function where the parameter isn't a choice.
    const char* (*choiceName)(std::int32_t choice) = nullptr;
    ParameterConversion conversion = ParameterConversion::kAsIs;
    const char* goesTo = "";  ///< what it is to the effect, where the name alone doesn't say so
};

/// One effect: everything that a host needs to list it, to read its parameters from a file and to show them.
struct EffectRow {
    const char* matchName;  ///< the node registry's key
    const char* label;
    const char* summary;             ///< one sentence
    const ParameterRow* parameters;  ///< by rising index; an index without a row is never read
    std::size_t parameterCount;
    bool changesWithTime = false;  ///< though no parameter does
};

template <std::size_t N>
constexpr EffectRow MakeEffectRow(const char* matchName, const char* label, const char* summary,
                                  const ParameterRow (&parameters)[N]) {
    return {matchName, label, summary, parameters, N};
}

template <std::size_t N>
constexpr EffectRow MakeEffectRow(const char* matchName, const char* label, const char* summary,
                                  const std::array<ParameterRow, N>& parameters) {
    return {matchName, label, summary, parameters.data(), N};
}

/// One table of several, for parameters that effects share.
template <std::size_t... N>
[[nodiscard]] constexpr std::array<ParameterRow, (N + ...)> JoinParameters(
    const std::array<ParameterRow, N>&... groups) {
    std::array<ParameterRow, (N + ...)> joined{};
    std::size_t at = 0;
    const auto append = [&joined, &at](const auto& group) {
        for (const ParameterRow& row : group) joined[at++] = row;
    };
    (append(groups), ...);
    return joined;
}

}  // namespace Vantrel
