// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <gtest/gtest.h>

#include "Src/Outside/Suites.h"
#include "Tests/Support/FakeHost.h"

namespace Vantrel::Testing {

/// A fake host whose suites the engine's inside reaches, for programs that are linked of Vantrel::Engine. Nodes made in
/// a test must be gone when it ends: make them in the test's body, or in members of a derived class.
class HostedTest : public ::testing::Test {
protected:
    HostedTest() { SetBasicSuite(host.GetBasicSuite()); }
    ~HostedTest() override { ReleaseSuites(); }

    FakeHost host;
};

}  // namespace Vantrel::Testing
