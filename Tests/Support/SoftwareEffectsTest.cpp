// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// Values worked out by hand: what device tests are held against must itself stand on something.

#include "Host/Software/Effects/BlendModes.h"
#include "Host/Software/Effects/Convert.h"
#include "Host/Software/Effects/FrameRepairs.h"
#include "Host/Software/Effects/Motion.h"
#include "Tests/Support/Pictures.h"
#include "Vellum/Field.h"

namespace Vantrel::Testing {
namespace {

using namespace Host::Software;

/// One pixel of the layer colour over one of the backdrop's, as 8-bit-like decimals: blue, green, red.
TEST(SoftwareBlend, GivesTheValuesOfThePublishedFormulas) {
    const Pixel backdrop{0.2, 0.5, 0.8, 1.0};
    const Pixel source{0.6, 0.25, 0.4, 1.0};
    const struct {
        std::int32_t mode;
        Pixel expected;
    } kCases[] = {
        {Kiln::kBlend_Multiply, {0.12, 0.125, 0.32, 1}},
        {Kiln::kBlend_Screen, {0.68, 0.625, 0.88, 1}},
        {Kiln::kBlend_Overlay, {0.24, 0.25, 0.76, 1}},
        {Kiln::kBlend_HardLight, {0.36, 0.25, 0.64, 1}},
        {Kiln::kBlend_ColorDodge, {0.5, 2.0 / 3.0, 1.0, 1}},
        {Kiln::kBlend_ColorBurn, {0.0, 0.0, 0.5, 1}},
        {Kiln::kBlend_SoftLight, {0.2 + 0.2 * (0.448 - 0.2), 0.375, 0.768, 1}},
        {Kiln::kBlend_Difference, {0.4, 0.25, 0.4, 1}},
        {Kiln::kBlend_Exclusion, {0.56, 0.5, 0.56, 1}},
        {Kiln::kBlend_LinearBurn, {-0.2, -0.25, 0.2, 1}},
        {Kiln::kBlend_LinearLight, {0.4, 0.0, 0.6, 1}},
        {Kiln::kBlend_PinLight, {0.2, 0.5, 0.8, 1}},
        {Kiln::kBlend_HardMix, {0.0, 0.0, 1.0, 1}},
        {Kiln::kBlend_VividLight, {0.25, 0.0, 0.75, 1}},
        {Kiln::kBlend_Subtract, {-0.4, 0.25, 0.4, 1}},
        {Kiln::kBlend_Divide, {1.0 / 3.0, 1.0, 1.0, 1}},
        // Lum of the backdrop is 0.557, of the source 0.3335.
        {Kiln::kBlend_DarkerColor, source},
        {Kiln::kBlend_LighterColor, backdrop},
        {Kiln::kBlend_Color, {0.8235, 0.4735, 0.6235, 1}},
        {Kiln::kBlend_Luminosity,
         {0.3335 - 0.357 * 0.3335 / 0.357, 0.3335 - 0.057 * 0.3335 / 0.357, 0.3335 + 0.243 * 0.3335 / 0.357, 1}},
    };
    for (const auto& blend : kCases) {
        const Pixel out = BlendColor(blend.mode, backdrop, source);
        for (std::size_t c = 0; c < 4; ++c) {
            EXPECT_NEAR(out[c], blend.expected[c], 1e-12) << Kiln::GetBlendModeName(blend.mode) << ", channel " << c;
        }
    }
}

TEST(SoftwareConvert, MeetsTheAnchorsOfVideoLevels) {
    // 75 % bars of BT.601 and BT.709 in 8 bits, V U Y A: white, then yellow and blue; from the recommendations'
    // matrices.
    const struct {
        Vellum::PixelFormat format;
        std::uint8_t vuya[4];
        Pixel expected;
    } kCases[] = {{Vellum::kPixelFormat_VUYA_4444_8u, {128, 128, 235, 255}, {1, 1, 1, 1}},
                  {Vellum::kPixelFormat_VUYA_4444_8u, {128, 128, 16, 51}, {0, 0, 0, 0.2}},
                  {Vellum::kPixelFormat_VUYA_4444_8u, {142, 44, 162, 255}, {0, 0.75, 0.75, 1}},
                  {Vellum::kPixelFormat_VUYA_4444_8u_709, {136, 44, 168, 255}, {0, 0.75, 0.75, 1}},
                  {Vellum::kPixelFormat_VUYA_4444_8u_709, {120, 212, 28, 255}, {0.75, 0, 0, 1}},
                  {Vellum::kPixelFormat_XRGB_4444_8u, {0, 255, 51, 0}, {0, 0.2, 1, 1}},
                  {Vellum::kPixelFormat_BGRP_4444_8u, {51, 0, 102, 102}, {0.5, 0, 1, 0.4}}};
    for (const auto& conversion : kCases) {
        const Picture out = ReadPicture(conversion.vuya, 4, 1, 1, conversion.format, Vellum::kAlphaType_Straight);
        // Half a step of the 8-bit code, through the matrix.
        for (std::size_t c = 0; c < 4; ++c) EXPECT_NEAR(out.Get(0, 0)[c], conversion.expected[c], 0.006);
    }
    const float given[] = {-0.5F, 1.5F, 0.25F, 0.5F};
    EXPECT_EQ(
        ReadPicture(given, 16, 1, 1, Vellum::kPixelFormat_BGRA_4444_32f, Vellum::kAlphaType_Premultiplied).Get(0, 0),
        (Pixel{-1.0, 3.0, 0.5, 0.5}));
}

}  // namespace
}  // namespace Vantrel::Testing
