// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <cstdlib>
#include <random>

#include "Host/Suites/DescriptionSuites.h"
#include "Host/Suites/HandleTables.h"
#include "Tests/Host/DirectEvaluator.h"
#include "Tests/Host/EngineWalk.h"
#include "Tests/Host/TimelineText.h"

namespace Vantrel::Host::Test {
namespace {

class TimelineMaker {
public:
    explicit TimelineMaker(unsigned seed) : mRandom(seed) {}

    Json Make() {
        std::vector<Json> tracks;
        for (int i = Pick(1, 3); i > 0; --i) tracks.push_back(Chance(85) ? MakeTrack(0, true) : MakeItem(0));
        return Timeline(std::move(tracks));
    }

private:
    int Pick(int low, int high) { return std::uniform_int_distribution<int>(low, high)(mRandom); }
    bool Chance(int percent) { return Pick(1, 100) <= percent; }

    /// Media whose frames don't start at 0, and in-points off the frame grid, occur too.
    Json MakeClip() {
        const double start = Chance(30) ? 86400 : 0;
        const double in = start + Pick(0, 60) + (Chance(10) ? 0.37 : 0);
        Json clip = Clip("clip", Range(in, Pick(1, 9)), File("m" + std::to_string(Pick(0, 9)) + ".mov", start, 1000));
        if (Chance(10)) clip["source_range"] = Range(in, Pick(1, 12), 30);
        Dress(clip);
        return clip;
    }

    void Dress(Json& item) {
        constexpr double kSpeeds[] = {2.0, 0.5, -1.0, 0.8545454551724138, -0.73, 1.25, 3.1};
        if (Chance(30)) item["effects"] = {Warp(kSpeeds[Pick(0, 6)])};
        if (Chance(10)) item["effects"] = {Freeze()};
        if (Chance(5)) item["effects"] = {Warp(2.0), Warp(0.25)};
        if (Chance(5)) item["enabled"] = false;
    }

    Json MakeItem(int depth) {
        if (Chance(15)) return Gap(Pick(1, 5));
        if (depth >= 2 || Chance(65)) return MakeClip();
        Json nested =
            Chance(50) ? MakeTrack(depth + 1, false) : Stack({MakeTrack(depth + 1, true), MakeTrack(depth + 1, true)});
        if (Chance(70)) nested["source_range"] = Range(Pick(0, 6), Pick(2, 10));
        Dress(nested);
        return nested;
    }

    Json MakeTrack(int depth, bool inStack) {
        std::vector<Json> children;
        for (int i = Pick(1, 4); i > 0; --i) {
            if (Chance(20)) children.push_back(Dissolve(Pick(0, 4), Pick(0, 4)));
            children.push_back(MakeItem(depth));
        }
        if (Chance(10)) children.push_back(Dissolve(Pick(0, 3), Pick(0, 3)));
        Json track = Track(std::move(children));
        if (inStack && Chance(20)) track["source_range"] = Range(Pick(-6, 6), Pick(4, 16));
        if (inStack && Chance(5)) track["effects"] = {Warp(1.5)};
        return track;
    }

    std::mt19937 mRandom;
};

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
