// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <random>

#include "Tests/Host/TimelineText.h"

namespace Vantrel::Host::Test {

/// Makes timelines of every structure, the same for the same seed.
class TimelineMaker {
public:
    /// @param mediaFrames  length of each of the ten films m0.mov to m9.mov.
    TimelineMaker(unsigned seed, int mediaFrames) : mRandom(seed), mMediaFrames(mediaFrames) {}

    Json Make() {
        mOffGrid = Chance(30);
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
        if (Chance(10)) clip["metadata"]["vantrel"]["frame_blend"] = true;
        Dress(clip);
        return clip;
    }

    void Dress(Json& item) {
        constexpr double kSpeeds[] = {2.0, 0.5, -1.0, 0.8545454551724138, -0.73, 1.25, 3.1};
        if (Chance(30)) item["effects"] = {Warp(kSpeeds[Pick(0, 6)])};
        if (Chance(10)) item["effects"] = {Freeze()};
        if (Chance(5)) item["effects"] = {Warp(2.0), Warp(0.25)};
        if (Chance(5)) item["enabled"] = false;
        Json& own = item["metadata"]["vantrel"];
        if (own.is_null()) own = Json::object();
        if (Chance(30)) own["disabled"] = "node";
        const Json range = item.value("source_range", Json());
        const double start = range.is_object() ? range["start_time"]["value"].get<double>() : 0;
        const double rate = range.is_object() ? range["start_time"]["rate"].get<double>() : kRate;
        if (Chance(30)) own["hold"] = {{"t", Time(start + Pick(0, 9), rate)}};
        if (Chance(8)) own["time_remap"] = Curve(start, rate);
        AddEffects(item);
    }

    void AddEffects(Json& item) {
        if (Chance(10)) item["effects"].push_back(Effect("TQ.XQVE Invert"));
        if (Chance(10)) item["effects"].push_back(Effect("TQ.XQVE Opacity", {{"0", 10.0 * Pick(1, 9)}}));
    }

    Json Curve(double start, double rate) {
        constexpr const char* kKinds[] = {"hold", "linear", "bezier"};
        Json keys = Json::array();
        for (int i = Pick(1, 3), t = Pick(0, 2); i > 0; --i, t += Pick(1, 6)) {
            keys.push_back({{"t", Time(start + t, rate)},
                            {"media", Time(start + Pick(0, 20), rate)},
                            {"interp", kKinds[Pick(0, 2)]}});
        }
        return keys;
    }

    Json MakeTransition(int in, int out) {
        constexpr const char* kKinds[] = {"SMPTE_Dissolve",    "XQVE Film Dissolve",     "XQVE Dip To Black",
                                          "XQVE Dip To White", "XQVE Additive Dissolve", "XQVE Push"};
        Json transition = Dissolve(in, out);
        transition["transition_type"] = kKinds[Pick(0, 5)];
        if (transition["transition_type"] != "XQVE Push") return transition;
        transition["metadata"]["vantrel"]["properties"] = {{"direction", Pick(1, 4)}, {"reverse", Chance(30)}};
        return transition;
    }

    /// What stands in a clip's place without a film.
    Json MakeSynthetic() {
        const int kind = !mOffGrid ? Pick(0, 4) : 2 * Pick(0, 2);
        if (kind == 0)
            return Clip("still", Range(0, Pick(1, 9)), File("m" + std::to_string(Pick(0, 9)) + ".mov", 0, 1));
        const Json generators[] = {GeneratorOf("adjustment"), GeneratorOf("black"), GeneratorOf("transparent"),
                                   GeneratorOf("color", {{"color", {20, 25 * Pick(0, 10), 90}}})};
        Json clip = Clip("generator", Range(0, Pick(1, 9)), generators[kind - 1]);
        AddEffects(clip);
        return clip;
    }

    Json MakeMulticam(int depth) {
        std::vector<Json> angles;
        for (int i = Pick(1, 3); i > 0; --i) angles.push_back(Chance(50) ? MakeTrack(depth + 1, true) : MakeItem(2));
        const int selected = Pick(0, static_cast<int>(angles.size()) - (Chance(95) ? 1 : 0));
        return Stack(std::move(angles), Own({{"multicam", {{"selected", selected}}}}));
    }

    Json MakeItem(int depth) {
        if (Chance(15)) return Gap(Pick(1, 5));
        if (Chance(20)) return MakeSynthetic();
        if (depth >= 2 || Chance(65)) return MakeClip();
        Json nested = Chance(25)   ? MakeMulticam(depth)
                      : Chance(50) ? MakeTrack(depth + 1, false)
                                   : Stack({MakeTrack(depth + 1, true), MakeTrack(depth + 1, true)});
        if (Chance(70)) nested["source_range"] = Range(Pick(0, 6), Pick(2, 10));
        Dress(nested);
        return nested;
    }

    Json MakeTrack(int depth, bool inStack) {
        std::vector<Json> children;
        for (int i = Pick(1, 4); i > 0; --i) {
            if (!mOffGrid && Chance(20)) children.push_back(MakeTransition(Pick(0, 4), Pick(0, 4)));
            children.push_back(MakeItem(depth));
        }
        if (!mOffGrid && Chance(10)) children.push_back(MakeTransition(Pick(0, 3), Pick(0, 3)));
        Json track = Track(std::move(children));
        if (inStack && Chance(20)) track["source_range"] = Range(Pick(-6, 6), Pick(4, 16));
        if (inStack && Chance(5)) track["effects"] = {Warp(1.5)};
        return track;
    }

    std::mt19937 mRandom;
    int mMediaFrames;
    /// Items may begin and end between two frames. What the host renders for the device it renders at whole frames of
    /// the content, so timelines of every structure then have none of those that a device may lack.
    bool mOffGrid = false;
};

}  // namespace Vantrel::Host::Test
