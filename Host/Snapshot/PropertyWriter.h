// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>
#include <utility>

#include "Host/Snapshot/Node.h"

namespace Vantrel::Host {

/// Adds properties under one prefix in the text forms that the engine reads.
class PropertyWriter {
public:
    PropertyWriter(Properties& properties, std::string prefix) : mProperties(properties), mPrefix(std::move(prefix)) {}

    void Text(const char* key, const std::string& text) { mProperties.emplace_back(mPrefix + key, text); }
    void Number(const char* key, std::int64_t value) { Text(key, std::to_string(value)); }
    void Bool(const char* key, bool value) { Text(key, value ? "1" : "0"); }
    void Real(const char* key, double value);

private:
    Properties& mProperties;
    std::string mPrefix;
};

/// Size, aspect, rate and fields of a stream.
void AddStreamProperties(PropertyWriter& properties, const MediaInfo& info);

void AddAlphaProperties(PropertyWriter& properties, const MediaInfo& info, AlphaChoice choice);

}  // namespace Vantrel::Host
