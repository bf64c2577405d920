// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cmath>

#include "Host/Software/Effects/Dissolves.h"
#include "Host/Software/Effects/Push.h"
#include "Src/Filters/Transitions/TransitionBaseNode.h"
#include "Src/Nodes/FinishedInputs.h"
#include "Src/Nodes/NodeRegistry.h"
#include "Src/VideoNodes/VideoNodeFactory.h"
#include "Tests/Effects/EffectTester.h"
#include "Tests/Media/MediaDeviceTester.h"
#include "Vantrel/TransitionTable.h"

namespace Vantrel::Testing {
namespace {

namespace Software = Host::Software;
using Software::PushSettings;

constexpr std::int32_t kDuration = 1 << 20;  ///< so that fractions of it are exact

std::map<std::string, std::string> PropertiesOf(const PushSettings& push) {
    const auto level = [&push](std::size_t c) { return std::lround(push.borderColor[c] * 255.0); };
    return {{"TransitionNode::TransitionDirection", std::to_string(push.direction)},
            {"TransitionNode::TransitionReverse", push.reverse ? "1" : "0"},
            {"TransitionNode::TransitionBorderWidth", std::to_string(push.borderWidth)},
            {"TransitionNode::TransitionBorderColor", std::to_string(level(0) << 16 | level(1) << 8 | level(2))}};
}

Picture Reference(const std::string& name, const PushSettings& push, const Picture& a, const Picture& b, float f) {
    if (name == "XQVE Push") return Software::Push(a, b, push, f);
    if (name == "XQVE Additive Dissolve") return Software::AdditiveDissolve(a, b, static_cast<double>(f));
    if (name == "XQVE Dip To Black") return Software::Dip(f > 0.5F ? b : a, 0.0, f);
    if (name == "XQVE Dip To White") return Software::Dip(f > 0.5F ? b : a, 1.0, f);
    return Software::CrossDissolve(a, b, static_cast<double>(f), name == "XQVE Film Dissolve");
}

class TransitionsOnEachDevice : public EffectTest {
protected:
    ~TransitionsOnEachDevice() override { FinishedInputs::Clear(); }

