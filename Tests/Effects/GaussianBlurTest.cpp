// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/GaussianBlurNode.h"
#include "Src/Nodes/NodeRegistry.h"
#include "Tests/Effects/EffectTester.h"
#include "Vantrel/Effects/GaussianBlur.h"

namespace Vantrel::Testing {
namespace {

using BlurEffects = EffectTest;

TEST_P(BlurEffects, AgreeWithTheirScalarVersionAndGrowByTheirReach) {
    if (GetParam().framework == Kiln::DeviceFramework::kOpenCL) {
        EXPECT_FALSE(isRegistered(u"TQ.XQVE Fast Blur", GetDevice())) << "left to the host there";
        return;
    }
    Random random;
    for (int i = 0; i < 24; ++i) {
        const bool fast = random.Chance(0.5F), keepSize = random.Chance(0.5F);
        const double blurriness = random.Chance(0.2F) ? 0.0 : random.Uniform(0.5F, 40.0F);
        const std::int32_t dimensions = random.Int(-1, 3);
        const Picture in = RoundTo(RandomPicture(random, random.Int(1, 60), random.Int(1, 40)), GetFormat());
        const EffectRow& effect = fast ? kFastBlurEffect : kGaussianBlurEffect;
        const ParameterValues values = {{kBlur_Blurriness, {blurriness}},
                                        {kBlur_Dimensions, {static_cast<double>(dimensions)}},
                                        {kBlur_KeepSize, {static_cast<double>(keepSize)}}};
        const RenderNodeRef node = MakeEffect(effect.matchName, ToParams(effect, values));
        ExpectAgreement(node, effect, values, in, {IsHalf() ? 4e-3 : 2e-3, 0.0, true});
        const VideoFrameRef input = UploadFrame(GetDevice(), GetFormat(), in);
        const bool blurs = blurriness > 0.0 && dimensions >= 0 && dimensions <= 2;
        EXPECT_EQ(RenderOver(node, input) == input, !blurs) << "without a blur the frame goes on as it is";
    }
}

TEST_P(BlurEffects, AreRefusedWhereAnyKeyframeGrowsBeyondTheDevice) {
    if (GetParam().framework == Kiln::DeviceFramework::kOpenCL) return;
    const auto configure = [this](const FakeParam& blurriness, bool keepSize) {
        Params params = MakeParams(kGaussianBlurEffect, {{kBlur_KeepSize, keepSize}});
        params[kBlur_Blurriness] = blurriness;
        return dynamic_cast<GaussianBlurNode*>(MakeEffect(kGaussianBlurEffect.matchName, params).Get()) != nullptr;
    };
    FakeParam late = FakeParam().At(0, 1.0).At(1000, 6000.0).At(2000, 1.0);
    host.nodes[kMedia].properties["MediaNode::StreamFrameWidth"] = "1920";
    host.nodes[kMedia].properties["MediaNode::StreamFrameHeight"] = "1080";
    EXPECT_TRUE(configure(FakeParam(10.0), false));
    EXPECT_FALSE(configure(late, false));
    EXPECT_TRUE(configure(late, true)) << "what keeps its size grows by nothing";
}

INSTANTIATE_TEST_SUITE_P(Devices, BlurEffects, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
