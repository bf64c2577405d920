// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cstring>
#include <functional>

#include <gtest/gtest.h>

#include "Kiln/Frames.h"

namespace Kiln {
namespace {

using Vellum::RenderQuality;

VideoFrameRef MakeHostFrame(Vellum::PixelFormat format, std::int32_t width, std::int32_t height) {
    return CreateHostVideoFrame(format, width, height, {1, 1}, 0, {});
}

template <class T>
T* PixelAt(const VideoFrameRef& frame, std::int32_t x, std::int32_t y) {
    const std::ptrdiff_t rowBytes = Ostrand::Demand<Marl::IFrameRows>(frame)->GetRowBytes();
    return reinterpret_cast<T*>(Ostrand::Demand<Marl::IFrameData>(frame)->GetData() + y * rowBytes) + 4 * x;
}

template <class T>
void ForEachValue(const VideoFrameRef& frame, const std::function<void(T& value, int x, int y, int channel)>& work) {
    for (int y = 0; y < frame->GetBounds().Height(); ++y) {
        for (int x = 0; x < frame->GetBounds().Width(); ++x) {
            for (int c = 0; c < 4; ++c) work(PixelAt<T>(frame, x, y)[c], x, y, c);
        }
    }
}

constexpr RenderQuality kQualities[] = {RenderQuality::kDraft, RenderQuality::kLow, RenderQuality::kMedium,
                                        RenderQuality::kHigh, RenderQuality::kMaximum};

TEST(CopyToHostFrame, CopiesEqualSizesToTheBit) {
    for (const auto& [width, height] : {std::pair{1, 1}, {37, 19}, {700, 501}}) {
        const VideoFrameRef source = MakeHostFrame(Vellum::kPixelFormat_VUYP_4444_8u, width, height);
        ForEachValue<std::uint8_t>(source, [](std::uint8_t& value, int x, int y, int c) {
            value = static_cast<std::uint8_t>(31 * x + 17 * y + c);
        });
        const VideoFrameRef target = MakeHostFrame(Vellum::kPixelFormat_VUYP_4444_8u, width, height);
        ASSERT_EQ(CopyToHostFrame(target, source, RenderQuality::kDraft), 0);
        for (int y = 0; y < height; ++y) {
            ASSERT_EQ(std::memcmp(PixelAt<char>(target, 0, y), PixelAt<char>(source, 0, y), width * 4U), 0);
        }
    }
    const VideoFrameRef bgra = MakeHostFrame(Vellum::kPixelFormat_BGRA_4444_8u, 4, 4);
    EXPECT_LT(CopyToHostFrame(bgra, MakeHostFrame(Vellum::kPixelFormat_ARGB_4444_8u, 4, 4), RenderQuality::kHigh), 0);
    EXPECT_LT(CopyToHostFrame(bgra, {}, RenderQuality::kHigh), 0);
}

// A ramp stays a straight line away from the edges, where it is clamped. A cubic that is widened by a broken factor
// is off by 1.2e-4.
TEST(CopyToHostFrame, ARampKeepsItsPlace) {
    const VideoFrameRef source = MakeHostFrame(Vellum::kPixelFormat_BGRA_4444_32f, 64, 48);
    ForEachValue<float>(source, [](float& value, int x, int y, int c) {
        const float place = c == 1 ? (static_cast<float>(y) + 0.5F) / 48.0F : (static_cast<float>(x) + 0.5F) / 64.0F;
        value = c == 3 ? 1.0F : place;
    });
    for (const auto& [width, height] : {std::pair{16, 12}, {128, 144}, {50, 40}}) {
        for (const RenderQuality quality : {RenderQuality::kMedium, RenderQuality::kHigh}) {
            const VideoFrameRef target = MakeHostFrame(Vellum::kPixelFormat_BGRA_4444_32f, width, height);
            ASSERT_EQ(CopyToHostFrame(target, source, quality), 0);
            for (int y = height / 4; y < height * 3 / 4; ++y) {
                for (int x = width / 4; x < width * 3 / 4; ++x) {
                    const float* pixel = PixelAt<float>(target, x, y);
                    ASSERT_NEAR(pixel[0], (x + 0.5) / width, 3e-4) << x << ", " << y;
                    ASSERT_NEAR(pixel[1], (y + 0.5) / height, 3e-4) << x << ", " << y;
                }
            }
        }
    }
}

TEST(CopyToHostFrame, TransparentColourDoesNotBleed) {
    for (const auto format : {Vellum::kPixelFormat_BGRA_4444_8u, Vellum::kPixelFormat_ARGB_4444_8u}) {
        const int alpha = format == Vellum::kPixelFormat_ARGB_4444_8u ? 0 : 3;
        const VideoFrameRef source = MakeHostFrame(format, 40, 40);
        ForEachValue<std::uint8_t>(source, [alpha](std::uint8_t& value, int x, int, int c) {
            const bool isSolid = x >= 20;
            value = c == alpha ? (isSolid ? 255 : 0) : (isSolid ? 200 : 0);
        });
        const VideoFrameRef target = MakeHostFrame(format, 57, 57);
        ASSERT_EQ(CopyToHostFrame(target, source, RenderQuality::kMedium), 0);
        int soft = 0;
        for (int x = 0; x < 57; ++x) {
            const std::uint8_t* pixel = PixelAt<std::uint8_t>(target, x, 30);
            soft += pixel[alpha] > 0 && pixel[alpha] < 255;
            for (int c = 0; c < 4; ++c) {
                if (c == alpha || pixel[alpha] == 0) continue;
                EXPECT_EQ(pixel[c], 200) << x;
            }
        }
        EXPECT_GT(soft, 0) << "the edge is soft in alpha alone";
    }
}

}  // namespace
}  // namespace Kiln
