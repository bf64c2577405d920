// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Software/Effects/MulticamGrid.h"
#include "Src/Filters/MulticamNode.h"
#include "Tests/Media/MediaDeviceTester.h"

namespace Vantrel::Testing {
namespace {

using Host::Software::MulticamGrid;

class MulticamDevice : public MediaDeviceTest {
protected:
    static constexpr std::uint32_t kMonitorSequence = 20;
    static constexpr std::uint32_t kMonitor = 21;

    InterfaceRef<MulticamNode> Monitor(const MulticamGrid& grid, const std::vector<FrameLeafRef>& cameras) {
        host.sequences[kMonitorSequence].segments = {{0, Vellum::kTime_Max, 0, Guid(2, 0, 0, {}), kMonitor}};
        host.nodes[kMonitor].kind = "Multicam";
        host.nodes[kMonitor].properties = {{"MulticamNode::SelectedTrack", std::to_string(grid.selected)},
                                           {"MulticamNode::ShowProgram", grid.showProgram ? "1" : "0"},
                                           {"MulticamNode::Recording", grid.recording ? "1" : "0"},
                                           {"MulticamNode::IsNonMultiCam", grid.isNonMulticam ? "1" : "0"}};
        script.params.outputRect = script.params.sequenceRect = {0, 0, grid.width, grid.height};
        const VideoSegmentsHandle handle(kMonitorSequence, SegmentsMode::kPlain, "");
        const auto node = script.Make<MulticamNode>(AcquireRootNode(handle, 0), GetDevice());
        for (std::size_t i = 0; i < cameras.size(); ++i) node->SetInput(i, cameras[i]);
        return node;
    }
    static MulticamGrid RandomGrid(Random& random, int cameras) {
        MulticamGrid grid;
        grid.width = random.Int(1, 150);
        grid.height = random.Int(1, 90);
        grid.selected = random.Int(-1, cameras + 2);
        grid.showProgram = grid.width > 1 && random.Chance(0.5F);
        grid.recording = random.Chance(0.5F);
        grid.isNonMulticam = random.Chance(0.2F);
        return grid;
    }
    FrameLeafRef Leaf(const Picture& picture) { return FrameLeafRef(new FrameLeaf(Frame(picture))); }
    [[nodiscard]] bool WorksInHalf() const { return WorkingFormat() == Kiln::kPixelFormat_GPU_BGRA_4444_16f; }

    MulticamGrid plain{64, 36};
    const Picture kRed = Plain(64, 36, {0.0, 0.0, 1.0, 1.0});
};

TEST_P(MulticamDevice, MatchesTheReferenceForAnyNumberOfCameras) {
    Random random;
    for (int count = 0; count <= 17; ++count) {
        SCOPED_TRACE(testing::Message() << count << " cameras");
        MulticamGrid grid = RandomGrid(random, count);
        script.params.quality = IsHalf() ? 1 : static_cast<std::uint32_t>(random.Int(2, 4));
        grid.quality = Vellum::ToRenderQuality(script.params.quality);
        std::vector<Picture> pictures;
        std::vector<FrameLeafRef> leaves;
        for (int i = 0; i < count; ++i) {
            const bool there = random.Chance(0.8F);
            // Odd, so that no place lies half way between two pixels, of which the nearest is drawn in drafts.
            const int width = 2 * random.Int(0, 40) + 1, height = 2 * random.Int(0, 25) + 1;
            pictures.push_back(there ? RoundTo(RandomPicture(random, width, height), WorkingFormat()) : Picture());
            leaves.push_back(there ? Leaf(pictures.back()) : FrameLeafRef());
            if (there) leaves.back()->frame->SetPixelAspectRatio({random.Int(1, 3), random.Int(1, 3)});
        }
        const VideoFrameRef output = Render(*Monitor(grid, leaves));
        // A cubic's slope over noise makes much of a place's last digit.
        Tolerance tolerance{WorksInHalf() ? 2e-3 : 1e-5, WorksInHalf() ? 2e-3 : 1e-5, true};
        tolerance.exceptionShare = 0.001;
        EXPECT_TRUE(
            PicturesAgree(Download(output), RoundTo(DrawMulticamGrid(pictures, grid), WorkingFormat()), tolerance));
        EXPECT_EQ(output->GetPixelFormat(), WorkingFormat());
    }
}

TEST_P(MulticamDevice, TheRequestLearnsWhichCameraIsOnAir) {
    const std::vector<FrameLeafRef> cameras = {Leaf(kRed), {}, Leaf(kRed)};
    const VideoFrameRef before = Frame(kRed);
    const auto onAir = [&](int selected, bool isNonMulticam) {
        NewRequest();
        results->SetSelectedFrame(before);
        plain.selected = selected;
        plain.isNonMulticam = isNonMulticam;
        static_cast<void>(Render(*Monitor(plain, cameras)));
        return results->GetSelectedFrame();
    };
    EXPECT_EQ(onAir(0, false), cameras[0]->frame);
    EXPECT_EQ(onAir(2, false), cameras[2]->frame);
    EXPECT_FALSE(onAir(1, false)) << "a camera without a picture";
    for (const int beyond : {-1, 3, 4, 1000}) EXPECT_EQ(onAir(beyond, false), before) << beyond;
    EXPECT_EQ(onAir(0, true), cameras[2]->frame) << "the last one wins";
}

TEST_P(MulticamDevice, FailuresAndRefusedMemory) {
    const FrameLeafRef camera = Leaf(kRed);
    camera->answer = [&] { return camera->renders == 1 ? Ostrand::kStatus_OutOfMemory : Ostrand::kStatus_OK; };
    plain.selected = 9;
    EXPECT_TRUE(PicturesAgree(Download(Render(*Monitor(plain, {camera}))), kRed, {1e-3}));
    EXPECT_EQ(camera->renders, 2);
    CountAllocations([](int number) { return number == 1; });
    EXPECT_TRUE(PicturesAgree(Download(Render(*Monitor(plain, {camera}))), kRed, {1e-3}));
    CountAllocations([](int) { return true; });
    VideoFrameRef frame;
    EXPECT_EQ(Render(*Monitor(plain, {camera}), frame), Ostrand::kStatus_OutOfMemory);
    camera->answer = [] { return -5; };
    EXPECT_EQ(Render(*Monitor(plain, {camera}), frame), -5);
    EXPECT_FALSE(frame);
}

INSTANTIATE_TEST_SUITE_P(OnEachDevice, MulticamDevice, testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
