// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/GaussianBlur.h"
#include "Src/Filters/Effects/GaussianBlurNode.h"
#include "Src/Nodes/NodeRegistry.h"
#include "Tests/Effects/EffectTester.h"
#include "Vantrel/Effects/GaussianBlur.h"

namespace Vantrel::Testing {
namespace {

class BlurEffects : public EffectTest {
protected:
    static Params Settings(bool fast, double blurriness, std::int32_t dimensions, bool keepSize) {
        Params params = {{kBlur_Dimensions, dimensions}, {kBlur_KeepSize, keepSize}};
        params[kBlur_Blurriness] = fast ? FakeParam(static_cast<float>(blurriness)) : FakeParam(blurriness);
        return params;
    }
    static const char* NameOf(bool fast) { return fast ? "TQ.XQVE Fast Blur" : "TQ.XQVE Gaussian Blur 2"; }
};

TEST_P(BlurEffects, AgreeWithTheirScalarVersionAndGrowByTheirReach) {
    if (GetParam().framework == Kiln::DeviceFramework::kOpenCL) {
        EXPECT_FALSE(isRegistered(u"TQ.XQVE Fast Blur", GetDevice())) << "left to the host there";
        return;
    }
    Random random;
    SCOPED_TRACE(random.GetSeed());
    for (int i = 0; i < 24; ++i) {
        const bool fast = random.Chance(0.5F), keepSize = random.Chance(0.5F);
        const double blurriness = random.Chance(0.2F) ? 0.0 : random.Uniform(0.5F, 40.0F);
        const std::int32_t dimensions = random.Int(-1, 3);
        const Picture in = RoundTo(RandomPicture(random, random.Int(1, 60), random.Int(1, 40)), GetFormat());
        Host::Software::LayerPicture layer;
        layer.picture = in;
        layer.aspect = {1, 1};
        Host::Software::EffectContext context;
        context.matchName = NameOf(fast);
        context.value = [&](std::int32_t index) -> std::array<double, 4> {
            return {index == kBlur_Blurriness ? blurriness : index == kBlur_Dimensions ? dimensions : keepSize};
        };
        context.view.width = context.view.sequenceWidth = in.width;
        context.view.height = context.view.sequenceHeight = in.height;
        Host::Software::RunGaussianBlur(context, layer);

        const RenderNodeRef node = MakeEffect(NameOf(fast), Settings(fast, blurriness, dimensions, keepSize));
        ASSERT_TRUE(node);
        const VideoFrameRef input = MakePaddedFrame(GetDevice(), GetFormat(), in, 2);
        const VideoFrameRef output = RenderOver(node, input);
        const bool blurs = blurriness > 0.0 && dimensions >= 0 && dimensions <= 2;
        EXPECT_EQ(output == input, !blurs) << "without a blur the frame goes on as it is";
        EXPECT_EQ(output->GetOrigin(), layer.origin);
        EXPECT_TRUE(
            PicturesAgree(DownloadFrame(GetDevice(), output), layer.picture, {IsHalf() ? 4e-3 : 2e-3, 0.0, true}))
            << NameOf(fast) << " " << blurriness << ", dimensions " << dimensions << ", keeps size " << keepSize;
    }
}

TEST_P(BlurEffects, AreRefusedWhereAnyKeyframeGrowsBeyondTheDevice) {
    if (GetParam().framework == Kiln::DeviceFramework::kOpenCL) return;
    const auto configure = [this](const FakeParam& blurriness, bool keepSize) {
        Params params = Settings(false, 1.0, kBlurDimensions_Both, keepSize);
        params[kBlur_Blurriness] = blurriness;
        return dynamic_cast<GaussianBlurNode*>(MakeEffect(NameOf(false), params).Get()) != nullptr;
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
