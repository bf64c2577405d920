// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <cstdint>
#include <functional>
#include <string>

namespace Halden::debug {

/// Is a trace line of this category and level wanted? `selector` is handed through by callers and is always 1 today.
/// Takes a lock: callers keep the answer in a static and ask again only when TraceChangeCount() has moved.
[[nodiscard]] bool TraceEnabled(const char* category, int level, int selector);

/// Rises whenever the set of enabled categories changes. Never 0, so that a cached 0 means "not asked yet".
[[nodiscard]] std::uint32_t TraceChangeCount();

/// Hands one finished line, without a line end, to the sink. Any thread; lines don't interleave.
void Trace(const std::string& line);

/// Enables a category for all levels up to `maximumLevel`; a negative level disables it.
void SetTraceLevel(const std::string& category, int maximumLevel);

/// Replaces the sink (standard error by default). An empty function restores the default. Returns when no line is being
/// handed to the former sink any more. A sink must neither trace nor replace the sink.
void SetTraceSink(std::function<void(const std::string&)> sink);

/// The text before a line's message: "<thread id> <category> <level> " in angle brackets, each followed by a space.
[[nodiscard]] std::string TracePrefix(const char* category, int level);

/// One place that traces, with its cached answer: made a static beside the code that writes the line, it costs two
/// atomic loads while its category is off.
///
/// @code
/// static Halden::debug::TraceGate gate("Timeline.AddSegments", 10);
/// if (gate.IsOpen()) gate.Write("3 segments added");
/// @endcode
class TraceGate {
public:
    /// `category` must be a literal.
    constexpr TraceGate(const char* category, int level) : mCategory(category), mLevel(level) {}

    /// Is the line wanted? Any thread.
    [[nodiscard]] bool IsOpen();
    /// Traces the prefix and `message`, whether or not the gate is open.
    void Write(const std::string& message) const;

private:
    const char* mCategory;
    int mLevel;
    // The change count that the answer belongs to, shifted by one, and the answer in bit 0. Count 0: not asked yet.
    std::atomic<std::uint64_t> mAnswer{0};
};

}  // namespace Halden::debug
