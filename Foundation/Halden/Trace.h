// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <functional>
#include <string>

namespace Halden::debug {

/// Is a trace line of this category and level wanted? `selector` is handed through by callers and is always 1 today.
/// Takes a lock: callers keep the answer in a static and ask again only when TraceChangeCount() has moved.
[[nodiscard]] bool TraceEnabled(const char* category, int level, int selector);

/// Rises whenever the set of enabled categories changes. Never 0, so that a cached 0 means "not asked yet".
[[nodiscard]] std::uint32_t TraceChangeCount();

/// Hands one finished line to the sink. Any thread; lines don't interleave.
void Trace(const std::string& line);

/// Enables a category for all levels up to `maximumLevel`; a negative level disables it.
void SetTraceLevel(const std::string& category, int maximumLevel);

/// Replaces the sink (standard error by default). An empty function restores the default.
void SetTraceSink(std::function<void(const std::string&)> sink);

/// The text before a line's message: "<thread id> <category> <level> " in angle brackets, each followed by a space.
[[nodiscard]] std::string TracePrefix(const char* category, int level);

}  // namespace Halden::debug
