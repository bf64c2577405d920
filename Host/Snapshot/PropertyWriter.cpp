// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Snapshot/PropertyWriter.h"

#include <cstdio>

namespace Vantrel::Host {

void PropertyWriter::Real(const char* key, double value) {
    char text[40];
    (void)std::snprintf(text, sizeof text, "%.17g", value);
    Text(key, text);
}

void AddStreamProperties(PropertyWriter& properties, const MediaInfo& info) {
    properties.Number("StreamFrameWidth", info.width);
    properties.Number("StreamFrameHeight", info.height);
    properties.Number("StreamPixelAspectRatioNum", info.pixelAspectNumerator);
    properties.Number("StreamPixelAspectRatioDen", info.pixelAspectDenominator);
    properties.Number("StreamFrameRate", info.ticksPerFrame);
    properties.Number("StreamFieldType", static_cast<std::int64_t>(info.fieldType));
}

void AddAlphaProperties(PropertyWriter& properties, const MediaInfo& info, AlphaChoice choice) {
    AlphaType type = info.alphaType;
    if (choice == AlphaChoice::kStraight) type = AlphaType::kStraight;
    if (choice == AlphaChoice::kPremultiplied) type = AlphaType::kPremultiplied;
    properties.Number("StreamAlphaType", static_cast<std::int64_t>(type));
    if (type == AlphaType::kPremultiplied) properties.Number("StreamAlphaMatteColor", info.alphaMatteColor);
    if (choice == AlphaChoice::kIgnore) properties.Bool("StreamIgnoreAlpha", true);
    if (choice == AlphaChoice::kInvert) properties.Bool("StreamInvertAlpha", true);
}

}  // namespace Vantrel::Host
