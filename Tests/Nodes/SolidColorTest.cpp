// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Synthetics/SolidColorNode.h"

#include <boost/make_shared.hpp>

#include "Kiln/Frames.h"
#include "Marl/BinaryData.h"
#include "Tests/Support/DevicePictures.h"
#include "Tests/Support/HostedTest.h"

namespace Vantrel::Testing {
namespace {

/// Mattes on a device, in the format that the quality selects.
class SolidColorTest : public DeviceTest {
protected:
    SolidColorTest() {
        SetBasicSuite(host.GetBasicSuite());
        params.outputRect = {10, 20, 17, 25};
        params.quality = 2;
    }
    ~SolidColorTest() override { ReleaseSuites(); }

    InterfaceRef<SolidColorNode> Matte(const FakeNode& media) {
        host.nodes[1] = media;
        InterfaceRef<SolidColorNode> node(new SolidColorNode);
        bool hostFlag = false;
        node->Configure(AcquireRoot(host), {{0, 0, 64, 36}, 1000, {1, 1}, 0, GetDevice()}, hostFlag);
        return node;
    }
    static FakeNode Media(const char* instance, const Marl::BinaryData& data = {}) {
        FakeNode media("Media");
        media.properties["MediaNode::MediaInstanceString"] = instance;
        media.properties["MediaNode::StreamOpaqueData"] = Marl::EncodeBinaryDataToUTF8String(data);
        return media;
    }
    Status Render(const InterfaceRef<SolidColorNode>& node) { return node->RenderFrame({}, params, results, frame); }

    FakeHost host;
    RenderParams params;
    RenderResultsRef results = boost::make_shared<RenderResults>();
    VideoFrameRef frame;
};

TEST_P(SolidColorTest, EachMatteFillsItsFrame) {
    const struct {
        FakeNode media;
        WideString name;
        Pixel pixel;
    } kCases[] = {
        {FakeNode("Compositor"), u"BlackVideoSource", {0, 0, 0, 0}},
        {Media("none of the keys"), u"BlackVideoSource", {0, 0, 0, 0}},
        {Media("1129270354", {255, 51, 0, 9, 9, 9, 9, 9}), u"ColorMatte", {0, 0.2F, 1, 1}},
        {Media("1129270354", {255, 51, 0, 9, 9, 9, 9}), u"ColorMatte", {0, 0, 0, 0}},
        {Media("1129270354", {255, 51, 0, 9, 9, 9, 9, 9, 9}), u"ColorMatte", {0, 0, 0, 0}},
        {Media("1112293707"), u"BlackMatte", {0, 0, 0, 1}},
        {Media("1414680150"), u"TransparentMatte", {0, 0, 0, 0}},
    };
    params.quality = IsHalf() ? 1 : 2;
    const bool isCuda = GetParam().framework == Kiln::DeviceFramework::kCuda;
    const Vellum::PixelFormat format =
        IsHalf() && isCuda ? Kiln::kPixelFormat_GPU_BGRA_4444_16f : Kiln::kPixelFormat_GPU_BGRA_4444_32f;
    for (const auto& matte : kCases) {
        const auto node = Matte(matte.media);
        EXPECT_EQ(node->GetName(), matte.name);
        ASSERT_EQ(Render(node), 0);
        EXPECT_EQ(frame->GetPixelFormat(), format);
        EXPECT_EQ(frame->GetBounds(), (Vellum::Rect{0, 0, 7, 5}));
        EXPECT_TRUE(
            PicturesAgree(DownloadFrame(GetDevice(), frame), RoundTo(Plain(7, 5, matte.pixel), format), kExactly));
    }
}

INSTANTIATE_TEST_SUITE_P(, SolidColorTest, testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
