// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/Dissolves.h"
#include "Host/Software/Effects/Motion.h"
#include "Src/Filters/AdjustmentNode.h"
#include "Src/Filters/IntrinsicNode.h"
#include "Tests/Media/MediaDeviceTester.h"

namespace Vantrel::Testing {
namespace {

class AdjustmentDevice : public MediaDeviceTest {
protected:
    void SetSize(int width, int height) {
        script.params.outputRect = script.params.sequenceRect = {0, 0, width, height};
        script.Set({{"MediaNode::StreamFrameWidth", std::to_string(width)},
                    {"MediaNode::StreamFrameHeight", std::to_string(height)}});
    }
    void SetOpacity(float percent, std::int32_t mode) {
        host.nodes[MediaScript::kOpacity].params = {{0, percent}, {1, mode}};
    }
    FrameLeafRef Leaf(const Picture& picture) { return FrameLeafRef(new FrameLeaf(Frame(picture))); }
    /// An adjustment layer with a clip's motion and opacity over pictures that stand for what renders below.
    RenderNodeRef Adjust(const RenderNodeRef& below, const RenderNodeRef& processed, const RenderNodeRef& matte = {}) {
        RenderNodeRef chain = processed;
        for (const VideoNodeRef& view : {MediaScript::Opacity(), MediaScript::Motion()}) {
            const RenderNodeRef node = script.Make<IntrinsicNode>(view, GetDevice());
            node->SetInput(0, chain);
            chain = node;
        }
        const RenderNodeRef node = script.Make<AdjustmentNode>({}, GetDevice());
        node->SetInput(0, below);
        node->SetInput(1, chain);
        if (matte) node->SetInput(2, matte);
        return node;
    }
    [[nodiscard]] Picture Rounded(Picture picture) const { return RoundTo(std::move(picture), WorkingFormat()); }
    [[nodiscard]] bool WorksInHalf() const { return WorkingFormat() == Kiln::kPixelFormat_GPU_BGRA_4444_16f; }

    const Picture kBelow = Plain(64, 36, {0.0, 0.0, 1.0, 1.0});
    const Picture kAbove = Plain(64, 36, {1.0, 0.0, 0.0, 1.0});
};

TEST_P(AdjustmentDevice, MatchesTheReferenceInEveryMode) {
    Random random;
    for (std::int32_t mode = -1; mode <= Kiln::kBlend_Count; ++mode) {
        SCOPED_TRACE(testing::Message() << "mode " << mode);
        const int width = random.Int(1, 90), height = random.Int(1, 50);
        SetSize(width, height);
        const float percent = random.Chance(0.3F) ? 100.0F : random.Uniform(0.0F, 100.0F);
        SetOpacity(percent, mode);
        Picture expected = Rounded(RandomPicture(random, width, height));
        const Picture processed = Rounded(RandomPicture(random, width, height));
        const bool hasMatte = random.Chance(0.5F);
        const Picture matte =
            hasMatte ? Rounded(RandomPicture(random, width, height)) : Plain(width, height, {1, 1, 1, 1});
        const FrameLeafRef below = Leaf(expected);
        const VideoFrameRef output = Render(*Adjust(below, Leaf(processed), hasMatte ? Leaf(matte) : FrameLeafRef()));
        EXPECT_TRUE(PicturesAgree(Download(below->frame), expected, kExactly)) << "what lies below is another's frame";
        Host::Software::LayAdjusted(processed, matte, static_cast<double>(percent / 100.0F), mode, expected);
        // Halves: one step by rounding, one more near a sum that the device rounded to the other side. A few pixels may
        // lie on the threshold of a mode that has one.
        Tolerance tolerance = WorksInHalf() ? Tolerance{1e-3, 2e-3, true} : Tolerance{1e-5, 1e-5, true};
        tolerance.exceptionShare = 0.002;
        EXPECT_TRUE(PicturesAgree(Download(output), Rounded(expected), tolerance));
    }
}

TEST_P(AdjustmentDevice, OnlyTheMatteMovesWithTheLayer) {
    Random random;
    const Picture below = Rounded(RandomOpaquePicture(random, 64, 36));
    const Picture processed = Rounded(RandomOpaquePicture(random, 64, 36));
    const auto expectSwitchAt = [&](int column) {
        const Picture output = Download(Render(*Adjust(Leaf(below), Leaf(processed))));
        for (int y = 0; y < 36; ++y) {
            for (int x = 0; x < 64; ++x) {
                ASSERT_EQ(output.Get(x, y), (x < column ? below : processed).Get(x, y)) << x << ", " << y;
            }
        }
    };
    expectSwitchAt(0);
    host.nodes[MediaScript::kMotion].params[0] = FakePoint{0.75, 0.5};
    expectSwitchAt(16);
    host.nodes[MediaScript::kMotion].params[0] = FakePoint{1.5, 0.5};
    expectSwitchAt(64);
}

INSTANTIATE_TEST_SUITE_P(OnEachDevice, AdjustmentDevice, testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
