// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <random>

#include "Tests/Host/TimelineText.h"

namespace Vantrel::Host::Test {

/// Makes timelines of cuts, gaps, tracks, trims, speeds, freezes, transitions and nested compositions, the same for the
/// same seed.
class TimelineMaker {
public:
    /// @param mediaFrames  length of each of the ten films m0.mov to m9.mov.
    /// @param offGrid      some items begin and end between two frames.
    explicit TimelineMaker(unsigned seed, int mediaFrames = 1000, bool offGrid = true)
        : mRandom(seed), mMediaFrames(mediaFrames), mOffGrid(offGrid) {}

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
        Json clip =
            Clip("clip", Range(in, Pick(1, 9)), File("m" + std::to_string(Pick(0, 9)) + ".mov", start, mMediaFrames));
        if (mOffGrid && Chance(10)) clip["source_range"] = Range(in, Pick(1, 12), 30);
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
    int mMediaFrames;
    bool mOffGrid;
};

}  // namespace Vantrel::Host::Test
