// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/ColorBars.h"

#include <boost/make_shared.hpp>

#include "Src/Filters/Synthetics/ColorBarsNode.h"
#include "Tests/Effects/EffectTester.h"

namespace Vantrel::Testing {
namespace {

using ColorBarsOnEachDevice = EffectTest;

TEST_P(ColorBarsOnEachDevice, AreThePatternAtEverySizeAndOneFrameForAllTimes) {
    Random random;
    const Ostrand::InterfaceRef<ColorBarsNode> bars(new ColorBarsNode);
    EXPECT_TRUE(Configure(RenderNodeRef(bars), {}));
    RenderParams request;
    request.quality = IsHalf() ? 1 : 2;
    const bool isCuda = GetParam().framework == Kiln::DeviceFramework::kCuda;
    const Vellum::PixelFormat format =
        IsHalf() && isCuda ? Kiln::kPixelFormat_GPU_BGRA_4444_16f : Kiln::kPixelFormat_GPU_BGRA_4444_32f;
    const int sizes[][2] = {{1920, 1080}, {720, 486}, {1, 1}, {2, 2}, {7, 50}, {3, 25}, {0, 0}, {0, 0}, {0, 0}};
    for (const auto& size : sizes) {
        const int width = size[0] != 0 ? size[0] : random.Int(1, 700),
                  height = size[1] != 0 ? size[1] : random.Int(1, 300);
        request.outputRect = {5, 7, 5 + width, 7 + height};
        const auto results = boost::make_shared<RenderResults>();
        VideoFrameRef frame, later;
        ASSERT_EQ(bars->RenderFrame({}, request, results, frame), Ostrand::kStatus_OK);
        EXPECT_EQ(frame->GetPixelFormat(), format);
        Picture expected(width, height);
        Host::Software::DrawColorBars(expected);
        EXPECT_TRUE(PicturesAgree(DownloadFrame(GetDevice(), frame), RoundTo(expected, format), kExactly))
            << width << " by " << height;
        request.time += 1000;
        ASSERT_EQ(bars->RenderFrame({}, request, results, later), Ostrand::kStatus_OK);
        EXPECT_EQ(later, frame);
        bars->EndFrame({}, request, results, 0);
    }
}

INSTANTIATE_TEST_SUITE_P(Devices, ColorBarsOnEachDevice, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
