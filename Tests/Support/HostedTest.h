// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <gtest/gtest.h>

#include "Src/Outside/Suites.h"
#include "Src/VideoNodes/VideoNodeFactory.h"
#include "Tests/Support/FakeHost.h"

namespace Vantrel::Testing {

/// The description of node 1 of the script, as the root of the sequence's only segment.
inline VideoNodeRef AcquireRoot(FakeHost& host, std::uint32_t sequence = 9) {
    host.sequences[sequence].segments = {{0, 10, 0, {1, 2, 3, {}}, 1}};
    const VideoSegmentsHandle handle(sequence, SegmentsMode::kPlain, "");
    return AcquireRootNode(handle, 0);
}

/// A fake host whose suites the engine's inside reaches, for programs that are linked of Vantrel::Engine. Nodes made in
/// a test must be gone when it ends: make them in the test's body, or in members of a derived class.
class HostedTest : public ::testing::Test {
protected:
    HostedTest() { SetBasicSuite(host.GetBasicSuite()); }
    ~HostedTest() override { ReleaseSuites(); }

    FakeHost host;
};

}  // namespace Vantrel::Testing
