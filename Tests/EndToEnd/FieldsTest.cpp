// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// A bar that moves from field to field, through the whole road: each field of each frame must show it where it is at
// that field's time.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdio>

#include "Host/Media/FFmpegProbe.h"
#include "Host/Output/FrameWriter.h"
#include "Tests/EndToEnd/BarFilm.h"
#include "Vellum/Field.h"

namespace Vantrel::Host::Test {
namespace {

constexpr int kIn = 2;
constexpr int kDuration = 8;

/// The nearer whole number, the lower one of two as near.
double Nearest(double value) { return std::ceil(value - 0.5 - 1e-9); }

struct Play {
    std::uint32_t media = 0;  ///< the true order of its fields
    std::uint32_t sequence = 0;
    double speed = 1.0;

    /// Where the bar is in the lines that begin with `line`.
    [[nodiscard]] double Expect(int frame, int line) const {
        const bool later = sequence == Vellum::kFieldType_UpperFirst ? line == 1 : line == 0;
        const double lasts = sequence != 0 ? 0.5 : 1.0;
        const double t = frame + (sequence != 0 && later ? 0.5 : 0.0);
        const double at = speed > 0 ? kIn + speed * t : kIn - speed * (kDuration - t - lasts);
        if (media == 0) return PlaceOf(2 * Nearest(at));
        if (sequence == 0 && speed == 1.0) {
            // Frames pass as they are, with both fields.
            return PlaceOf(2 * at + ((media == Vellum::kFieldType_UpperFirst) == (line == 1) ? 1 : 0));
        }
        return PlaceOf(Nearest(2 * at));
    }
};

class Fields : public BarFilms {
protected:
    /// Renders the bar's film and compares every field. `more` goes into the clip.
    void Check(const std::string& what, const std::string& film, const Play& play, Json more = Json::object(),
               std::uint64_t deviceMemory = 0) {
        Json clip = Clip("bar", Range(kIn, kDuration), File(film, 0, kBarFrames), std::move(more));
        if (play.speed != 1.0) clip["effects"].push_back(Warp(play.speed));
        const Film rendered = Render(clip, play.sequence, deviceMemory);
        EXPECT_TRUE(rendered.failures.empty()) << what << ": " << rendered.failures.front();
        ASSERT_EQ(rendered.pictures.size(), std::size_t{kDuration}) << what;
        EXPECT_EQ(rendered.summary.hostFrames, deviceMemory == 0 ? 0 : kDuration) << what;
        for (int frame = 0; frame < kDuration; ++frame) {
            const HostPicture& picture = *rendered.pictures[static_cast<std::size_t>(frame)];
            for (const int line : {0, 1}) {
                EXPECT_NEAR(FindBar(picture, line), play.Expect(frame, line), 0.3)
                    << what << ", media " << play.media << " in sequence " << play.sequence << " at speed "
                    << play.speed << ", frame " << frame << ", lines from " << line;
            }
        }
    }
};

INSTANTIATE_TEST_SUITE_P(OnEachDevice, Fields, testing::Values(DeviceChoice::kCuda, DeviceChoice::kOpenCL),
                         NameOfDevice);

TEST_P(Fields, ShowTheirOwnMomentsWhateverTheOrderOfMediaAndSequence) {
    for (const std::uint32_t media : {0U, 1U, 2U}) {
        const std::string film = "bar" + std::to_string(media) + ".mov";
        WriteBarFilm(mFolder.Path(film), media, media);
        for (const std::uint32_t sequence : {0U, 1U, 2U}) {
            for (const double speed : {1.0, 0.5, -1.0, -0.5}) {
                const Play play{media, sequence, speed};
                Check("on the device", film, play);
                Check("through an effect of the host", film, play, Effects({Effect("lavfi:null")}));
                Check("by the host", film, play, Json::object(), 100000);
            }
        }
    }
}

TEST_P(Fields, AreTakenInTheOtherOrderOnDemand) {
    for (const std::uint32_t claimed : {1U, 2U}) {
        WriteBarFilm(mFolder.Path("wrong.mov"), 3 - claimed, claimed);
        for (const std::uint32_t sequence : {1U, 2U}) {
            for (const double speed : {1.0, -1.0}) {
                const Json reversed = Own({{"reverse_field_dominance", true}});
                Check("reversed", "wrong.mov", {3 - claimed, sequence, speed}, reversed);
                Check("reversed by the host", "wrong.mov", {3 - claimed, sequence, speed}, reversed, 100000);
            }
        }
    }
}

TEST(InterlacedFilms, KeepTheColorsOfTheirFieldsApart) {
    const Folder folder("vantrel-interlaced-colors");
    const auto pool = PixelBufferPool::Create();
    for (const int height : {80, 82, 45}) {
        OutputFormat format;
        format.path = folder.Path("film.mov");
        format.width = 64;
        format.height = height;
        format.rate = Vellum::FrameRate::Create(kFrame);
        format.fieldType = Vellum::kFieldType_UpperFirst;
        const auto picture = MakeHostPicture(*pool, Vellum::kPixelFormat_BGRA_4444_8u, 64, height);
        for (int y = 0; y < height; ++y) {
            std::fill_n(reinterpret_cast<std::uint32_t*>(picture->GetRow(y)), 64,
                        y % 2 == 0 ? 0xFFE02020U : 0xFF2020E0U);
        }
        const auto writer = CreateFrameWriter(format, 2);
        writer->Write(*picture, 0);
        writer->Write(*picture, 1);
        writer->Finish();
        const auto read = MediaReader(pool, 1).Read(format.path, 1);
        ASSERT_GE(read->height, height);
        for (int y = 0; y < height; ++y) {
            const auto* pixel = reinterpret_cast<const std::uint8_t*>(read->GetRow(y)) + 4 * 30;
            EXPECT_NEAR(pixel[2], y % 2 == 0 ? 0xE0 : 0x20, 12) << height << ", line " << y;
            EXPECT_NEAR(pixel[0], y % 2 == 0 ? 0x20 : 0xE0, 12) << height << ", line " << y;
        }
    }
}

}  // namespace
}  // namespace Vantrel::Host::Test
