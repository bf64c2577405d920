// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <stdexcept>

#include "Src/VideoNodes/VideoNode.h"
#include "Vantrel/Effects/EffectRow.h"

namespace Vantrel {

/// Reads an effect's parameters at one time, each as its row says: by the accessor of its type, narrowed to a float,
/// and then converted. So the table that people read is the one that the effect obeys.
class ParameterReader {
public:
    ParameterReader(const VideoNode& effect, const EffectRow& table, std::int64_t time)
        : mEffect(effect), mTable(table), mTime(time) {}

    [[nodiscard]] bool Flag(std::int32_t index) const { return mEffect.GetBoolParam(index, mTime); }
    [[nodiscard]] std::int32_t Integer(std::int32_t index) const { return mEffect.GetIntParam(index, mTime); }

    /// A number as the effect takes it. An index without a row raises std::out_of_range.
    [[nodiscard]] float Number(std::int32_t index) const {
        const ParameterRow& row = FindRow(index);
        return Convert(Raw(row), row.conversion);
    }

    /// The numbers of `count` neighbouring indices.
    template <std::size_t N>
    void Numbers(std::int32_t first, std::array<float, N>& values, std::size_t at, std::size_t count) const {
        for (std::size_t i = 0; i < count; ++i) values.at(at + i) = Number(first + static_cast<std::int32_t>(i));
    }

    [[nodiscard]] const VideoNode& GetEffect() const { return mEffect; }
    [[nodiscard]] std::int64_t GetTime() const { return mTime; }

private:
    [[nodiscard]] const ParameterRow& FindRow(std::int32_t index) const {
        for (std::size_t i = 0; i < mTable.parameterCount; ++i) {
            if (mTable.parameters[i].index == index) return mTable.parameters[i];
        }
        throw std::out_of_range("an effect reads a parameter that its table lacks");
    }

    [[nodiscard]] float Raw(const ParameterRow& row) const {
        switch (row.type) {
            case ParameterType::kBool:
                return mEffect.GetBoolParam(row.index, mTime) ? 1.0F : 0.0F;
            case ParameterType::kFloat:
                return mEffect.GetFloatParam(row.index, mTime);
            case ParameterType::kDouble:
                return static_cast<float>(mEffect.GetDoubleParam(row.index, mTime));
            default:
                return static_cast<float>(mEffect.GetIntParam(row.index, mTime));
        }
    }

    static float Convert(float value, ParameterConversion conversion) {
        switch (conversion) {
            case ParameterConversion::kPercent:
                return value / 100.0F;
            case ParameterConversion::kLevel:
                return value / 255.0F;
            default:
                return value;
        }
    }

    const VideoNode& mEffect;
    const EffectRow& mTable;
    std::int64_t mTime;
};

}  // namespace Vantrel
