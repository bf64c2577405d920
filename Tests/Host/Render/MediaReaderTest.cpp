// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>

#include "Host/Media/FFmpegProbe.h"
#include "Host/Media/MediaReader.h"
#include "Host/Media/NumberPicture.h"
#include "Host/Software/MediaPictures.h"
#include "Tests/Host/Render/Films.h"

namespace Vantrel::Testing {
namespace {

using Host::FFmpegProbe;
using Host::HostPictureRef;
using Host::MediaError;
using Host::MediaReader;
using Host::PixelBufferPool;
using testing::HasSubstr;
using testing::ThrowsMessage;

class MediaReaderTest : public testing::Test {
protected:
    std::int64_t NumberAt(const std::string& path, std::int64_t frame) {
        return Host::ReadNumber(*mReader->Read(path, frame));
    }

    /// Reads in order, backwards, in leaps and beyond both ends.
    void ExpectFramesByNumber(const std::string& path, int count) {
        SCOPED_TRACE(path);
        for (int i = 0; i < count; ++i) ASSERT_EQ(NumberAt(path, i), i) << "forwards";
        for (int i = count - 1; i >= 0; --i) ASSERT_EQ(NumberAt(path, i), i) << "backwards";
        for (int i = 0; i < 25; ++i) {
            const int frame = i * 37 % count;
            ASSERT_EQ(NumberAt(path, frame), frame) << "in leaps";
        }
        EXPECT_EQ(NumberAt(path, -7), 0);
        EXPECT_EQ(NumberAt(path, count), count - 1);
        EXPECT_EQ(NumberAt(path, count + 1000), count - 1);
        EXPECT_EQ(NumberAt(path, 0), 0);
    }

