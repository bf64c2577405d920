// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Halden/Trace.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <thread>
#include <vector>

namespace debug = Halden::debug;

namespace {

/// Collects lines for its lifetime. The vector has no lock of its own: the sink is never called twice at once.
class CollectedLines {
public:
    CollectedLines() {
        debug::SetTraceSink([this](const std::string& line) { mLines.push_back(line); });
    }
    ~CollectedLines() { debug::SetTraceSink({}); }
    CollectedLines(const CollectedLines&) = delete;
    CollectedLines& operator=(const CollectedLines&) = delete;

    [[nodiscard]] const std::vector<std::string>& Get() const { return mLines; }

private:
    std::vector<std::string> mLines;
};

}  // namespace

TEST(Tracing, WritesWholeLinesFromManyThreads) {
    const CollectedLines lines;
    const debug::TraceGate gate("Test.Lines", 10);
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i) {
        threads.emplace_back([&gate] {
            for (int k = 0; k < 100; ++k) gate.Write("message");
        });
    }
    for (std::thread& thread : threads) thread.join();
    EXPECT_EQ(lines.Get().size(), 400U);
    EXPECT_THAT(lines.Get(), testing::Each(testing::MatchesRegex("<[0-9]+> <Test.Lines> <10> message")));
}
