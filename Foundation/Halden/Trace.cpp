// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Halden/Trace.h"

#include <unistd.h>

#include <cstdio>
#include <map>
#include <mutex>
#include <utility>

namespace Halden::debug {

namespace {

struct TraceState {
    std::mutex levelMutex;
    std::map<std::string, int, std::less<>> levels;
    // Held while a line is written; never together with levelMutex.
    std::mutex sinkMutex;
    std::function<void(const std::string&)> sink;
};

// Deliberately never destroyed: executors still run, and trace, while the process ends.
TraceState& State() {
    static TraceState& state = *new TraceState;
    return state;
}

std::atomic<std::uint32_t> gChangeCount{1};

void RaiseChangeCount() {
    if (gChangeCount.fetch_add(1) + 1 == 0) gChangeCount.fetch_add(1);
}

}  // namespace

bool TraceEnabled(const char* category, int level, int /*selector*/) {
    TraceState& state = State();
    const std::lock_guard<std::mutex> lock(state.levelMutex);
    const auto entry = state.levels.find(category);
    return entry != state.levels.end() && level <= entry->second;
}

std::uint32_t TraceChangeCount() { return gChangeCount.load(std::memory_order_acquire); }

void Trace(const std::string& line) {
    TraceState& state = State();
    const std::lock_guard<std::mutex> lock(state.sinkMutex);
    if (state.sink) {
        state.sink(line);
    } else {
        (void)std::fprintf(stderr, "%s\n", line.c_str());
    }
}

void SetTraceLevel(const std::string& category, int maximumLevel) {
    TraceState& state = State();
    const std::lock_guard<std::mutex> lock(state.levelMutex);
    if (maximumLevel < 0) {
        if (state.levels.erase(category) == 0) return;
    } else {
        const auto [entry, added] = state.levels.try_emplace(category, maximumLevel);
        if (!added && std::exchange(entry->second, maximumLevel) == maximumLevel) return;
    }
    RaiseChangeCount();
}

void SetTraceSink(std::function<void(const std::string&)> sink) {
    TraceState& state = State();
    const std::lock_guard<std::mutex> lock(state.sinkMutex);
    state.sink = std::move(sink);
}

std::string TracePrefix(const char* category, int level) {
    return "<" + std::to_string(gettid()) + "> <" + category + "> <" + std::to_string(level) + "> ";
}

bool TraceGate::IsOpen() {
    const std::uint64_t count = TraceChangeCount();
    const std::uint64_t answer = mAnswer.load(std::memory_order_relaxed);
    if (answer >> 1 == count) return (answer & 1) != 0;
    // The count was read before the question: a change in between leaves the old count here, and the next call asks
    // again.
    const bool enabled = TraceEnabled(mCategory, mLevel, 1);
    mAnswer.store(count << 1 | static_cast<std::uint64_t>(enabled), std::memory_order_relaxed);
    return enabled;
}

void TraceGate::Write(const std::string& message) const { Trace(TracePrefix(mCategory, mLevel) + message); }

}  // namespace Halden::debug
