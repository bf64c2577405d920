// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <array>
#include <cmath>
#include <random>

#include "Host/Media/PictureConverter.h"
#include "Tests/Host/Render/Films.h"

namespace Vantrel::Testing {
namespace {

struct Matrix {
    double kr, kb;
};
constexpr Matrix kBT601{0.299, 0.114};
constexpr Matrix kBT709{0.2126, 0.0722};
constexpr Matrix kBT2020{0.2627, 0.0593};

Host::Frame MakeYuv(AVPixelFormat format, int width, int height, int y, int cb, int cr) {
    Host::Frame frame = Host::MakeFrame();
    frame->format = format;
    frame->width = width;
    frame->height = height;
    EXPECT_GE(av_frame_get_buffer(frame.get(), 0), 0);
    FillPlane(*frame, 0, y);
    FillPlane(*frame, 1, cb);
    FillPlane(*frame, 2, cr);
    return frame;
}

/// Blue, green and red of what a luma and two chromas stand for, as the standards write it.
std::array<double, 3> Expected(int y, int cb, int cr, int bits, bool full, const Matrix& matrix) {
    const double unit = std::pow(2.0, bits - 8);
    const double peak = std::pow(2.0, bits) - 1;
    const double luma = full ? y / peak : (y / unit - 16) / 219;
    const double pb = full ? (cb - 128 * unit) / peak : (cb / unit - 128) / 224;
    const double pr = full ? (cr - 128 * unit) / peak : (cr / unit - 128) / 224;
    const double red = luma + 2 * (1 - matrix.kr) * pr;
    const double blue = luma + 2 * (1 - matrix.kb) * pb;
    return {blue, (luma - matrix.kr * red - matrix.kb * blue) / (1 - matrix.kr - matrix.kb), red};
}

class PictureConverterTest : public testing::Test {
protected:
    void Expect(const AVFrame& frame, const std::array<double, 3>& expected, double tolerance) {
        const auto picture = mConverter.Convert(frame, 0);
        const bool deep = picture->format == Vellum::kPixelFormat_BGRA_4444_32f;
        for (std::size_t c = 0; c < 3; ++c) {
            const std::byte* row = picture->GetRow(frame.height / 2);
            const std::size_t at = 4 * static_cast<std::size_t>(frame.width / 2) + c;
            const double value =
                deep ? static_cast<double>(reinterpret_cast<const float*>(row)[at]) : static_cast<int>(row[at]) / 255.0;
            const double limited = deep ? expected[c] : std::fmin(std::fmax(expected[c], 0.0), 1.0);
            EXPECT_NEAR(value, limited, tolerance) << "channel " << c;
        }
        EXPECT_EQ(picture->alphaType, Vellum::kAlphaType_None);
    }

