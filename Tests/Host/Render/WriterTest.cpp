// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <fstream>
#include <sstream>

#include "Host/Media/FFmpegProbe.h"
#include "Host/Media/MediaReader.h"
#include "Host/Render/OutputQueue.h"
#include "Tests/Host/Render/Films.h"

namespace Vantrel::Testing {
namespace {

using Host::HostPictureRef;
using Host::OutputError;
using Host::OutputFormat;
using Host::PixelBufferPool;
using testing::HasSubstr;
using testing::ThrowsMessage;

class WriterTest : public testing::Test {
protected:
    [[nodiscard]] OutputFormat Format(const std::string& name, int width = 32, int height = 16) const {
        OutputFormat format;
        format.path = mFolder / name;
        format.width = width;
        format.height = height;
        format.rate = Vellum::FrameRate::Create(kTicks24);
        return format;
    }

    std::shared_ptr<Host::HostPicture> Solid(const OutputFormat& format, Vellum::PixelFormat pixelFormat,
                                             const std::array<float, 4>& color) {
        auto picture = Host::MakeHostPicture(*mPool, pixelFormat, format.width, format.height);
        FillPicture(*picture, [&](int, int) { return color; });
        return picture;
    }

    [[nodiscard]] static std::string ReadText(const std::string& path) {
        std::ifstream file(path, std::ios::binary);
        std::ostringstream text;
        text << file.rdbuf();
        return text.str();
    }

    ScratchFolder mFolder;
    std::shared_ptr<PixelBufferPool> mPool = PixelBufferPool::Create();
    Host::MediaReader mReader{mPool, 1};
};

constexpr std::array<float, 4> kColor{0.2F, 0.6F, 0.8F, 0.4F};

TEST_F(WriterTest, PngPicturesComeBackToTheBit) {
    for (const bool alpha : {false, true}) {
        OutputFormat format = Format(alpha ? "alpha.%04d.png" : "opaque.%d.png", 33, 17);
        format.alpha = alpha;
        const auto writer = Host::CreateFrameWriter(format, 2);
        writer->Write(*Solid(format, writer->GetPixelFormat(), kColor), 7);
        writer->Write(*Solid(format, writer->GetPixelFormat(), {1, 1, 1, 1}), 8);
        writer->Finish();
        const HostPictureRef picture = mReader.Read(mFolder / (alpha ? "alpha.0007.png" : "opaque.7.png"), 0);
        ASSERT_EQ(picture->width, 33);
        const auto* pixel = reinterpret_cast<const std::uint8_t*>(picture->GetRow(16)) + 4 * 32;
        EXPECT_EQ(pixel[0], 51);
        EXPECT_EQ(pixel[1], 153);
        EXPECT_EQ(pixel[2], 204);
        EXPECT_EQ(pixel[3], alpha ? 102 : 255);
    }
    EXPECT_EQ(mFolder.List(), "alpha.0007.png alpha.0008.png opaque.7.png opaque.8.png");
}

TEST_F(WriterTest, ExrPicturesKeepFloatsAndPremultiply) {
    OutputFormat format = Format("deep.exr");
    format.alpha = true;
    const auto writer = Host::CreateFrameWriter(format, 1);
    ASSERT_EQ(writer->GetPixelFormat(), Vellum::kPixelFormat_BGRA_4444_32f);
    writer->Write(*Solid(format, writer->GetPixelFormat(), {0.25F, 3.5F, -0.5F, 0.5F}), 0);
    writer->Finish();
    const HostPictureRef picture = mReader.Read(format.path, 0);
    ASSERT_EQ(picture->format, Vellum::kPixelFormat_BGRA_4444_32f);
    const auto* pixel = reinterpret_cast<const float*>(picture->GetRow(9)) + 4 * 5;
    EXPECT_FLOAT_EQ(pixel[0], 0.125F);
    EXPECT_FLOAT_EQ(pixel[1], 1.75F);
    EXPECT_FLOAT_EQ(pixel[2], -0.25F);
    EXPECT_FLOAT_EQ(pixel[3], 0.5F);
    Host::FFmpegProbe probe;
    EXPECT_EQ(probe.ProbeFile(format.path).info->alphaType, Host::AlphaType::kPremultiplied);
}

TEST_F(WriterTest, AFinalNameStaysUntouchedUntilTheFileIsWhole) {
    const OutputFormat format = Format("film.mp4");
    std::ofstream(format.path) << "what was there before";
    {
        const auto writer = Host::CreateFrameWriter(format, 2);
        writer->Write(*Solid(format, writer->GetPixelFormat(), kColor), 0);
        EXPECT_EQ(ReadText(format.path), "what was there before");
    }
    EXPECT_EQ(mFolder.List(), "film.mp4") << "what was begun and given up is gone";
    EXPECT_EQ(ReadText(format.path), "what was there before");
    const auto writer = Host::CreateFrameWriter(format, 1);
    writer->Write(*Solid(format, writer->GetPixelFormat(), kColor), 0);
    writer->Finish();
    EXPECT_NE(ReadText(format.path), "what was there before");
    EXPECT_EQ(mFolder.List(), "film.mp4");
}

TEST_F(WriterTest, WrongOutputsAreRefusedAtOnce) {
    const auto expect = [this](const OutputFormat& format, std::int64_t frames, const char* text) {
        EXPECT_THAT([&] { (void)Host::CreateFrameWriter(format, frames); }, ThrowsMessage<OutputError>(HasSubstr(text)))
            << format.path;
    };
    expect(Format("nowhere/film.mp4"), 1, "nowhere");
    expect(Format("nowhere/a.%d.png"), 1, "nowhere");
    expect(Format("film.xyz"), 1, "unknown form");
    expect(Format("one.png"), 2, "%d");
    expect(Format("two.%d.%d.png"), 2, "%d");
    expect(Format("percent.%s.png"), 2, "%d");
    OutputFormat alpha = Format("film.mov");
    alpha.alpha = true;
    expect(alpha, 1, "alpha");
    EXPECT_EQ(mFolder.List(), "");
}

TEST_F(WriterTest, TheQueueWritesInOrder) {
    class Recorder : public Host::FrameWriter {
    public:
        [[nodiscard]] Vellum::PixelFormat GetPixelFormat() const override { return Vellum::kPixelFormat_BGRA_4444_8u; }
        void Write(const Host::HostPicture&, std::int64_t number) override { written.push_back(number); }
        void Finish() override {}
        std::vector<std::int64_t> written;
    };
    const OutputFormat format = Format("unused.png");
    const auto push = [&](Host::OutputQueue& queue, std::int64_t number) {
        Host::RenderedFrame frame;
        frame.number = number;
        frame.picture = Solid(format, Vellum::kPixelFormat_BGRA_4444_8u, kColor);
        queue.Push(std::move(frame));
    };
    Recorder recorder;
    {
        Host::OutputQueue queue(recorder);
        for (int i = 0; i < 30; ++i) push(queue, i);
        queue.Finish();
    }
    ASSERT_EQ(recorder.written.size(), 30U);
    EXPECT_TRUE(std::is_sorted(recorder.written.begin(), recorder.written.end()));
}

}  // namespace
}  // namespace Vantrel::Testing