    [[nodiscard]] InterfaceRef<FilterNode> Make(const std::string& name, const PushSettings& push = {},
                                                std::int32_t duration = kDuration) {
        host.nodes[kClip] = FakeNode("Transition");
        host.nodes[kClip].properties = PropertiesOf(push);
        host.nodes[kClip].properties["TransitionNode::TransitionMatchName"] = name;
        if (duration != 0)
            host.nodes[kClip].properties["TransitionNode::TransitionDuration"] = std::to_string(duration);
        RenderRequirements requirements;
        requirements.frameRect = {0, 0, 64, 36};
        requirements.device = GetDevice();
        bool needsHost = false;
        EXPECT_TRUE(isRegistered(Halden::ToWide(name), GetDevice())) << name;
        const VideoSegmentsHandle handle(kSequence, SegmentsMode::kPlain, "");
        return Ostrand::Query<FilterNode>(
            createNode(Halden::ToWide(name), GetDevice(), AcquireRootNode(handle, 0), requirements, needsHost));
    }
    [[nodiscard]] FrameLeafRef Leaf(const Picture& picture, int sparePixels = 0) {
        return FrameLeafRef(new FrameLeaf(MakePaddedFrame(GetDevice(), GetFormat(), picture, sparePixels)));
    }
    Status TryRender(const InterfaceRef<FilterNode>& node, const RenderNodeRef& a, const RenderNodeRef& b,
                     float fraction, VideoFrameRef& frame) {
        node->SetInput(0, a);
        node->SetInput(1, b);
        return TryRender(node, fraction, frame);
    }
    Status TryRender(const InterfaceRef<FilterNode>& node, float fraction, VideoFrameRef& frame) {
        RenderParams params;
        params.time = params.clipTime = std::lround(fraction * static_cast<float>(kDuration));
        params.outputRect = params.sequenceRect = {0, 0, 64, 36};
        params.quality = IsHalf() ? 1 : 3;
        params.sequenceID = kSequence;
        return node->RenderFrame({}, params, boost::make_shared<RenderResults>(), frame);
    }
    [[nodiscard]] Picture Render(const std::string& name, const PushSettings& push, const Picture& a, const Picture& b,
                                 float fraction) {
        VideoFrameRef frame;
        EXPECT_EQ(TryRender(Make(name, push), Leaf(a, 3), Leaf(b), fraction, frame), Ostrand::kStatus_OK);
        return frame ? DownloadFrame(GetDevice(), frame) : Picture();
    }
};

TEST_P(TransitionsOnEachDevice, EachMatchesItsScalarVersion) {
    Random random;
    for (const TransitionRow& row : kTransitionTable) {
        const std::string name = row.matchName;
        for (int round = 0; round < (name == "XQVE Push" ? 40 : 8); ++round) {
            const int width = random.Int(1, 90), height = random.Int(1, 40);
            Picture a = RandomPicture(random, width, height), b = RandomPicture(random, width, height);
            if (name == "XQVE Film Dissolve") {
                // Light of one sign: where two signs cancel, the root of what is left has no digits.
                for (float& value : a.pixels) value = std::abs(value);
                for (float& value : b.pixels) value = std::abs(value);
                for (std::size_t i = 0; i < a.pixels.size() && round % 2 == 1; ++i) {
                    if (i % 4 != 3) a.pixels[i] *= -1.0F, b.pixels[i] *= -1.0F;
                }
            }
            a = RoundTo(a, GetFormat()), b = RoundTo(b, GetFormat());
            const float fraction = std::round(random.Uniform(-0.1F, 1.1F) * kDuration) / kDuration;
            const float clamped = name == "XQVE Push" ? fraction : std::fmin(std::fmax(fraction, 0.0F), 1.0F);
            PushSettings push;
            push.direction = random.Int(0, 5);
            push.reverse = random.Chance(0.5F);
            push.borderWidth = random.Chance(0.5F) ? 0.0F : static_cast<float>(random.Int(0, 240)) / 2.0F;
            push.borderColor = {random.Int(0, 255) / 255.0, random.Int(0, 255) / 255.0, random.Int(0, 255) / 255.0, 1};
            const Picture expected = RoundTo(Reference(name, push, a, b, clamped), GetFormat());
            // Two steps of a half at 1, or a chain of roundings.
            const Tolerance tolerance = IsHalf() ? Tolerance{1e-3, 1e-3} : Tolerance{1e-5, 1e-5};
            EXPECT_TRUE(PicturesAgree(Render(name, push, a, b, clamped), expected, tolerance))
                << name << ", " << width << " by " << height << ", fraction " << clamped << ", direction "
                << push.direction << ", reverse " << push.reverse << ", border " << push.borderWidth;
        }
    }
}

TEST_P(TransitionsOnEachDevice, TheEndsKeepTheirBits) {
    Random random;
    Picture a = RoundTo(RandomPicture(random, 33, 5), GetFormat());
    const Picture b = RoundTo(RandomPicture(random, 33, 5), GetFormat());
    a.At(3, 1)[1] = INFINITY;
    a.At(4, 1)[2] = NAN;
    a.Set(5, 1, {0.5, -0.25, 2.0, 0.0});  // the colour of what can't be seen
    for (const TransitionRow& row : kTransitionTable) {
        EXPECT_TRUE(PicturesAgree(Render(row.matchName, {}, a, b, 0.0F), a, kExactly)) << row.matchName;
        EXPECT_TRUE(PicturesAgree(Render(row.matchName, {}, b, a, 1.0F), a, kExactly)) << row.matchName;
    }
    EXPECT_TRUE(PicturesAgree(Render("XQVE Dip To White", {}, a, b, 0.5F), Plain(33, 5, {1, 1, 1, 1}), kExactly));
    VideoFrameRef frame;
    ASSERT_EQ(TryRender(Make("XQVE Cross Dissolve", {}, 0), Leaf(a), Leaf(b), 0.5F, frame), Ostrand::kStatus_OK);
    EXPECT_TRUE(PicturesAgree(DownloadFrame(GetDevice(), frame), a, kExactly)) << "without a duration it doesn't begin";
}

TEST_P(TransitionsOnEachDevice, MissingOrUnfitInputsFail) {
    for (const TransitionRow& row : kTransitionTable) {
        const FrameLeafRef leaf = Leaf(Picture(8, 4));
        VideoFrameRef frame;
        for (const std::size_t count : {1U, 3U}) {
            const auto node = Make(row.matchName);
            node->SetInput(count - 1, leaf);
            EXPECT_EQ(TryRender(node, 0.25F, frame), Ostrand::kStatus_Failure) << row.matchName;
        }
        EXPECT_EQ(leaf->renders, 0);
        const bool dip = std::string(row.label).substr(0, 3) == "Dip";
        const Status other = dip ? Ostrand::kStatus_OK : Ostrand::kStatus_Failure;
        EXPECT_EQ(TryRender(Make(row.matchName), leaf, {}, 0.25F, frame), other) << row.matchName;
        EXPECT_EQ(TryRender(Make(row.matchName), leaf, Leaf(Picture(7, 4)), 0.25F, frame), other) << row.matchName;
        leaf->answer = [] { return -5; };
        EXPECT_EQ(TryRender(Make(row.matchName), leaf, leaf, 0.25F, frame), -5) << row.matchName;
        EXPECT_FALSE(frame);
        const auto node = Make(row.matchName);
        if (std::string(row.matchName) == "XQVE Push") {
            EXPECT_THROW(TryRender(node, {}, Leaf(Picture(8, 4)), 0.25F, frame), Ostrand::NullInterfaceException);
        } else {
            EXPECT_EQ(TryRender(node, {}, Leaf(Picture(8, 4)), 0.25F, frame), Ostrand::kStatus_Failure);
        }
        EXPECT_TRUE(HasInterface(node.Get(), kTransitionBaseNodeID));
    }
}

TEST_P(TransitionsOnEachDevice, RefusedMemoryIsTriedAgain) {
    Kiln::MemoryManager& memory = *GetDevice()->GetDeviceMemory();
    for (const TransitionRow& row : kTransitionTable) {
        const FrameLeafRef a = Leaf(Picture(8, 4)), b = Leaf(Picture(8, 4));
        a->answer = [&] { return a->renders == 1 ? Ostrand::kStatus_OutOfMemory : Ostrand::kStatus_OK; };
        b->answer = [&] { return b->renders == 1 ? Ostrand::kStatus_OutOfMemory : Ostrand::kStatus_OK; };
        const auto render = [&](int refusals) {
            memory.SetAllocationFilter([&refusals](std::uint64_t) { return refusals-- > 0; });
            VideoFrameRef frame;
            const Status status = TryRender(Make(row.matchName), a, b, 0.25F, frame);
            memory.SetAllocationFilter({});
            EXPECT_EQ(!frame, Ostrand::Failed(status));
            return status;
        };
        EXPECT_EQ(render(1), Ostrand::kStatus_OK) << row.matchName;
        const bool ownFrame = row.propertyCount != 0 || std::string(row.label).substr(0, 3) == "Dip";
        EXPECT_EQ(render(2), ownFrame ? Ostrand::kStatus_OutOfMemory : Ostrand::kStatus_OK) << row.matchName;
        const bool inPlace = !ownFrame;
        VideoFrameRef frame;
        EXPECT_EQ(TryRender(Make(row.matchName), a, b, 0.25F, frame), Ostrand::kStatus_OK);
        EXPECT_EQ(frame == a->frame, inPlace) << row.matchName;
    }
}

INSTANTIATE_TEST_SUITE_P(Devices, TransitionsOnEachDevice, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