    Host::PictureConverter mConverter{Host::PixelBufferPool::Create()};
};

TEST_F(PictureConverterTest, FollowsMatrixRangeAndDepth) {
    const std::pair<AVColorSpace, Matrix> spaces[] = {{AVCOL_SPC_BT709, kBT709},
                                                      {AVCOL_SPC_SMPTE170M, kBT601},
                                                      {AVCOL_SPC_BT470BG, kBT601},
                                                      {AVCOL_SPC_BT2020_NCL, kBT2020}};
    constexpr std::pair<AVPixelFormat, int> kFormats[] = {
        {AV_PIX_FMT_YUV420P, 8}, {AV_PIX_FMT_YUV444P10, 10}, {AV_PIX_FMT_YUV422P12, 12}, {AV_PIX_FMT_YUV420P16, 16}};
    constexpr int kCodes[][3] = {{16, 128, 128}, {235, 128, 128}, {126, 100, 160}, {90, 150, 110}};
    for (const auto& [space, matrix] : spaces) {
        for (const auto& [format, bits] : kFormats) {
            for (const bool full : {false, true}) {
                SCOPED_TRACE(testing::Message() << "space " << space << ", " << bits << " bits, full " << full);
                for (const auto& code : kCodes) {
                    const int unit = 1 << (bits - 8), y = code[0] * unit, cb = code[1] * unit, cr = code[2] * unit;
                    const Host::Frame frame = MakeYuv(format, 64, 32, y, cb, cr);
                    frame->colorspace = space;
                    frame->color_range = full ? AVCOL_RANGE_JPEG : AVCOL_RANGE_MPEG;
                    Expect(*frame, Expected(y, cb, cr, bits, full, matrix), bits == 8 ? 1.6 / 255 : 1e-5);
                }
            }
        }
    }
}

TEST_F(PictureConverterTest, DeepChromaLiesBetweenItsSamples) {
    const Host::Frame frame = MakeYuv(AV_PIX_FMT_YUV420P10, 8, 8, 512, 512, 512);
    frame->colorspace = AVCOL_SPC_BT709;
    // A step of red difference between the second and third sample across, and down.
    for (int y = 0; y < 4; ++y) {
        auto* row = reinterpret_cast<std::uint16_t*>(frame->data[2] + frame->linesize[2] * y);
        for (int x = 0; x < 4; ++x) row[x] = x >= 2 && y >= 2 ? 612 : 512;
    }
    const auto picture = mConverter.Convert(*frame, 0);
    const auto red = [&](int x, int y) {
        return static_cast<double>(reinterpret_cast<const float*>(picture->GetRow(y))[4 * x + 2]);
    };
    const double none = red(0, 7);
    const double whole = red(7, 7) - none;
    EXPECT_NEAR(whole, 2 * (1 - kBT709.kr) * 100.0 / 896, 1e-5);
    EXPECT_NEAR(red(2, 7) - none, 0, 1e-6);
    EXPECT_NEAR(red(3, 7) - none, 0.5 * whole, 1e-6);
    EXPECT_NEAR(red(4, 7) - none, whole, 1e-6);
    EXPECT_NEAR(red(7, 2) - none, 0, 1e-6);
    EXPECT_NEAR(red(7, 3) - none, 0.25 * whole, 1e-6);
    EXPECT_NEAR(red(7, 4) - none, 0.75 * whole, 1e-6);
    EXPECT_NEAR(red(7, 5) - none, whole, 1e-6);
}

/// A plane's value at a place in its own samples; beyond the border the border goes on.
double ValueBetween(const AVFrame& frame, int plane, double x, double y, int width, int height) {
    const auto at = [&](double column, double row) {
        const auto c = static_cast<int>(std::fmin(std::fmax(column, 0.0), width - 1.0));
        const auto r = static_cast<int>(std::fmin(std::fmax(row, 0.0), height - 1.0));
        return static_cast<double>(frame.data[plane][frame.linesize[plane] * r + c]);
    };
    const double left = std::floor(x), top = std::floor(y);
    const double upper = at(left, top) + (x - left) * (at(left + 1, top) - at(left, top));
    const double lower = at(left, top + 1) + (x - left) * (at(left + 1, top + 1) - at(left, top + 1));
    return upper + (y - top) * (lower - upper);
}

TEST_F(PictureConverterTest, ChromaOfBytesLiesWhereThePictureSays) {
    std::mt19937 random(7);
    for (const auto& [format, across, down] :
         {std::array<int, 3>{AV_PIX_FMT_YUV420P, 1, 1}, {AV_PIX_FMT_YUV422P, 1, 0}, {AV_PIX_FMT_YUV444P, 0, 0}}) {
        for (const auto location : {AVCHROMA_LOC_LEFT, AVCHROMA_LOC_CENTER}) {
            const Host::Frame frame = MakeYuv(static_cast<AVPixelFormat>(format), 37, 23, 0, 0, 0);
            frame->chroma_location = location;
            frame->colorspace = AVCOL_SPC_BT709;
            const int width = AV_CEIL_RSHIFT(37, across), height = AV_CEIL_RSHIFT(23, down);
            for (int plane = 0; plane < 3; ++plane) {
                for (int i = 0; i < frame->linesize[plane] * (plane == 0 ? 23 : height); ++i) {
                    frame->data[plane][i] = static_cast<std::uint8_t>(random() % 256);
                }
            }
            const auto picture = mConverter.Convert(*frame, 0);
            const double shift = location == AVCHROMA_LOC_CENTER && across != 0 ? 0.25 : 0.0;
            for (int y = 0; y < 23; ++y) {
                for (int x = 0; x < 37; ++x) {
                    const double u = x / (1.0 + across) - shift, v = down != 0 ? (y + 0.5) / 2 - 0.5 : y;
                    const double luma = frame->data[0][frame->linesize[0] * y + x] - 16;
                    const double cb = ValueBetween(*frame, 1, u, v, width, height) - 128;
                    const double cr = ValueBetween(*frame, 2, u, v, width, height) - 128;
                    const double red = luma / 219 + 2 * (1 - kBT709.kr) * cr / 224;
                    const double blue = luma / 219 + 2 * (1 - kBT709.kb) * cb / 224;
                    const double green =
                        (luma / 219 - kBT709.kr * red - kBT709.kb * blue) / (1 - kBT709.kr - kBT709.kb);
                    const double expected[] = {blue, green, red};
                    for (int c = 0; c < 3; ++c) {
                        const double level = 255 * std::fmin(std::fmax(expected[c], 0.0), 1.0);
                        ASSERT_NEAR(static_cast<int>(picture->GetRow(y)[4 * x + c]), level, 0.6)
                            << format << " at " << x << ", " << y << " channel " << c << " located " << location;
                    }
                }
            }
        }
    }
}

TEST_F(PictureConverterTest, AStreamThatSaysNothingIsJudgedByItsHeight) {
    const Host::Frame small = MakeYuv(AV_PIX_FMT_YUV444P, 64, 576, 120, 100, 180);
    Expect(*small, Expected(120, 100, 180, 8, false, kBT601), 1.6 / 255);
    const Host::Frame large = MakeYuv(AV_PIX_FMT_YUV444P, 64, 720, 120, 100, 180);
    Expect(*large, Expected(120, 100, 180, 8, false, kBT709), 1.6 / 255);
    const Host::Frame jpeg = MakeYuv(AV_PIX_FMT_YUVJ420P, 64, 64, 120, 100, 180);
    Expect(*jpeg, Expected(120, 100, 180, 8, true, kBT601), 1.6 / 255);
    // The same converter, another picture: nothing of the one before may stick.
    Expect(*small, Expected(120, 100, 180, 8, false, kBT601), 1.6 / 255);
}

TEST_F(PictureConverterTest, RefusesWhatCantBeConverted) {
    Host::Frame frame = Host::MakeFrame();
    frame->format = AV_PIX_FMT_VAAPI;
    frame->width = frame->height = 16;
    EXPECT_THROW((void)mConverter.Convert(*frame, 0), Host::MediaError);
}

}  // namespace
}  // namespace Vantrel::Testing