    ScratchFolder mFolder;
    std::shared_ptr<PixelBufferPool> mPool = PixelBufferPool::Create();
    std::unique_ptr<MediaReader> mReader = std::make_unique<MediaReader>(mPool, 1);
    FFmpegProbe mProbe;
};

/// An 8-bit frame of luma that shows a number, like DrawNumber.
void DrawLumaNumber(AVFrame& frame, int number) {
    FillPlane(frame, 1, 128);
    FillPlane(frame, 2, 128);
    for (int y = 0; y < frame.height; ++y) {
        for (int x = 0; x < frame.width; ++x) {
            const int square = y * 4 / frame.height * 4 + x * 4 / frame.width;
            frame.data[0][frame.linesize[0] * y + x] = (number >> (15 - square) & 1) != 0 ? 235 : 16;
        }
    }
}

TEST_F(MediaReaderTest, ReadsFramesByTheirNumber) {
    // The writer's own films have frames that refer to later ones; Matroska rounds times to milliseconds.
    for (const auto& [name, ticks] : {std::pair{"a.mp4", kTicks24}, std::pair{"b.mov", kTicks2997},
                                      std::pair{"c.mkv", kTicks2997}, std::pair{"d.mkv", kTicks24}}) {
        WriteNumberFilm(mFolder / name, 70, ticks);
        ExpectFramesByNumber(mFolder / name, 70);
    }
}

TEST_F(MediaReaderTest, ReadsOlderCodecsAndOddSizes) {
    WriteFilm(mFolder / "b.avi", {"mpeg4", AV_PIX_FMT_YUV420P, 64, 48, 40, {25, 1}, 2, 12}, DrawLumaNumber);
    ExpectFramesByNumber(mFolder / "b.avi", 40);
    WriteFilm(mFolder / "m.mpg", {"mpeg2video", AV_PIX_FMT_YUV420P, 64, 48, 40, {25, 1}, 2, 12}, DrawLumaNumber);
    ExpectFramesByNumber(mFolder / "m.mpg", 40);
    WriteFilm(mFolder / "odd.mkv", {"ffv1", AV_PIX_FMT_YUV420P, 67, 45, 9}, DrawLumaNumber);
    ExpectFramesByNumber(mFolder / "odd.mkv", 9);
    const HostPictureRef picture = mReader->Read(mFolder / "odd.mkv", 3);
    EXPECT_EQ(picture->width, 67);
    EXPECT_EQ(picture->height, 45);
}

TEST_F(MediaReaderTest, FailuresNameTheFileAndLeaveTheReaderUsable) {
    EXPECT_THAT([&] { (void)mReader->Read(mFolder / "none.mp4", 0); },
                ThrowsMessage<MediaError>(testing::AllOf(HasSubstr("none.mp4"), HasSubstr("No such file"))));
    std::ofstream(mFolder / "text.mp4") << "this is no film";
    EXPECT_THAT([&] { (void)mReader->Read(mFolder / "text.mp4", 0); },
                ThrowsMessage<MediaError>(HasSubstr("text.mp4")));
    EXPECT_THAT(mProbe.ProbeFile(mFolder / "text.mp4").error, HasSubstr("text.mp4"));
    const std::string whole = mFolder / "whole.mkv";
    WriteNumberFilm(whole, 60);
    EXPECT_EQ(NumberAt(whole, 59), 59);
    // A film that breaks off shows its last frame from there on.
    const std::string broken = mFolder / "broken.mkv";
    std::filesystem::copy_file(whole, broken);
    std::filesystem::resize_file(broken, std::filesystem::file_size(whole) * 6 / 10);
    const std::int64_t last = NumberAt(broken, 59);
    EXPECT_GT(last, 5);
    EXPECT_LT(last, 59);
    EXPECT_EQ(NumberAt(broken, 2), 2);
    EXPECT_EQ(NumberAt(broken, 58), last);
}

TEST_F(MediaReaderTest, TurnsRotatedFilmsUpright) {
    // Stored with a white upper left quarter.
    const auto draw = [](AVFrame& frame, int) {
        FillPlane(frame, 0, 16);
        FillPlane(frame, 1, 128);
        FillPlane(frame, 2, 128);
        for (int y = 0; y < frame.height / 2; ++y) {
            std::fill_n(frame.data[0] + frame.linesize[0] * y, frame.width / 2, std::uint8_t{235});
        }
    };
    const auto isWhite = [](const Host::HostPicture& picture, bool right, bool bottom) {
        const int x = picture.width * (right ? 3 : 1) / 4;
        const int y = picture.height * (bottom ? 3 : 1) / 4;
        return static_cast<int>(picture.GetRow(y)[4 * x + 1]) > 200;
    };
    struct Case {
        int rotation;
        bool right, bottom;
    };
    for (const Case& turned : {Case{90, true, false}, Case{180, true, true}, Case{270, false, true}}) {
        SCOPED_TRACE(turned.rotation);
        const std::string path = mFolder / (std::to_string(turned.rotation) + ".mp4");
        FilmPlan plan{"mpeg4", AV_PIX_FMT_YUV420P, 64, 32, 3};
        plan.rotation = turned.rotation;
        plan.aspect = {4, 3};
        WriteFilm(path, plan, draw);
        const HostPictureRef picture = mReader->Read(path, 1);
        const bool quarter = turned.rotation != 180;
        EXPECT_EQ(picture->width, quarter ? 32 : 64);
        EXPECT_EQ(picture->height, quarter ? 64 : 32);
        EXPECT_EQ(picture->aspect.numerator, quarter ? 3 : 4);
        for (const bool right : {false, true}) {
            for (const bool bottom : {false, true}) {
                EXPECT_EQ(isWhite(*picture, right, bottom), right == turned.right && bottom == turned.bottom);
            }
        }
        const auto info = mProbe.ProbeFile(path).info;
        ASSERT_TRUE(info);
        EXPECT_EQ(info->width, picture->width);
        EXPECT_EQ(info->height, picture->height);
        EXPECT_EQ(info->pixelAspectNumerator, picture->aspect.numerator);
    }
}

TEST_F(MediaReaderTest, DeepFilmsComeAsFloats) {
    WriteFilm(mFolder / "deep.mkv", {"ffv1", AV_PIX_FMT_YUV422P10, 32, 16, 2}, [](AVFrame& frame, int n) {
        FillPlane(frame, 0, n == 0 ? 64 : 503);
        FillPlane(frame, 1, 512);
        FillPlane(frame, 2, 512);
    });
    const HostPictureRef picture = mReader->Read(mFolder / "deep.mkv", 1);
    EXPECT_EQ(picture->format, Vellum::kPixelFormat_BGRA_4444_32f);
    const auto* pixel = reinterpret_cast<const float*>(picture->GetRow(7)) + 4 * 11;
    for (int c = 0; c < 3; ++c) EXPECT_NEAR(pixel[c], (503.0 - 64.0) / 876.0, 0.0005);
    EXPECT_EQ(mProbe.ProbeFile(mFolder / "deep.mkv").info->bitDepth, 10);
    // White is white in deep formats of red, green and blue as well.
    WriteFilm(mFolder / "deep.png", {"png", AV_PIX_FMT_RGB48BE, 8, 8}, [](AVFrame& frame, int) {
        for (int y = 0; y < 8; ++y) std::fill_n(frame.data[0] + frame.linesize[0] * y, 48, std::uint8_t{255});
    });
    const HostPictureRef white = mReader->Read(mFolder / "deep.png", 0);
    for (int c = 0; c < 4; ++c) EXPECT_FLOAT_EQ(reinterpret_cast<const float*>(white->GetRow(4))[c], 1.0F);
}

TEST_F(MediaReaderTest, ReadsStillsWithTheirAlpha) {
    WriteImage(mFolder / "still.png", 13, 7, [](int x, int y) {
        return std::array<float, 4>{static_cast<float>(x) / 12.0F, static_cast<float>(y) / 6.0F, 1.0F,
                                    x < 6 ? 0.2F : 1.0F};
    });
    const auto info = mProbe.ProbeFile(mFolder / "still.png").info;
    ASSERT_TRUE(info);
    EXPECT_TRUE(info->still);
    EXPECT_EQ(info->ticksPerFrame, 0);
    EXPECT_EQ(info->frameCount, 1);
    EXPECT_EQ(info->alphaType, Host::AlphaType::kStraight);
    const HostPictureRef picture = mReader->Read(mFolder / "still.png", 100);
    ASSERT_EQ(picture->width, 13);
    EXPECT_EQ(picture->alphaType, Vellum::kAlphaType_Straight);
    for (int x = 0; x < 13; ++x) {
        const auto* pixel = reinterpret_cast<const std::uint8_t*>(picture->GetRow(3)) + 4 * x;
        EXPECT_EQ(pixel[0], (x * 255 + 6) / 12);
        EXPECT_EQ(pixel[1], 128);
        EXPECT_EQ(pixel[2], 255);
        EXPECT_EQ(pixel[3], x < 6 ? 51 : 255);
    }
}

TEST_F(MediaReaderTest, ProbesWhatAFilmSaysOfItself) {
    Host::OutputFormat format;
    format.path = mFolder / "tc.mov";
    format.width = 64;
    format.height = 32;
    format.rate = Vellum::FrameRate::Create(kTicks24);
    format.aspect = {16, 11};
    format.timecode = "01:00:00:12";
    const auto writer = Host::CreateFrameWriter(format, 30);
    const auto picture = Host::MakeHostPicture(*mPool, Vellum::kPixelFormat_BGRA_4444_8u, 64, 32);
    Host::DrawNumber(*picture, 0);
    for (int i = 0; i < 30; ++i) writer->Write(*picture, i);
    writer->Finish();
    const auto info = mProbe.ProbeFile(format.path).info;
    ASSERT_TRUE(info);
    EXPECT_EQ(info->ticksPerFrame, kTicks24);
    EXPECT_EQ(info->frameCount, 30);
    EXPECT_EQ(info->pixelAspectNumerator, 16);
    EXPECT_EQ(info->pixelAspectDenominator, 11);
    EXPECT_EQ(info->fieldType, Host::FieldType::kProgressive);
    EXPECT_EQ(info->alphaType, Host::AlphaType::kNone);
    EXPECT_EQ(info->codecTag, 0x61766331U) << "avc1";
    ASSERT_TRUE(info->startTimecode);
    EXPECT_EQ(*info->startTimecode, (3600 * 24 + 12) * kTicks24);

    WriteNumberFilm(mFolder / "ntsc.mkv", 31, kTicks2997);
    const auto ntsc = mProbe.ProbeFile(mFolder / "ntsc.mkv").info;
    EXPECT_EQ(ntsc->ticksPerFrame, kTicks2997);
    EXPECT_EQ(ntsc->frameCount, 31);

    FilmPlan fields{"mpeg2video", AV_PIX_FMT_YUV420P, 64, 48, 12, {25, 1}};
    fields.fieldOrder = AV_FIELD_TT;
    WriteFilm(mFolder / "fields.mkv", fields, DrawLumaNumber);
    EXPECT_EQ(mProbe.ProbeFile(mFolder / "fields.mkv").info->fieldType, Host::FieldType::kTopFirst);
}

TEST_F(MediaReaderTest, ImageSequencesFollowTheirMissingFramePolicy) {
    for (const int number : {10, 12, 16}) {
        WriteImage(mFolder / ("shot." + std::to_string(1000 + number).substr(1) + ".png"), 8, 8, [number](int, int) {
            return std::array<float, 4>{static_cast<float>(number) / 255.0F, 0, 0, 1};
        });
    }
    Host::ImageSequence images;
    images.directory = mFolder / "";
    images.prefix = "shot.";
    images.suffix = ".png";
    images.startNumber = 10;
    images.numberStep = 2;
    images.zeroPadding = 3;
    images.frameCount = 4;
    Host::MediaClip clip;
    clip.info.width = clip.info.height = 8;
    clip.info.frameCount = 4;
    clip.info.ticksPerFrame = kTicks24;
    Host::Software::MediaPictures pictures(mPool, std::make_shared<MediaReader>(mPool, 1), {});
    const auto read = [&](std::int64_t frame, Host::MissingFramePolicy policy) {
        images.missing = policy;
        clip.source = Host::ImageSequenceSource{images};
        const HostPictureRef picture = pictures.GetFrame(clip, "shot", frame);
        EXPECT_EQ(static_cast<int>(picture->GetRow(0)[3]), 255);
        return static_cast<int>(picture->GetRow(4)[0]);
    };
    using Policy = Host::MissingFramePolicy;
    EXPECT_EQ(read(0, Policy::kError), 10);
    EXPECT_EQ(read(1, Policy::kError), 12);
    EXPECT_EQ(read(3, Policy::kError), 16);
    EXPECT_EQ(read(-3, Policy::kError), 10);
    EXPECT_EQ(read(9, Policy::kError), 16);
    EXPECT_EQ(read(2, Policy::kHold), 12);
    EXPECT_EQ(read(2, Policy::kBlack), 0);
    EXPECT_THAT([&] { (void)read(2, Policy::kError); },
                ThrowsMessage<MediaError>(testing::AllOf(HasSubstr("shot.014.png"), HasSubstr("missing"))));
}

}  // namespace
}  // namespace Vantrel::Testing
