// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <cstdlib>

#include "Host/Suites/DescriptionSuites.h"
#include "Host/Suites/HandleTables.h"
#include "Tests/Host/DirectEvaluator.h"
#include "Tests/Host/EngineWalk.h"
#include "Tests/Host/TimelineMaker.h"

namespace Vantrel::Host::Test {
namespace {

std::string Describe(const std::vector<Shown>& shown) {
    std::string text;
    for (const Shown& s : shown) {
        text += s.media + " at " + std::to_string(s.mediaTime) + " frame " + std::to_string(s.frame) + "; ";
    }
    return text;
}

/// Rounding at two levels of nesting may part by a tick each.
bool Agree(const std::vector<Shown>& a, const std::vector<Shown>& b) {
    if (a.size() != b.size()) return false;
    for (std::size_t i = 0; i < a.size(); ++i) {
        if (a[i].media != b[i].media || a[i].frame != b[i].frame || std::llabs(a[i].mediaTime - b[i].mediaTime) > 2) {
            return false;
        }
    }
    return true;
}

TEST(RandomTimelines, ShowWhatAnEvaluationOfTheItemsShows) {
    constexpr unsigned kTimelines = 1600;
    std::size_t pictures = 0;
    std::size_t layers = 0;
    for (unsigned seed = 1; seed <= kTimelines; ++seed) {
        const Json timeline = TimelineMaker(seed).Make();
        const Published described(timeline);
        const Sequence& top = *described.snapshot->top;
        DirectEvaluator direct(described.document, top.format.frameTicks);
        EngineWalk engine;
        const std::int64_t frame = top.format.frameTicks;
        for (std::int64_t time = 0; time < top.length + 2 * frame; time += frame) {
            const std::vector<Shown> expected = direct.At(time);
            const std::vector<Shown> shown = engine.At(time);
            ASSERT_TRUE(Agree(expected, shown))
                << "seed " << seed << ", frame " << time / frame << "\nitems:  " << Describe(expected)
                << "\nengine: " << Describe(shown);
            ++pictures;
            layers += shown.size();
        }
    }
    // A generator that makes empty timelines would prove nothing.
    EXPECT_GT(pictures, kTimelines * 10U);
    EXPECT_GT(layers, pictures / 2);
    EXPECT_EQ(HostServices::Instance().GetNodes().Count(), 0U);
    EXPECT_EQ(HostServices::Instance().GetSegmentLists().Count(), 0U);
    EXPECT_EQ(CountTexts(), 0);
}

}  // namespace
}  // namespace Vantrel::Host::Test
