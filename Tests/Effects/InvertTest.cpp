// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Invert.h"

#include <cmath>

#include "Tests/Effects/EffectTester.h"
#include "Vantrel/EffectTable.h"

namespace Vantrel::Testing {
namespace {

using InvertOnEachDevice = EffectTest;

constexpr const char* kMatchName = "TQ.XQVE Invert";

std::map<std::int32_t, FakeParam> Settings(std::int32_t channel, float percent) {
    return {{kInvert_Channel, channel}, {kInvert_Blend, percent}};
}

TEST_P(InvertOnEachDevice, WhatAChoiceDoesNotMeanKeepsItsBits) {
    Random random;
    Picture in = RoundTo(RandomPicture(random, 33, 5), GetFormat());
    in.At(3, 1)[1] = INFINITY;
    in.At(4, 1)[1] = NAN;
    const std::pair<std::int32_t, std::size_t> kept[] = {
        {kInvertChannel_Red, 0}, {kInvertChannel_Red, 1},   {kInvertChannel_Blue, 1}, {kInvertChannel_RGB, 3},
        {kInvertChannel_Hue, 3}, {kInvertChannel_Alpha, 1}, {kInvertChannel_YIQ, 3},  {kInvertChannel_Count, 2}};
    for (const auto& [channel, component] : kept) {
        Picture out = Apply(kMatchName, Settings(channel, 30.0F), in);
        for (std::size_t i = 0; i < in.pixels.size(); ++i) {
            if (i % 4 != component) out.pixels[i] = in.pixels[i];
        }
        EXPECT_TRUE(PicturesAgree(out, in, kExactly)) << "channel " << channel << ", component " << component;
    }
}

TEST_P(InvertOnEachDevice, AFullBlendHandsTheInputOnAndNearlyFullDoesNot) {
    const VideoFrameRef input = UploadFrame(GetDevice(), GetFormat(), Picture(8, 8));
    {
        const RenderNodeRef node = MakeEffect(kMatchName, Settings(kInvertChannel_RGB, 100.0F));
        EXPECT_EQ(RenderOver(node, input), input);
    }
    const RenderNodeRef node = MakeEffect(kMatchName, Settings(kInvertChannel_RGB, 99.999F));
    EXPECT_NE(RenderOver(node, input), input);
}

TEST_P(InvertOnEachDevice, ParametersAreReadAtTheClipsOwnTime) {
    const Params params = {{kInvert_Channel, std::int32_t{kInvertChannel_Alpha}},
                           {kInvert_Blend, FakeParam().At(0, 100.0F).At(50, 0.0F)}};
    host.nodes[kClip].transformTime = [](std::int64_t ticks) { return ticks / 2; };
    const RenderNodeRef node = MakeEffect(kMatchName, params);
    const VideoFrameRef input = UploadFrame(GetDevice(), GetFormat(), Picture(2, 2));
    EXPECT_EQ(RenderOver(node, input, 99), input);
    EXPECT_EQ(DownloadFrame(GetDevice(), RenderOver(node, input, 100)).At(1, 1)[3], 1.0F);
}

INSTANTIATE_TEST_SUITE_P(Devices, InvertOnEachDevice, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

TEST(InvertFormulas, PropertiesOfColourTurnIntoTheirOpposites) {
    struct Row {
        std::int32_t channel;
        Pixel in, out;  ///< blue, green, red, alpha
    };
    const Row rows[] = {{kInvertChannel_Hue, {0.2, 0.4, 0.8, 1}, {0.8, 0.6, 0.2, 1}},
                        {kInvertChannel_Lightness, {0.0, 0.0, 0.5, 1}, {0.5, 0.5, 1.0, 1}},
                        {kInvertChannel_Saturation, {0.4, 0.5, 0.6, 1}, {0.1, 0.5, 0.9, 1}},
                        {kInvertChannel_Saturation, {0.3, 0.3, 0.3, 1}, {0.3, 0.3, 0.3, 1}},
                        {kInvertChannel_HLS, {0.4, 0.5, 0.6, 1}, {0.9, 0.5, 0.1, 1}},
                        {kInvertChannel_Luminance, {0.0, 1.0, 0.0, 1}, {-0.174, 0.826, -0.174, 1}},
                        {kInvertChannel_YIQ, {0.1, 0.2, 0.3, 0.5}, {0.9, 0.8, 0.7, 0.5}},
                        {kInvertChannel_Alpha, {0.1, 0.2, 0.3, 0.25}, {0.1, 0.2, 0.3, 0.75}}};
    for (const Row& row : rows) {
        Picture picture(1, 1);
        picture.Set(0, 0, row.in);
        Host::Software::Invert(picture, row.channel, 0.0);
        for (std::size_t c = 0; c < 4; ++c) EXPECT_NEAR(picture.At(0, 0)[c], row.out[c], 1e-6) << row.channel;
    }
}

TEST(EffectTable, RowsAreSoundAndFoundByName) {
    for (const EffectRow* effect : kEffectTable) {
        EXPECT_EQ(FindEffect(effect->matchName), effect);
        for (std::size_t i = 0; i < effect->parameterCount; ++i) {
            const ParameterRow& row = effect->parameters[i];
            EXPECT_GT(row.index, i == 0 ? -1 : effect->parameters[i - 1].index) << effect->label << ", " << row.name;
            EXPECT_LE(row.minimum, row.value[0]);
            EXPECT_GE(row.maximum, row.value[0]);
            if (!row.choiceName) continue;
            EXPECT_NE(row.choiceName(static_cast<std::int32_t>(row.maximum)), nullptr) << row.name;
            EXPECT_EQ(row.choiceName(static_cast<std::int32_t>(row.maximum) + 1), nullptr) << row.name;
        }
    }
    EXPECT_EQ(FindEffect("Something else"), nullptr);
}

}  // namespace
}  // namespace Vantrel::Testing
