// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <sstream>

#include "Src/Filters/HostRenderSubtreeNode.h"
#include "Src/Filters/MediaNode.h"
#include "Src/Filters/SWHostRenderClipPrefetch.h"
#include "Src/Filters/UploadNode.h"
#include "Src/Nodes/ProxyNode.h"
#include "Tests/Media/MediaDeviceTester.h"

namespace Vantrel::Testing {
namespace {

using Upload = ProxyNode<UploadNode, SWHostRenderClipPrefetch>;
using ClipMedia = ProxyNode<MediaNode, Upload>;
using Subtree = ProxyNode<UploadNode, HostRenderSubtreeNode>;

/// 8-bit pixels made by a function of place.
FakePicture Paint(std::int32_t width, std::int32_t height,
                  const std::function<std::array<std::uint8_t, 4>(int x, int y)>& color) {
    FakePicture picture;
    picture.width = width;
    picture.height = height;
    for (int y = 0; y < height; ++y) {
        for (int x = 0; x < width; ++x) {
            const auto pixel = color(x, y);
            picture.bytes.insert(picture.bytes.end(), pixel.begin(), pixel.end());
        }
    }
    return picture;
}

class UploadDevice : public MediaDeviceTest {
protected:
    /// The host's picture of whatever it is asked for.
    void Show(const FakePicture& picture) {
        host.renderer.paint = [picture](const FakeRequest&) { return picture; };
    }
    void ShowColor(std::array<std::uint8_t, 4> color) {
        Show(Paint(64, 36, [color](int, int) { return color; }));
    }
    template <class Node>
    InterfaceRef<Node> MakeMedia() {
        return script.Make<Node>(MediaScript::Media(), GetDevice());
    }
    /// Request and render of a frame.
    VideoFrameRef Play(IRenderNode& node) {
        EXPECT_EQ(node.RequestHostFrames(script.params, results), 0);
        return MediaDeviceTest::Render(node);
    }
};

TEST_P(UploadDevice, AHostFrameComesThroughConverted) {
    Show(Paint(64, 36, [](int x, int y) -> std::array<std::uint8_t, 4> {
        return {static_cast<std::uint8_t>(x), static_cast<std::uint8_t>(y), 255, 128};
    }));
    const VideoFrameRef frame = Play(*MakeMedia<Upload>());
    EXPECT_EQ(frame->GetPixelFormat(), WorkingFormat());
    ExpectPixel(frame, {17 / 255.0, 9 / 255.0, 1.0, 128 / 255.0}, 17, 9);

    // Attributes of the clip, not of the picture that the host happened to send.
    script.Set({{"MediaNode::StreamIgnoreAlpha", "1"},
                {"MediaNode::StreamPixelAspectRatioNum", "10"},
                {"MediaNode::StreamPixelAspectRatioDen", "11"},
                {"MediaNode::ScanlineOffsetToImproveVerticalCentering", "1"}});
    NewRequest();
    const VideoFrameRef opaque = Play(*MakeMedia<Upload>());
    ExpectPixel(opaque, {17 / 255.0, 9 / 255.0, 1.0, 1.0}, 17, 9);
    EXPECT_EQ(opaque->GetPixelAspectRatio(), Vellum::PixelAspectRatio({10, 11}));
    EXPECT_EQ(opaque->GetOrigin(), Vellum::Point({0, 1}));
}

TEST_P(UploadDevice, AFieldIsTakenFromItsOwnLines) {
    Show(Paint(64, 36, [](int, int y) -> std::array<std::uint8_t, 4> {
        const auto level = static_cast<std::uint8_t>(y % 2 == 0 ? 0 : 255);
        return {level, level, level, 255};
    }));
    const struct {
        const char* fieldType;
        std::uint32_t selection;
        double firstLine;
        double secondLine;
    } cases[] = {{"1", 2, 0.0, 1.0}, {"1", 0, 0.0, 0.0}, {"1", 1, 1.0, 1.0}, {"2", 0, 1.0, 1.0}, {"2", 1, 0.0, 0.0}};
    for (const auto& each : cases) {
        script.Set({{"MediaNode::StreamFieldType", each.fieldType}});
        script.params.fieldSelection = each.selection;
        NewRequest();
        const Picture picture = Download(Play(*MakeMedia<Upload>()));
        EXPECT_NEAR(picture.Get(3, 10)[0], each.firstLine, 1e-3) << each.fieldType << " " << each.selection;
        EXPECT_NEAR(picture.Get(3, 11)[0], each.secondLine, 1e-3) << each.fieldType << " " << each.selection;
    }
}

TEST_P(UploadDevice, EachStageIsFoundAgain) {
    ShowColor({10, 20, 30, 255});
    const auto upload = MakeMedia<Upload>();
    CountAllocations();
    const VideoFrameRef frame = Play(*upload);
    EXPECT_EQ(allocations, 2) << "the uploaded frame and the converted one";
    EXPECT_EQ(MediaDeviceTest::Render(*upload), frame) << "the converted frame is in the store";

    upload->EndFrame({}, script.params, results, 3);
    static_cast<void>(MediaDeviceTest::Render(*upload));
    EXPECT_EQ(allocations, 3) << "level 3 keeps the uploaded frame";
    upload->EndFrame({}, script.params, results, 2);
    static_cast<void>(MediaDeviceTest::Render(*upload));
    EXPECT_EQ(allocations, 5) << "level 2 keeps the host's frame";
    upload->EndFrame({}, script.params, results, 0);

    // The staged frame outlives the request: without the host's picture it still renders.
    NewRequest();
    host.renderer.deliversNothing = true;
    EXPECT_EQ(upload->RequestHostFrames(script.params, results), 0);
    ExpectPixel(MediaDeviceTest::Render(*upload), {10 / 255.0, 20 / 255.0, 30 / 255.0, 1.0});
    upload->EndFrame({}, script.params, results, 0);
    Forget();
    NewRequest();
    VideoFrameRef none;
    EXPECT_EQ(Render(*upload, none), Ostrand::kStatus_Failure) << "all gone";
}

TEST_P(UploadDevice, AStillStaysOnTheDevice) {
    ShowColor({10, 20, 30, 255});
    host.nodes[MediaScript::kMedia].flags = kNodeFlag_Still;
    // A host that tells the times of a still apart, and a picture that isn't the sequence's size.
    script.params.sequenceRect = {0, 0, 100, 100};
    script.params.outputRect = script.params.sequenceRect;
    const auto media = MakeMedia<ClipMedia>();
    EXPECT_EQ(Play(*media)->GetOrigin(), Vellum::Point({-18, -32}));
    media->EndFrame({}, script.params, results, 0);

    NewRequest();
    host.renderer.deliversNothing = true;
    script.params.time = script.params.clipTime = 5000;
    CountAllocations();
    const VideoFrameRef later = MediaDeviceTest::Render(*media);
    EXPECT_LE(allocations, 1) << "at most converted again, never uploaded";
    EXPECT_EQ(later->GetOrigin(), Vellum::Point({-18, -32})) << "centred once, not on top of the last time";
    ExpectPixel(later, {10 / 255.0, 20 / 255.0, 30 / 255.0, 1.0});
    media->EndFrame({}, script.params, results, 0);

    // What changes the picture in place starts from the untouched one each time.
    script.Set({{"MediaNode::StreamInvertAlpha", "1"}, {"MediaNode::ClipScaleToFramePolicy", "1"}});
    const auto inverted = MakeMedia<ClipMedia>();
    ShowColor({10, 20, 30, 51});
    Forget();
    for (std::int64_t time = 0; time < 3; ++time) {
        NewRequest();
        script.params.time = script.params.clipTime = time * MediaScript::kFrameTicks;
        host.renderer.deliversNothing = time != 0;
        ExpectPixel(Play(*inverted), {10 / 255.0, 20 / 255.0, 30 / 255.0, 0.8}, 50, 28);
        inverted->EndFrame({}, script.params, results, 0);
    }
}

TEST_P(UploadDevice, RefusedMemoryIsTriedAgainWithoutASecondUpload) {
    ShowColor({10, 20, 30, 255});
    const auto upload = MakeMedia<Upload>();
    CountAllocations([](int number) { return number == 2; });
    ExpectPixel(Play(*upload), {10 / 255.0, 20 / 255.0, 30 / 255.0, 1.0});
    EXPECT_EQ(allocations, 3);

    upload->EndFrame({}, script.params, results, 0);
    CountAllocations([](int number) { return number == 1; });
    ExpectPixel(MediaDeviceTest::Render(*upload), {10 / 255.0, 20 / 255.0, 30 / 255.0, 1.0});

    upload->EndFrame({}, script.params, results, 0);
    CountAllocations([](int) { return true; });
    VideoFrameRef frame;
    EXPECT_EQ(Render(*upload, frame), Ostrand::kStatus_OutOfMemory);
    EXPECT_FALSE(frame);
}

TEST_P(UploadDevice, AFailedHostRenderFailsTheFrameAndHangsNobody) {
    host.renderer.deliversNothing = true;
    const auto upload = MakeMedia<Upload>();
    EXPECT_EQ(upload->RequestHostFrames(script.params, results), 0);
    VideoFrameRef frame;
    EXPECT_EQ(upload->FetchHostFrame({}, script.params, results, false, frame), 0) << "a failed request stages nothing";
    EXPECT_EQ(Render(*upload, frame), Ostrand::kStatus_Failure);
    EXPECT_EQ(results->GetOutstanding(), 1U);
}

TEST_P(UploadDevice, PicturesWithoutAFingerprintArentShared) {
    host.clips[MediaScript::kClipID].frameHashStatus = -1;
    ShowColor({10, 20, 30, 255});
    const auto upload = MakeMedia<Upload>();
    VideoFrameRef frame;
    EXPECT_EQ(upload->RequestHostFrames(script.params, results), 0);
    EXPECT_EQ(upload->FetchHostFrame({}, script.params, results, false, frame), 0);
    EXPECT_EQ(results->GetOutstanding(), 1U) << "nothing is staged";
    ExpectPixel(MediaDeviceTest::Render(*upload), {10 / 255.0, 20 / 255.0, 30 / 255.0, 1.0});
}

TEST_P(UploadDevice, TimingsNameTheSourceAndTheStages) {
    const auto upload = MakeMedia<Subtree>();
    static_cast<void>(Play(*upload));
    std::ostringstream text;
    upload->WriteTimings(text);
    EXPECT_NE(text.str().find("  Source Pixel Format: BGRA_4444_8u\n  Upload: "), std::string::npos) << text.str();
    EXPECT_NE(text.str().find("ms, Deinterlace: 0ms, Convert: "), std::string::npos) << text.str();
}

INSTANTIATE_TEST_SUITE_P(OnEachDevice, UploadDevice, testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
