// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// The command as a person meets it: statuses, messages, files.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "Host/Media/VideoFile.h"
#include "Tests/Command/CommandFixture.h"

namespace Vantrel::Host::Test {
namespace {

using testing::HasSubstr;

TEST_F(Command, SaysWhatIsWrongWithAFile) {
    struct Case {
        std::string text;
        std::vector<std::string> words;
    };
    const Case cases[] = {
        {"{\"OTIO_SCHEMA\": \"Timeline.1\", ", {"bad.otio"}},
        {Timeline({Track({{{"OTIO_SCHEMA", "Hologram.1"}}})}).dump(),
         {"bad.otio", "Hologram", "/tracks/children/0/children/0"}},
        {Timeline({Track({Clip("a", Range(0, 10, 0), File("a.mov"))})}).dump(), {"bad.otio", "rate"}},
        {Timeline({Track({Clip("a", 0, 10, Effects({Effect("TQ.XQVE Invert", {{"1", "half"}})}))})}).dump(),
         {"bad.otio", "1"}},
    };
    for (const Case& bad : cases) {
        const std::string file = Write("bad.otio", bad.text);
        const Outcome outcome = Run("render " + file + " -o " + Path("out.mp4"));
        EXPECT_EQ(outcome.status, 1) << bad.text;
        for (const std::string& word : bad.words) EXPECT_THAT(outcome.err, HasSubstr(word));
        EXPECT_FALSE(std::filesystem::exists(Path("out.mp4")));
    }
    EXPECT_EQ(Run("render " + Path("nowhere.otio") + " -o " + Path("out.mp4")).status, 1);
}

TEST_F(Command, SaysWhatIsWrongWithItsArguments) {
    const std::string file = WriteFilm(5);
    const std::pair<const char*, const char*> cases[] = {{"--size 0x10", "0x10"},       {"--range 4:2", "4:2"},
                                                         {"--frame 5", "5 frames"},     {"--quality 9", "quality"},
                                                         {"--device abacus", "abacus"}, {"--range 0:6", "0:6"}};
    for (const auto& [argument, word] : cases) {
        const Outcome outcome = Run("render " + file + " -o " + Path("out.mp4") + " " + argument);
        EXPECT_EQ(outcome.status, 1) << argument;
        EXPECT_THAT(outcome.err, HasSubstr(word)) << argument;
    }
    for (const char* output : {"out.avi", "out.png"}) {
        const Outcome outcome = Run("render " + file + " -o " + Path(output));
        EXPECT_EQ(outcome.status, 3) << output;
        EXPECT_THAT(outcome.err, HasSubstr(output));
    }
    const Outcome folder = Run("render " + file + " -o " + Path("no/such/out.mp4"));
    EXPECT_EQ(folder.status, 3);
    EXPECT_THAT(folder.err, HasSubstr("no/such"));
}

TEST_F(Command, NothingIsReplacedSilently) {
    const std::string offline =
        Write("offline.otio", Timeline({Track({Clip("holiday", Range(0, 3), File("missing.mov", 0, 3))})}));
    const Outcome missing = Run("render " + offline + " -o " + Path("out.mp4") + " --size 64x36");
    EXPECT_EQ(missing.status, 2);
    EXPECT_THAT(missing.err, HasSubstr("offline"));
    EXPECT_THAT(missing.err, HasSubstr("missing.mov"));

    const Outcome passed = Run("render " + WriteFilm(3, {Effect("Sparkle")}) + " -o " + Path("out.mp4"));
    EXPECT_EQ(passed.status, 2);
    EXPECT_THAT(passed.err, HasSubstr("Sparkle"));
    const Outcome shaky =
        Run("render " + WriteFilm(3, {Effect("TQ.XQVE SubspaceStabilizer")}) + " -o " + Path("out.mp4"));
    EXPECT_EQ(shaky.status, 2) << "nothing was analysed";
    EXPECT_THAT(shaky.err, HasSubstr("TQ.XQVE SubspaceStabilizer"));
    const Outcome strict =
        Run("render " + WriteFilm(3, {Effect("Sparkle")}) + " -o " + Path("strict.mp4") + " --strict");
    EXPECT_NE(strict.status, 0);
    EXPECT_THAT(strict.err, HasSubstr("Sparkle"));

    const Outcome device =
        Run("render " + WriteFilm(3) + " -o " + Path("none.mp4") + " --device cuda", "KILN_CUDA_DRIVER=none");
    EXPECT_EQ(device.status, 3);
    EXPECT_THAT(device.err, HasSubstr("CUDA"));
    EXPECT_FALSE(std::filesystem::exists(Path("none.mp4")));
}

TEST_F(Command, WritesFilmsAndPicturesThatReadBack) {
    const std::string file = WriteFilm(10);
    for (const char* name : {"film.mp4", "film.mov", "film.mkv"}) {
        const Outcome outcome = Run("render " + file + " -o " + Path(name));
        ASSERT_EQ(outcome.status, 0) << outcome.err;
        VideoFile film(Path(name), 1);
        EXPECT_EQ(film.GetInfo().width, 64);
        EXPECT_EQ(film.ReadFrame(9)->height, 36);
    }
    ASSERT_EQ(Run("render " + file + " -o " + Path("p%03d.png") + " --range 2:5").status, 0);
    EXPECT_TRUE(std::filesystem::exists(Path("p002.png")) && std::filesystem::exists(Path("p004.png")));
    EXPECT_FALSE(std::filesystem::exists(Path("p005.png")));
    ASSERT_EQ(Run("render " + file + " -o " + Path("one.exr") + " --frame 3 --alpha --size 1x1").status, 0);
    EXPECT_EQ(VideoFile(Path("one.exr"), 1).GetInfo().width, 1);
}

TEST_F(Command, LeavesNothingBehindWhenItIsInterruptedOrTheDiskIsFull) {
    const std::string file = WriteFilm(20000);
    const Outcome stopped = Run("render " + file + " -o " + Path("long.mp4"), "timeout -s INT 2");
    EXPECT_NE(stopped.status, 0);
    EXPECT_THAT(stopped.err, HasSubstr("interrupted"));
    // A limit on the size of files stands in for a disk that is full.
    const Outcome full =
        Run("render " + file + " -o " + Path("full.mkv") + " --range 0:3000", "trap '' XFSZ; ulimit -f 16;");
    EXPECT_EQ(full.status, 3);
    EXPECT_THAT(full.err, HasSubstr("full.mkv"));
    for (const auto& entry : std::filesystem::directory_iterator(Path(""))) {
        EXPECT_TRUE(entry.path().extension() == ".otio" || entry.path().extension() == ".txt") << entry.path();
    }
}

TEST_F(Command, ListsDevicesEffectsAndSegments) {
    const Json devices = Json::parse(Run("devices --json").out);
    ASSERT_EQ(devices.size(), 2U);
    EXPECT_FALSE(devices[0]["devices"].empty());
    const Json effects = Json::parse(Run("effects --json").out);
    const auto invert =
        std::find_if(effects.begin(), effects.end(), [](const Json& e) { return e["matchName"] == "TQ.XQVE Invert"; });
    ASSERT_NE(invert, effects.end());
    EXPECT_FALSE((*invert)["parameters"].empty());
    EXPECT_EQ(effects.back()["matchName"], "XQVE Push");
    EXPECT_EQ(effects.back()["properties"][0]["choices"], Json({"right", "down", "left", nullptr, "up"}));
    const Outcome segments = Run("segments " + WriteFilm(5));
    EXPECT_EQ(segments.status, 0);
    EXPECT_TRUE(Json::parse(segments.out).is_object());
}

}  // namespace
}  // namespace Vantrel::Host::Test
