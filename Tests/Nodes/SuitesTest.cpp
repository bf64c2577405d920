// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Outside/Suites.h"

#include <gtest/gtest.h>

#include "Tests/Support/FakeHost.h"

namespace Vantrel::Testing {
namespace {

class SuiteHolderTest : public ::testing::Test {
protected:
    FakeHost host;
};

TEST_F(SuiteHolderTest, WithoutARecordNothingIsAskedFor) {
    const void* suite = nullptr;
    EXPECT_EQ(AcquireSuite(kGlazeSuiteName, kGlazeSuiteVersion, &suite), 0x21416371);
    EXPECT_EQ(FindGlazeSuite(), nullptr);
    EXPECT_THROW(static_cast<void>(GlazeSuite()), Ostrand::NullInterfaceException);
    EXPECT_EQ(host.Count("AcquireSuite"), 0);
}

TEST_F(SuiteHolderTest, ASuiteIsAcquiredOncePerLiteralAndVersionAndGivenBackAtTheEnd) {
    static const char sameText[] = "Larkspur Glaze Suite";  // another literal with the same text is another key
    SetBasicSuite(host.GetBasicSuite());
    const void* first = nullptr;
    const void* second = nullptr;
    EXPECT_EQ(AcquireSuite(kGlazeSuiteName, kGlazeSuiteVersion, &first), 0);
    EXPECT_EQ(AcquireSuite(kGlazeSuiteName, kGlazeSuiteVersion, &second), 0);
    EXPECT_NE(first, nullptr);
    EXPECT_EQ(first, second);
    EXPECT_EQ(host.Count("AcquireSuite"), 1);
    EXPECT_EQ(AcquireSuite(sameText, kGlazeSuiteVersion, &second), 0);
    EXPECT_EQ(host.Count("AcquireSuite"), 2);
    ReleaseSuites();
    EXPECT_EQ(host.Count("ReleaseSuite"), 2);
}

TEST_F(SuiteHolderTest, AFailedAcquisitionIsKeptAndLeavesItsUserEmpty) {
    host.missingSuites = {kGlazeCacheSuiteName};
    SetBasicSuite(host.GetBasicSuite());
    const void* suite = &host;
    EXPECT_LT(AcquireSuite(kGlazeCacheSuiteName, kGlazeCacheSuiteVersion, &suite), 0);
    EXPECT_EQ(suite, nullptr);
    EXPECT_EQ(AcquireSuite(kGlazeCacheSuiteName, kGlazeCacheSuiteVersion, &suite), 0) << "from the holder";
    EXPECT_EQ(suite, nullptr);
    EXPECT_EQ(FindGlazeCacheSuite(), nullptr);
    ReleaseSuites();
}

}  // namespace
}  // namespace Vantrel::Testing
