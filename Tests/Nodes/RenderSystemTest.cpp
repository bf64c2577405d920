// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Vantrel/RenderSystem.h"

#include <gmock/gmock.h>
#include <boost/make_shared.hpp>

#include "Kiln/Frames.h"
#include "Marl/BinaryData.h"
#include "Tests/Support/DevicePictures.h"
#include "Tests/Support/FakeHost.h"

namespace Vantrel::Testing {
namespace {

using Kiln::DeviceFramework;

constexpr std::uint32_t kSequence = 5;
constexpr std::int64_t kFrame = 10160640000;

/// The engine as a host sees it: through its three functions.
class RenderSystemTest : public ::testing::TestWithParam<DeviceFramework> {
protected:
    RenderSystemTest() {
        Initialize(host.GetBasicSuite());
        device = Kiln::GetPrimaryDevice(GetParam());
    }
    ~RenderSystemTest() override {
        device.reset();
        Terminate();
    }
    void SetUp() override { ASSERT_TRUE(device) << Kiln::GetFrameworkMessage(GetParam()); }

    /// One clip of a red matte from frame 10 to 20.
    void ScriptAMatte() {
        host.nodes[1] = FakeNode("Clip");
        host.nodes[1].inputs = {{2}};
        host.nodes[2] = FakeNode("Media");
        host.nodes[2].properties = {
            {"MediaNode::MediaInstanceString", "1129270354"},
            {"MediaNode::StreamOpaqueData", Marl::EncodeBinaryDataToUTF8String({255, 0, 0, 0, 0, 0, 0, 0})},
            {"MediaNode::StreamFrameRate", std::to_string(kFrame)},
            {"MediaNode::StreamFrameWidth", "64"},
            {"MediaNode::StreamFrameHeight", "36"}};
        FakeSequence& sequence = host.sequences[kSequence];
        sequence.hash = {1, 1, 1, {}};
        sequence.segments = {{10 * kFrame, 20 * kFrame, 0, {7, 7, 7, {}}, 1}};
    }
    boost::shared_ptr<RenderSystem> Create(std::uint32_t timelineID) {
        return CreateRenderSystem(device, static_cast<std::int32_t>(timelineID), false, "", 0, {});
    }
    /// What a host asks for, for a frame at a time within a segment.
    static boost::shared_ptr<RenderParams> Request(const SegmentInfo& info, std::int64_t time) {
        auto params = boost::make_shared<RenderParams>();
        params->time = time;
        params->clipTime = time - info.in + info.offset;
        params->outputRect = params->sequenceRect = {0, 0, 64, 36};
        params->quality = 2;
        params->sequenceID = kSequence;
        params->frameTicks = params->sequenceFrameTicks = kFrame;
        params->pixelFormat = Vellum::FourCC("bgra");
        return params;
    }

    FakeHost host;
    Kiln::DeviceRef device;
};

TEST_P(RenderSystemTest, AMatteRendersFromEndToEnd) {
    ScriptAMatte();
    const auto system = Create(kSequence);
    EXPECT_EQ(system->GetDevice(), device);
    const auto child = CreateRenderSystem(device, kSequence, false, "", 0, system);
    SegmentInfo info;
    ASSERT_EQ(system->GetSegmentInfo(12 * kFrame, info, false), 0);
    EXPECT_EQ(info.in, 10 * kFrame);
    EXPECT_TRUE(info.accelerated);
    SegmentInfo shared;
    ASSERT_EQ(child->GetSegmentInfo(12 * kFrame, shared, false), 0);
    EXPECT_EQ(shared.tree, info.tree) << "a child takes its parent's trees over";

    const auto params = Request(info, 12 * kFrame);
    int completions = 0;
    const auto results = boost::make_shared<RenderResults>([&completions] { ++completions; });
    EXPECT_EQ(info.tree->CollectHostFrames(*params, results, {}), 0);
    system->PrepareRender(info.tree, params, results);
    device->GetExecutor()->Drain();
    EXPECT_EQ(completions, 1);

    const Kiln::ScopedDeviceAccess access(device);
    device->SetTimingEnabled(true);
    VideoFrameRef first;
    VideoFrameRef second;
    std::string text = "before";
    ASSERT_EQ(system->RenderFrames(info.tree, params, results, first, second, &text, {0, 0, 64, 36}), 0);
    device->SetTimingEnabled(false);
    EXPECT_FALSE(second);
    EXPECT_TRUE(PicturesAgree(DownloadFrame(device, first), Plain(64, 36, {0, 0, 1, 1}), kExactly));
    const std::string heading = GetParam() == DeviceFramework::kCuda ? "CUDA" : "OpenCL";
    EXPECT_THAT(text, ::testing::StartsWith(heading + " Render System\n\nTotal render time: "));
    EXPECT_THAT(text, ::testing::HasSubstr("\nMemory: "));
    EXPECT_THAT(text, ::testing::EndsWith("\n\nbefore"));
}

INSTANTIATE_TEST_SUITE_P(, RenderSystemTest, testing::Values(DeviceFramework::kCuda, DeviceFramework::kOpenCL),
                         [](const auto& instance) {
                             return std::string(instance.param == DeviceFramework::kCuda ? "Cuda" : "OpenCL");
                         });

}  // namespace
}  // namespace Vantrel::Testing
