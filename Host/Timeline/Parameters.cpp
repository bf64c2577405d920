// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Timeline/Parameters.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <limits>

namespace Vantrel::Host {
namespace {

constexpr double kColorWordOne = 65280.0;

bool Interpolates(ParameterType type) {
    return type == ParameterType::kFloat || type == ParameterType::kDouble || type == ParameterType::kColor ||
           type == ParameterType::kPoint;
}

template <class T>
T RoundInto(double value) {
    constexpr auto kLowest = static_cast<double>(std::numeric_limits<T>::lowest());
    constexpr auto kHighest = static_cast<double>(std::numeric_limits<T>::max());
    const double rounded = std::floor(value + 0.5);
    if (!(rounded > kLowest)) return std::numeric_limits<T>::lowest();
    return rounded < kHighest ? static_cast<T>(rounded) : std::numeric_limits<T>::max();
}

template <class T>
void Put(VantrelParamRecord& record, std::size_t offset, T value) {
    std::memcpy(record.bytes + offset, &value, sizeof value);
}

}  // namespace

const char* GetParameterTypeName(ParameterType type) {
    switch (type) {
        case ParameterType::kBool:
            return "bool";
        case ParameterType::kByte:
            return "byte";
        case ParameterType::kShort:
            return "short";
        case ParameterType::kInt:
            return "int";
        case ParameterType::kInt64:
            return "int64";
        case ParameterType::kFloat:
            return "float";
        case ParameterType::kDouble:
            return "double";
        case ParameterType::kColor:
            return "color";
        case ParameterType::kPoint:
            return "point";
    }
    return "";
}

int CountComponents(ParameterType type) {
    if (type == ParameterType::kColor) return 4;
    return type == ParameterType::kPoint ? 2 : 1;
}

ParameterValue Parameter::At(std::int64_t time) const {
    const auto next = std::upper_bound(keys.begin(), keys.end(), time,
                                       [](std::int64_t t, const Keyframe& key) { return t < key.time; });
    if (keys.empty()) return value;
    if (next == keys.begin()) return next->value;
    const Keyframe& from = *std::prev(next);
    if (next == keys.end() || from.interpolation == Interpolation::kHold || !Interpolates(type)) return from.value;
    const double fraction = static_cast<double>(time - from.time) / static_cast<double>(next->time - from.time);
    ParameterValue result{};
    for (std::size_t i = 0; i < result.size(); ++i) {
        result[i] = from.interpolation == Interpolation::kLinear
                        ? from.value[i] + (next->value[i] - from.value[i]) * fraction
                        : EvaluateBezier(from.value[i], from.out[i], next->in[i], next->value[i], fraction);
    }
    return result;
}

std::optional<std::int32_t> Parameter::KeyAfter(std::int64_t time) const {
    const auto next = std::upper_bound(keys.begin(), keys.end(), time,
                                       [](std::int64_t t, const Keyframe& key) { return t < key.time; });
    if (next == keys.end()) return std::nullopt;
    return static_cast<std::int32_t>(next - keys.begin());
}

void WriteRecord(ParameterType type, const ParameterValue& value, VantrelParamRecord& record) {
    constexpr std::size_t kValue = 4;
    Put(record, 0, static_cast<std::int32_t>(type));
    switch (type) {
        case ParameterType::kBool:
            return Put(record, kValue, static_cast<std::uint8_t>(value[0] != 0));
        case ParameterType::kByte:
            return Put(record, kValue, RoundInto<std::uint8_t>(value[0]));
        case ParameterType::kShort:
            return Put(record, kValue, RoundInto<std::uint16_t>(value[0]));
        case ParameterType::kInt:
            return Put(record, kValue, RoundInto<std::int32_t>(value[0]));
        case ParameterType::kInt64:
            return Put(record, kValue, RoundInto<std::int64_t>(value[0]));
        case ParameterType::kFloat:
            return Put(record, kValue, static_cast<float>(value[0]));
        case ParameterType::kDouble:
            return Put(record, kValue, value[0]);
        case ParameterType::kPoint:
            Put(record, kValue, value[0]);
            return Put(record, kValue + sizeof(double), value[1]);
        case ParameterType::kColor: {
            constexpr std::array<std::size_t, 4> kWordOrder = {2, 1, 0, 3};
            for (std::size_t word = 0; word < kWordOrder.size(); ++word) {
                Put(record, kValue + word * sizeof(std::uint16_t),
                    RoundInto<std::uint16_t>(value[kWordOrder[word]] * kColorWordOne));
            }
            return;
        }
    }
}

}  // namespace Vantrel::Host
