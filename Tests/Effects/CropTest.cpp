// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cmath>

#include "Tests/Effects/EffectTester.h"
#include "Vantrel/Effects/Crop.h"

namespace Vantrel::Testing {
namespace {

class CropOnEachDevice : public EffectTest {
protected:
    struct Cuts {
        float left = 0, top = 0, right = 0, bottom = 0;
        bool zoom = false;
    };
    static Params Settings(const Cuts& cuts) {
        return {{kCrop_Left, cuts.left},
                {kCrop_Top, cuts.top},
                {kCrop_Right, cuts.right},
                {kCrop_Bottom, cuts.bottom},
                {kCrop_Zoom, cuts.zoom}};
    }
    RenderNodeRef MakeCrop(const Cuts& cuts) { return MakeEffect("TQ.XQVE TQCrop", Settings(cuts)); }
    Picture Cropped(const Cuts& cuts, const Picture& picture) {
        return Apply("TQ.XQVE TQCrop", Settings(cuts), picture);
    }
    void SetMediaSize(int width, int height) {
        auto& properties = host.nodes[kMedia].properties;
        properties["MediaNode::StreamFrameWidth"] = std::to_string(width);
        properties["MediaNode::StreamFrameHeight"] = std::to_string(height);
        properties["MediaNode::ClipScaleToFramePolicy"] = "0";
    }
};

TEST_P(CropOnEachDevice, AgreesWithTheScalarVersionOnPicturesOfEverySizeAndPlace) {
    Random random;
    for (int i = 0; i < 60; ++i) {
        SCOPED_TRACE(i);
        const int clipWidth = random.Int(1, 60), clipHeight = random.Int(1, 40);
        const int growX = random.Int(0, 5), growY = random.Int(0, 5);
        const int width = random.Int(1, 70), height = random.Int(1, 50);
        const auto cut = [&] { return random.Chance(0.3F) ? 0.0F : random.Uniform(-10.0F, 70.0F); };
        const Cuts cuts{cut(), cut(), cut(), random.Chance(0.1F) ? 130.0F : cut(), random.Chance(0.5F)};
        const Picture in = RoundTo(RandomPicture(random, clipWidth + 2 * growX, clipHeight + 2 * growY), GetFormat());
        const VideoFrameRef input = MakePaddedFrame(GetDevice(), GetFormat(), in, 2);
        input->SetOrigin({(clipWidth - width) / 2 + growX, (clipHeight - height) / 2 + growY});
        SetMediaSize(clipWidth, clipHeight);
        RenderParams request = MakeRequest(input);
        request.outputRect = request.sequenceRect = {0, 0, width, height};
        request.quality = static_cast<std::uint32_t>(random.Int(2, 4));
        VideoFrameRef output;
        ASSERT_EQ(TryRender(MakeCrop(cuts), input, request, output), Ostrand::kStatus_OK);

        Host::Software::LayerPicture layer;
        layer.picture = in;
        layer.origin = input->GetOrigin();
        layer.mediaWidth = clipWidth;
        layer.mediaHeight = clipHeight;
        Host::Software::EffectContext context;
        context.view.width = context.view.sequenceWidth = width;
        context.view.height = context.view.sequenceHeight = height;
        context.view.quality = request.quality;
        layer = OnHost(kCropEffect,
                       {{kCrop_Left, {cuts.left}},
                        {kCrop_Top, {cuts.top}},
                        {kCrop_Right, {cuts.right}},
                        {kCrop_Bottom, {cuts.bottom}},
                        {kCrop_Zoom, {cuts.zoom ? 1.0 : 0.0}}},
                       layer, context);
        EXPECT_EQ(output->GetOrigin(), layer.origin);
        // As with every stretched picture.
        const Tolerance stretched{IsHalf() ? 3e-3 : 3e-4, 0.0, true, 0.0005};
        EXPECT_TRUE(PicturesAgree(DownloadFrame(GetDevice(), output), layer.picture, cuts.zoom ? stretched : kExactly));
    }
}

TEST_P(CropOnEachDevice, CutsFallBetweenPixelsAndWhatMeetsLeavesNothing) {
    const float endless = INFINITY, none = NAN;
    const struct {
        Cuts cuts;
        int first, end;  ///< kept columns of ten
    } kRows[] = {{{25.0F}, 3, 10},          {{24.9F}, 2, 10},          {{0, 0, 25.0F}, 0, 8},
                 {{30.0F, 0, 30.0F}, 3, 7}, {{50.0F, 0, 50.0F}, 0, 0}, {{80.0F, 0, 80.0F}, 0, 0},
                 {{100.0F}, 0, 0},          {{0, 0, 250.0F}, 0, 0},    {{-40.0F}, 0, 10},
                 {{endless}, 0, 0},         {{0, 0, endless}, 0, 0},   {{-endless}, 0, 10},
                 {{none}, 0, 10},           {{0, 100.0F}, 0, 0},       {{0, 60.0F, 0, 60.0F}, 0, 0}};
    Picture in = Plain(10, 4, {-0.25, 1.5, 0.5, 0.75});
    for (const auto& row : kRows) {
        Picture expected(10, 4);
        for (int y = 0; y < 4; ++y) {
            for (int x = row.first; x < row.end; ++x) expected.Set(x, y, in.Get(x, y));
        }
        EXPECT_TRUE(PicturesAgree(Cropped(row.cuts, in), expected, kExactly))
            << row.cuts.left << ", " << row.cuts.right;
        Cuts zoomed = row.cuts;
        zoomed.zoom = true;
        EXPECT_TRUE(PicturesAgree(Cropped(zoomed, in), row.first < row.end ? in : Picture(10, 4), {1e-6, 1e-3}))
            << "one colour fills the frame, up to its border; " << row.cuts.left << ", " << row.cuts.right;
    }
}

TEST_P(CropOnEachDevice, NothingToCutHandsTheFrameOnAndZoomMakesItTheOutputs) {
    Random random;
    const Picture in = RoundTo(RandomPicture(random, 21, 9), GetFormat());
    const VideoFrameRef input = MakePaddedFrame(GetDevice(), GetFormat(), in, 2);
    EXPECT_EQ(RenderOver(MakeCrop({}), input), input);
    EXPECT_TRUE(PicturesAgree(Cropped({0, 0, 0, 0, true}, in), in, kExactly)) << "whole onto whole";

    RenderParams request = MakeRequest(input);
    request.outputRect = request.sequenceRect = {0, 0, 40, 5};
    request.pixelAspectRatio = {16, 11};
    input->SetOrigin({-9, 2});
    SetMediaSize(21, 9);
    VideoFrameRef output;
    ASSERT_EQ(TryRender(MakeCrop({0, 0, 0, 0, true}), input, request, output), Ostrand::kStatus_OK);
    EXPECT_EQ(output->GetBounds(), (Vellum::Rect{0, 0, 40, 9})) << "narrower than the output, but not lower";
    EXPECT_EQ(output->GetOrigin(), (Vellum::Point{0, 2}));
    EXPECT_EQ(output->GetPixelAspectRatio(), (Vellum::PixelAspectRatio{16, 11}));
}

INSTANTIATE_TEST_SUITE_P(Devices, CropOnEachDevice, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
