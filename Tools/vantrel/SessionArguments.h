// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <charconv>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "Commands.h"
#include "Host/Session/RenderSession.h"

namespace Vantrel::Tool {

/// What every command asks that opens a timeline with a device.
struct SessionArguments {
    std::string file;
    std::string device = "auto";
    std::vector<std::string> mediaRoots;
    std::uint64_t deviceMemoryMB = 0;
};

/// Adds the file and the options. `arguments` must outlive the command.
void AddSessionArguments(CLI::App& command, SessionArguments& arguments);

[[nodiscard]] Host::SessionOptions MakeSessionOptions(const SessionArguments& arguments);

/// "WIDTHxHEIGHT", the sequence's size if the text is empty. Throws UsageError.
[[nodiscard]] std::pair<std::int32_t, std::int32_t> ParseSize(const std::string& text,
                                                              const Host::SequenceFormat& format);

/// The whole text as a number.
template <class Number>
std::optional<Number> ParseNumber(const std::string& text) {
    Number value{};
    const auto result = std::from_chars(text.data(), text.data() + text.size(), value);
    if (result.ec != std::errc() || result.ptr != text.data() + text.size()) return std::nullopt;
    return value;
}

}  // namespace Vantrel::Tool
