// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// Clips whose time runs otherwise than the sequence's: which moments of the media they show, and in which shares.
#include <cmath>

#include "Tests/EndToEnd/BarFilm.h"

namespace Vantrel::Host::Test {
namespace {

class TimeOfClips : public BarFilms {
protected:
    TimeOfClips() { WriteBarFilm(mFolder.Path("bar.mov"), 0, 0); }

    static Json BarClip(double in, double duration, std::vector<Json> effects, Json own = Json::object()) {
        Json more = Effects(std::move(effects));
        more.update(Own(std::move(own)));
        return Clip("bar", Range(in, duration), File("bar.mov", 0, kBarFrames), more);
    }
    static Json RemapKey(double t, double media, const char* interpolation = "linear") {
        return {{"t", Time(t)}, {"media", Time(media)}, {"interp", interpolation}};
    }
    /// The media frames that a clip's frames show, with fractions where several are mixed, on the device and the host.
    void ExpectFrames(const std::string& what, const Json& clip, const std::vector<double>& frames) {
        for (const std::uint64_t memory : {std::uint64_t{0}, kNoMemory}) {
            const Film film = Render(clip, 0, memory);
            EXPECT_TRUE(film.failures.empty()) << what;
            ASSERT_EQ(film.pictures.size(), frames.size()) << what;
            for (std::size_t i = 0; i < frames.size(); ++i) {
                EXPECT_NEAR(FindBar(*film.pictures[i], 0, 1), PlaceOf(2 * frames[i]), 0.4)
                    << what << (memory == 0 ? "" : " by the host") << ", frame " << i;
            }
        }
    }
};

INSTANTIATE_TEST_SUITE_P(OnEachDevice, TimeOfClips, testing::Values(DeviceChoice::kCuda, DeviceChoice::kOpenCL),
                         NameOfDevice);

/// The mean frame number over a stretch of the media.
double MeanFrame(double from, double to) {
    double sum = 0;
    for (double at = from; at < to;) {
        const double next = std::min(std::floor(at) + 1.0, to);
        sum += (next - at) * std::min(std::floor(at), kBarFrames - 1.0);
        at = next;
    }
    return sum / (to - from);
}

TEST_P(TimeOfClips, BlendingMovesInEvenSteps) {
    const Json blend = {{"frame_blend", true}};
    for (const double speed : {0.25, 0.5, 0.8, -0.5}) {
        std::vector<double> frames;
        for (int i = 0; i < 8; ++i) frames.push_back(speed > 0 ? 3 + speed * i : 3 - speed * (7 - i));
        ExpectFrames("at " + std::to_string(speed), BarClip(3, 8, {Warp(speed)}, blend), frames);
    }
    for (const double speed : {1.5, 2.0, 2.5}) {
        std::vector<double> frames;
        for (int i = 0; i < 5; ++i) frames.push_back(MeanFrame(1 + speed * i, 1 + speed * (i + 1)));
        ExpectFrames("at " + std::to_string(speed), BarClip(1, 5, {Warp(speed)}, blend), frames);
    }
}

TEST_P(TimeOfClips, ReversedAndRemappedFramesAreHitExactly) {
    ExpectFrames("reversed", BarClip(2, 6, {Warp(-2)}), {12, 10, 8, 6, 4, 2});
    ExpectFrames("frozen", BarClip(7, 3, {Freeze()}), {7, 7, 7});
    const Json curve = {RemapKey(2, 3), RemapKey(6, 11, "hold"), RemapKey(8, 10), RemapKey(12, 2)};
    ExpectFrames("remapped", BarClip(2, 10, {}, {{"time_remap", curve}}), {3, 5, 7, 9, 11, 11, 10, 8, 6, 4});
}

TEST_P(TimeOfClips, WhatLiesOutsideTheMediaShowsTheNearestFrame) {
    const Json blend = {{"frame_blend", true}};
    const Json hours = {RemapKey(0, -300000), RemapKey(1, 8000000), RemapKey(2, -8000000), RemapKey(3, 5)};
    const double last = kBarFrames - 1;
    ExpectFrames("speed 0", BarClip(4, 2, {Warp(0)}), {4, 4});
    ExpectFrames("speed 1000", BarClip(2, 3, {Warp(1000)}), {2, last, last});
    ExpectFrames("speed -1000", BarClip(2, 3, {Warp(-1000)}), {last, last, 2});
    ExpectFrames("speed 1000, blended", BarClip(100, 2, {Warp(1000)}, blend), {last, last});
    ExpectFrames("hours in a frame", BarClip(0, 4, {}, {{"time_remap", hours}}), {0, last, 0, 5});
    const Json hoursMixed = {RemapKey(0, 50), RemapKey(3, 8000000)};
    ExpectFrames("hours in a frame, blended", BarClip(0, 3, {}, {{"time_remap", hoursMixed}, {"frame_blend", true}}),
                 {last, last, last});
    try {
        static_cast<void>(Render(BarClip(0, 4, {Warp(1e-6)}), 0));
        ADD_FAILURE() << "a film that stands still nearly";
    } catch (const TimelineError& error) {
        EXPECT_NE(std::string(error.what()).find("a speed is 0 or lies between"), std::string::npos) << error.what();
    }
}

}  // namespace
}  // namespace Vantrel::Host::Test
