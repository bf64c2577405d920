// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Nodes/NodeRegistry.h"

#include <gmock/gmock.h>

#include "Halden/DebugDatabase.h"
#include "Src/Nodes/FilterNode.h"
#include "Tests/Nodes/ProbeNodes.h"
#include "Tests/Support/HostedTest.h"

namespace Vantrel::Testing {
namespace {

class NodeRegistryTest : public HostedTest {
protected:
    static void SetUpTestSuite() {
        FillCudaRegistry();
        FillOpenCLRegistry();
    }
    /// A view of node 2, the media or effect of clip 1.
    VideoNodeRef Describe(const FakeNode& node) {
        host.nodes[1] = FakeNode("Clip");
        host.nodes[1].inputs = {{2}};
        host.nodes[2] = node;
        const VideoNodeRef clip = AcquireRoot(host);
        return AcquireInput(9, clip->GetNodeID(), 0, 0);
    }
    FilterNodeRef Create(const WideString& key, const VideoNodeRef& description) {
        return Ostrand::Query<FilterNode>(createNode(key, stage.device, description, stage.Requirements(), hostFlag));
    }

    ProbeStage stage;
    bool hostFlag = false;
};

TEST_F(NodeRegistryTest, AKeyGivesItsConfiguredNode) {
    const FilterNodeRef black = Create(u"BlackVideoSource", {});
    ASSERT_TRUE(black);
    EXPECT_EQ(black->GetName(), u"BlackVideoSource");
    EXPECT_EQ(black->GetFrameRect(), stage.Requirements().frameRect);
    EXPECT_FALSE(hostFlag);
    const auto opencl = boost::make_shared<FakeDevice>(Kiln::DeviceFramework::kOpenCL);
    EXPECT_TRUE(isRegistered(u"BlackVideoSource", opencl));
    EXPECT_FALSE(isRegistered(u"BlackVideoSourc", opencl));
    EXPECT_FALSE(isRegistered(u"ColorMatte", opencl)) << "names of nodes aren't keys";
}

TEST_F(NodeRegistryTest, MediaFallsBackOnItsInstanceString) {
    FakeNode media("Media");
    media.properties["MediaNode::MediaInstanceString"] = "DisabledNode";
    const FilterNodeRef node = Create(u"no such key", Describe(media));
    ASSERT_TRUE(node);
    EXPECT_EQ(node->GetName(), u"DisabledNode");

    const FilterNodeRef effect = Create(u"no such key", Describe({"Effect"}));
    ASSERT_TRUE(effect);
    EXPECT_EQ(effect->GetName(), u"Upload Node") << "anything else becomes the host's picture of the subtree";
    EXPECT_TRUE(hostFlag);
}

TEST_F(NodeRegistryTest, AFailedConfigureFallsBackWithTheFlagAsItWas) {
    FakeNode media("Media");
    media.properties["MediaNode::MediaIsOffline"] = "1";
    const VideoNodeRef description = Describe(media);
    const FilterNodeRef node = Create(u"HostRenderClip", description);
    ASSERT_TRUE(node);
    EXPECT_EQ(node->GetName(), u"Upload Node");
    EXPECT_FALSE(hostFlag) << "the failed attempt's flag doesn't survive";
    hostFlag = true;
    Create(u"HostRenderClip", description);
    EXPECT_TRUE(hostFlag);
}

TEST_F(NodeRegistryTest, AFrameBeyondTheDevicesLimitLeavesTheHostAndBlackOnly) {
    const auto limited = [this](std::uint64_t limit, const WideString& key) {
        stage.device->memoryLimit = limit;
        hostFlag = false;
        return createNode(key, stage.device, {}, stage.Requirements(), hostFlag);
    };
    constexpr std::uint64_t kFourFrames = 1920ULL * 1080 * 16 * 4;
    EXPECT_TRUE(limited(kFourFrames, u"LayerBlendNode"));
    EXPECT_FALSE(hostFlag);
    EXPECT_FALSE(limited(kFourFrames - 1, u"LayerBlendNode"));
    EXPECT_TRUE(hostFlag);
    EXPECT_TRUE(limited(0, u"BlackVideoSource"));
    EXPECT_TRUE(limited(0, u"HostRenderSource"));
    RenderRequirements huge = stage.Requirements();
    huge.frameRect = {0, 0, 16384, 8192};
    stage.device->memoryLimit = ~0ULL >> 1;
    EXPECT_FALSE(createNode(u"LayerBlendNode", stage.device, {}, huge, hostFlag)) << "bytes beyond 31 bits";
}

TEST_F(NodeRegistryTest, BareInputsOfATransitionAreWrappedInMotion) {
    const auto wrapped = [this](const RenderNodeRef& input) {
        const ProbeFilterRef transition = stage.Filter("transition", true, true);
        transition->SetInput(0, input);
        return transition->GetInput(0) != input;
    };
    const ProbeFilterRef bare = stage.Filter("bare");
    EXPECT_TRUE(wrapped(bare));
    EXPECT_FALSE(wrapped(stage.Filter("BlackVideoSource")));
    EXPECT_FALSE(wrapped(stage.Filter("TQ.XQVE Motion")));
    EXPECT_FALSE(wrapped(stage.Leaf("no filter")));
    EXPECT_FALSE(wrapped({}));
    const ProbeFilterRef above = stage.Filter("above");
    above->SetInput(0, stage.Filter("MulticamRenderNode"));
    EXPECT_FALSE(wrapped(above)) << "found below";

    const ProbeFilterRef transition = stage.Filter("transition", true, true);
    transition->SetInput(0, bare);
    const auto motion = Ostrand::Query<FilterNode>(transition->GetInput(0));
    EXPECT_EQ(motion->GetInput(0), RenderNodeRef(bare));
    EXPECT_EQ(motion->GetFrameTicks(), stage.Requirements().frameTicks);
}

/// The registries are filled once per process, so each setting is tried in a fresh one.
TEST(NodeRegistryDeathTest, TheDebugSettingKeepsMediaWithTheHost) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    const auto fillWith = [](const char16_t* setting) {
        if (setting) Halden::debug::DebugDatabase::Instance().SetEntry(u"DisableGPUMediaNode", setting);
        FillCudaRegistry();
        FillOpenCLRegistry();
        int registered = 0;
        for (const auto framework : {Kiln::DeviceFramework::kCuda, Kiln::DeviceFramework::kOpenCL}) {
            registered += isRegistered(u"HostRenderClip", boost::make_shared<FakeDevice>(framework)) ? 1 : 0;
        }
        std::_Exit(registered);
    };
    EXPECT_EXIT(fillWith(u"true"), ::testing::ExitedWithCode(0), "");
    EXPECT_EXIT(fillWith(u"1"), ::testing::ExitedWithCode(2), "");
    EXPECT_EXIT(fillWith(nullptr), ::testing::ExitedWithCode(2), "");
}

}  // namespace
}  // namespace Vantrel::Testing
