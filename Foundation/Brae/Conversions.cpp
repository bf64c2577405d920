// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Brae/Conversions.h"

#include <algorithm>
#include <string>

#include "Vellum/Field.h"

namespace Brae {

namespace {

constexpr std::int32_t kLastCadence = 10;

}  // namespace

PluginID GuidToPluginID(const Halden::utility::Guid& guid) {
    PluginID id;
    const std::string text = guid.ToString();
    std::copy(text.begin(), text.end(), id.text);
    return id;
}

std::uint32_t SDKToBEFieldType(std::uint32_t fieldType) {
    return fieldType <= Vellum::kFieldType_SeparateFields ? fieldType : Vellum::kFieldType_Unknown;
}

std::uint32_t SDKToBEAlphaType(std::int32_t alphaType) {
    if (alphaType < 0 || alphaType > static_cast<std::int32_t>(Vellum::kAlphaType_Premultiplied)) {
        return Vellum::kAlphaType_Straight;
    }
    return static_cast<std::uint32_t>(alphaType);
}

std::uint32_t SDKToVellumPulldownCadence(std::int32_t cadence) {
    return cadence >= 0 && cadence <= kLastCadence ? static_cast<std::uint32_t>(cadence) : 0;
}

}  // namespace Brae
