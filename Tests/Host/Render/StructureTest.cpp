// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>

#include "Tests/Host/Render/KeepPicture.h"
#include "Tests/Host/Render/Stage.h"

namespace Vantrel::Testing {
namespace {

using namespace Vantrel::Host::Test;

constexpr double kThird = 85.0 / 255.0;
constexpr double kTwoThirds = 170.0 / 255.0;

Json Opacity(double percent, int mode = 18) { return Effect("TQ.XQVE Opacity", {{"0", percent}, {"1", mode}}); }
Json Move(Json params) { return Effect("TQ.XQVE Motion", std::move(params)); }

Json TransitionOf(const std::string& name, double in, double out, Json properties = Json::object()) {
    Json transition = Dissolve(in, out);
    transition["transition_type"] = "Custom_Transition";
    transition["metadata"] = {{"vantrel", {{"match_name", name}, {"properties", std::move(properties)}}}};
    return transition;
}

TEST(Structure, ALayerCoversWhatLiesBelow) {
    Stage stage(Timeline({Track({Solid(255, 0, 0, 24)}), Track({Gap(12), Solid(0, 255, 0, 12)})}, Format(16, 8)));
    ExpectPixel(stage.Render(0), 3, 3, {1, 0, 0, 1});
    ExpectPixel(stage.Render(11), 15, 7, {1, 0, 0, 1});
    ExpectPixel(stage.Render(12), 0, 0, {0, 1, 0, 1});
}

TEST(Structure, OpacityAndBlendModesMeetWhatLiesBelow) {
    const auto over = [](Json effects) {
        return Timeline(
            {Track({Solid(170, 85, 0, 10)}), Track({Solid(85, 170, 255, 10, Effects({std::move(effects)}))})},
            Format(8, 4));
    };
    ExpectPixel(Stage(over(Opacity(50))).Render(2), 3, 1,
                {(kTwoThirds + kThird) / 2, (kThird + kTwoThirds) / 2, 0.5, 1});
    ExpectPixel(Stage(over(Opacity(100, 17))).Render(2), 3, 1, {kTwoThirds * kThird, kThird * kTwoThirds, 0, 1});
    ExpectPixel(Stage(over(Opacity(50, 17))).Render(2), 3, 1,
                {(kTwoThirds + kTwoThirds * kThird) / 2, (kThird + kThird * kTwoThirds) / 2, 0, 1});
    const Json animated = {
        {"keyframes", Json::array({{{"t", Time(0)}, {"value", 0}}, {{"t", Time(8)}, {"value", 100}}})}};
    ExpectPixel(Stage(over(Effect("TQ.XQVE Opacity", {{"0", animated}}))).Render(2), 3, 1,
                {0.75 * kTwoThirds + 0.25 * kThird, 0.75 * kThird + 0.25 * kTwoThirds, 0.25, 1});
}

TEST(Structure, TheBottomLayerHasNoBlendModeAndWithOneNoOpacity) {
    const auto alone = [](Json effects) {
        return Timeline({Track({Solid(255, 85, 0, 10, Effects({std::move(effects)}))})}, Format(8, 4));
    };
    ExpectPixel(Stage(alone(Opacity(40, 17))).Render(0), 2, 2, {1, kThird, 0, 1});
    ExpectPixel(Stage(alone(Opacity(40))).Render(0), 2, 2, {1, kThird, 0, 0.4});
    ExpectPixel(Stage(alone(Opacity(99.9995))).Render(0), 2, 2, {1, kThird, 0, 1});
}

TEST(Structure, MotionScalesMovesAndTurns) {
    const auto moved = [](Json params) {
        return Stage(Timeline({Track({Solid(0, 0, 255, 10)}),
                               Track({Solid(255, 255, 255, 10, Effects({Move(std::move(params))}))})},
                              Format(16, 8)))
            .Render(0);
    };
    const std::array<double, 4> white{1, 1, 1, 1};
    const std::array<double, 4> blue{0, 0, 1, 1};
    Picture picture = moved({{"1", 50}});
    ExpectPixel(picture, 4, 2, white);
    ExpectPixel(picture, 11, 5, white);
    ExpectPixel(picture, 3, 2, blue);
    ExpectPixel(picture, 12, 5, blue);
    ExpectPixel(picture, 4, 1, blue);
    picture = moved({{"0", {0.75, 0.5}}});
    ExpectPixel(picture, 4, 0, white);
    ExpectPixel(picture, 3, 0, blue);
    picture = moved({{"0", {0.0, 0.0}}, {"5", {0.0, 0.0}}, {"1", 50}, {"2", 25}, {"3", false}});
    ExpectPixel(picture, 3, 3, white);
    ExpectPixel(picture, 4, 3, blue);
    ExpectPixel(picture, 3, 4, blue);
    picture = moved({{"4", 90}});
    ExpectPixel(picture, 4, 0, white);
    ExpectPixel(picture, 11, 7, white);
    ExpectPixel(picture, 3, 4, blue);
    // Half a pixel to the right: the border pixel is half covered.
    picture = moved({{"0", {0.5 + 0.5 / 16, 0.5}}});
    ExpectPixel(picture, 0, 4, {0.5, 0.5, 1, 1});
    ExpectPixel(picture, 1, 4, white);
}

class FilmStructure : public testing::Test {
protected:
    FilmStructure() { WriteNumberFilm(mFilm, 100); }
    ScratchFolder mFolder;
    std::string mFilm = mFolder / "film.mp4";
};

TEST_F(FilmStructure, ItemsShowTheFramesOfTheirTime) {
    const auto film = [this](double start, double duration, Json more = Json::object()) {
        return FilmClip(mFilm, start, duration, 100, std::move(more));
    };
    Stage stage(Timeline({Track({film(10, 20), Gap(5), film(30, 20, Effects({Warp(2)})),
                                 film(40, 10, Effects({Freeze()})), film(20, 10, Effects({Warp(-1)})), film(90, 20)})},
                         Format(64, 64)));
    EXPECT_EQ(stage.NumberAt(0), 10);
    EXPECT_EQ(stage.NumberAt(19), 29);
    EXPECT_EQ(stage.NumberAt(25), 30);
    EXPECT_EQ(stage.NumberAt(30), 40);
    EXPECT_EQ(stage.NumberAt(45), 40);
    EXPECT_EQ(stage.NumberAt(54), 40);
    EXPECT_EQ(stage.NumberAt(55), 29);
    EXPECT_EQ(stage.NumberAt(64), 20);
    EXPECT_EQ(stage.NumberAt(65), 90);
    EXPECT_EQ(stage.NumberAt(80), 99) << "beyond its end the film shows its last frame";
}

TEST_F(FilmStructure, TimesBetweenFramesShowTheNearestOrAMix) {
    const auto slow = [this](bool blend) {
        Json clip = FilmClip(mFilm, 0, 20, 100, Own({{"frame_blend", blend}}));
        clip["effects"] = {Warp(0.5)};
        return clip;
    };
    Stage stage(Timeline({Track({slow(false), slow(true)})}, Format(64, 64)));
    EXPECT_EQ(stage.NumberAt(0), 0);
    EXPECT_EQ(stage.NumberAt(1), 0);
    EXPECT_EQ(stage.NumberAt(3), 1);
    EXPECT_EQ(stage.NumberAt(6), 3);
    EXPECT_EQ(stage.NumberAt(20), 0);
    EXPECT_EQ(stage.NumberAt(21), -1);
    // Between frames 0 and 1 only the last square changes; it lies half way.
    ExpectPixel(stage.Render(21), 56, 56, {0.5, 0.5, 0.5, 1}, 0.03);
    // Half a frame of the film passes in each frame of the sequence, which says nothing about shares; at four times the
    // speed four frames do.
    Json fast = FilmClip(mFilm, 0, 20, 100, Own({{"frame_blend", true}}));
    fast["effects"] = {Warp(4)};
    Stage mixed(Timeline({Track({fast})}, Format(64, 64)));
    // Of frames 4 to 7 two have the last bit, two the one before, all the third.
    const Picture picture = mixed.Render(1);
    ExpectPixel(picture, 56, 56, {0.5, 0.5, 0.5, 1}, 0.03);
    ExpectPixel(picture, 40, 56, {0.5, 0.5, 0.5, 1}, 0.03);
    ExpectPixel(picture, 24, 56, {1, 1, 1, 1}, 0.03);
}

TEST_F(FilmStructure, NestedSequencesKeepTheirTimeAndFormat) {
    const auto nested = [this](Json effects) {
        Json inner =
            Stack({Track({FilmClip(mFilm, 0, 30, 100), FilmClip(mFilm, 50, 30, 100)})}, Effects({std::move(effects)}));
        inner["source_range"] = Range(10, 40);
        inner["metadata"] = Format(32, 32)["metadata"];
        return inner;
    };
    Json plain = nested(Warp(1));
    Stage stage(Timeline({Track({plain, nested(Warp(0.5)), nested(Freeze()), nested(Warp(-1))})}, Format(64, 64)));
    EXPECT_EQ(stage.NumberAt(0), 10);
    EXPECT_EQ(stage.NumberAt(19), 29);
    EXPECT_EQ(stage.NumberAt(20), 50);
    EXPECT_EQ(stage.NumberAt(40), 10);
    EXPECT_EQ(stage.NumberAt(60), 20);
    EXPECT_EQ(stage.NumberAt(80), 10);
    EXPECT_EQ(stage.NumberAt(119), 10);
    EXPECT_EQ(stage.NumberAt(120), 69);
    EXPECT_EQ(stage.NumberAt(159), 10);
}

TEST_F(FilmStructure, ARequestInAnotherSizeSeesTheSameFrame) {
    Stage stage(Timeline({Track({FilmClip(mFilm, 33, 20, 100)})}, Format(64, 64)));
    for (const int size : {32, 48, 100}) {
        VantrelRenderDescription description = stage.Describe(size, size);
        const std::uint32_t bytes[] = {Vellum::FourCC("VUYA"), Vellum::FourCC("bgra")};
        description.pixelFormats = bytes;
        const auto picture = stage.RenderHost(4, description);
        EXPECT_EQ(picture->width, size);
        EXPECT_EQ(picture->format, Vellum::kPixelFormat_BGRA_4444_8u);
        EXPECT_EQ(Host::ReadNumber(*picture), 37);
    }
}

TEST_F(FilmStructure, ClipFramesComeInTheirOwnSizeAndTheFormatAsked) {
    Stage stage(Timeline({Track({FilmClip(mFilm, 33, 20, 100)})}, Format(16, 16)));
    const auto& clip = *stage.SegmentAt(0).root->inputs[0].node->inputs[0].node->AsMedia()->clip;
    for (const auto format : {Vellum::kPixelFormat_BGRA_4444_8u, Vellum::kPixelFormat_BGRA_4444_32f}) {
        const auto picture = stage.GetRenderer().RenderClip(clip, 41, format);
        EXPECT_EQ(picture->width, 64);
        EXPECT_EQ(picture->format, format);
    }
    EXPECT_EQ(Host::ReadNumber(*stage.GetRenderer().RenderClip(clip, 41, Vellum::kPixelFormat_BGRA_4444_8u)), 41);
}

TEST_F(FilmStructure, RequestsForClipsBringTransformedAndRawTimes) {
    Stage stage(Timeline({Track({FilmClip(mFilm, 20, 20, 100, Effects({Warp(2)}))})}, Format(64, 64)));
    const Host::Node& clip = *stage.SegmentAt(0).root->inputs[0].node;
    VantrelRenderDescription description = stage.Describe(64, 64);
    const std::uint32_t bytes[] = {Vellum::FourCC("bgra"), 0};
    description.pixelFormats = bytes;
    const std::int64_t item = 7 * kFrame;
    const auto node = stage.GetRenderer().RenderNode(clip, clip.TransformTime(item), stage.GetSize(), description);
    EXPECT_EQ(Host::ReadNumber(*node), 34);
    const auto operators = stage.GetRenderer().RenderOperators(clip, 0, item, stage.GetSize(), description);
    EXPECT_EQ(Host::ReadNumber(*operators), 34);
    const Host::Node& media = *clip.inputs[0].node;
    const auto direct = stage.GetRenderer().RenderNode(media, 55 * kFrame, stage.GetSize(), description);
    EXPECT_EQ(Host::ReadNumber(*direct), 55);
}

TEST(Structure, ScalePoliciesFitFillStretchAndLeave) {
    ScratchFolder folder;
    WriteImage(folder / "white.png", 8, 8, [](int, int) { return std::array<float, 4>{1, 1, 1, 1}; });
    const auto coverage = [&](const char* policy) {
        Stage stage(Timeline({Track({FilmClip(folder / "white.png", 0, 4, 1, Own({{"scale_to_frame", policy}}))})},
                             Format(32, 16)));
        const Picture picture = stage.Render(0);
        std::array<int, 4> box{32, 16, 0, 0};
        for (int y = 0; y < 16; ++y) {
            for (int x = 0; x < 32; ++x) {
                if (picture.At(x, y)[3] < 0.5F) continue;
                box = {std::min(box[0], x), std::min(box[1], y), std::max(box[2], x + 1), std::max(box[3], y + 1)};
            }
        }
        return box;
    };
    EXPECT_THAT(coverage("none"), testing::ElementsAre(12, 4, 20, 12));
    EXPECT_THAT(coverage("fit"), testing::ElementsAre(8, 0, 24, 16));
    EXPECT_THAT(coverage("fill"), testing::ElementsAre(0, 0, 32, 16));
    EXPECT_THAT(coverage("stretch"), testing::ElementsAre(0, 0, 32, 16));
}

TEST(Structure, PixelAspectWidensAPicture) {
    ScratchFolder folder;
    FilmPlan plan;
    plan.width = plan.height = 16;
    plan.aspect = {2, 1};
    WriteFilm(folder / "wide.mkv", plan, [](AVFrame& frame, int) {
        FillPlane(frame, 0, 235);
        FillPlane(frame, 1, 128);
        FillPlane(frame, 2, 128);
    });
    Stage stage(Timeline({Track({FilmClip(folder / "wide.mkv", 0, 1, 1)})}, Format(64, 32)));
    const Picture picture = stage.Render(0);
    for (const int x : {0, 31, 63}) ExpectPixel(picture, x, 16, {1, 1, 1, 1}, 0.01);
}

TEST(Structure, PremultipliedMediaComeOutStraight) {
    ScratchFolder folder;
    WriteImage(folder / "light.exr", 8, 4, [](int, int) { return std::array<float, 4>{0.2F, 2.0F, 0.8F, 0.25F}; });
    Stage stage(Timeline({Track({FilmClip(folder / "light.exr", 0, 4, 1)})}, Format(8, 4)));
    ExpectPixel(stage.Render(0), 3, 2, {0.8, 2.0, 0.2, 0.25});
    Stage ignored(
        Timeline({Track({FilmClip(folder / "light.exr", 0, 4, 1, Own({{"alpha", "ignore"}}))})}, Format(8, 4)));
    ExpectPixel(ignored.Render(0), 3, 2, {0.2, 0.5, 0.05, 1});
    Stage inverted(
        Timeline({Track({FilmClip(folder / "light.exr", 0, 4, 1, Own({{"alpha", "invert"}}))})}, Format(8, 4)));
    ExpectPixel(inverted.Render(0), 3, 2, {0.2, 0.5, 0.05, 0.75});
}

class Transitions : public testing::Test {
protected:
    static Stage Between(const std::string& name, Json properties = Json::object()) {
        return Stage(Timeline(
            {Track({Solid(255, 85, 0, 24), TransitionOf(name, 4, 4, std::move(properties)), Solid(0, 170, 255, 24)})},
            Format(16, 8)));
    }
};

TEST_F(Transitions, DissolveMixesByTheElapsedShare) {
    Stage stage = Between("XQVE Cross Dissolve");
    ExpectPixel(stage.Render(19), 3, 3, {1, kThird, 0, 1});
    ExpectPixel(stage.Render(20), 3, 3, {1, kThird, 0, 1});
    ExpectPixel(stage.Render(22), 3, 3, {0.75, 0.75 * kThird + 0.25 * kTwoThirds, 0.25, 1});
    ExpectPixel(stage.Render(24), 3, 3, {0.5, (kThird + kTwoThirds) / 2, 0.5, 1});
    ExpectPixel(stage.Render(28), 3, 3, {0, kTwoThirds, 1, 1});
}

TEST_F(Transitions, FilmMixesLightAndAdditiveAddsIt) {
    const double half = std::pow(0.5, 1 / 2.2);
    ExpectPixel(Between("XQVE Film Dissolve").Render(24), 3, 3,
                {half, std::pow((std::pow(kThird, 2.2) + std::pow(kTwoThirds, 2.2)) / 2, 1 / 2.2), half, 1}, 1e-4);
    Stage additive = Between("XQVE Additive Dissolve");
    ExpectPixel(additive.Render(24), 3, 3, {1, kThird + kTwoThirds, 1, 1});
    ExpectPixel(additive.Render(22), 3, 3, {1, kThird + kTwoThirds / 2, 0.5, 1});
}

TEST_F(Transitions, DipsGoThroughTheirColour) {
    Stage black = Between("XQVE Dip To Black");
    ExpectPixel(black.Render(22), 3, 3, {0.5, kThird / 2, 0, 1});
    ExpectPixel(black.Render(24), 3, 3, {0, 0, 0, 1});
    ExpectPixel(black.Render(26), 3, 3, {0, kTwoThirds / 2, 0.5, 1});
    ExpectPixel(Between("XQVE Dip To White").Render(24), 3, 3, {1, 1, 1, 1});
}

TEST_F(Transitions, PushMovesByWholePixelsWithItsBorder) {
    const std::array<double, 4> outgoing{1, kThird, 0, 1};
    const std::array<double, 4> incoming{0, kTwoThirds, 1, 1};
    Picture picture = Between("XQVE Push").Render(22);
    ExpectPixel(picture, 3, 3, incoming);
    ExpectPixel(picture, 4, 3, outgoing);
    picture = Between("XQVE Push", {{"direction", 2}}).Render(22);
    ExpectPixel(picture, 11, 3, outgoing);
    ExpectPixel(picture, 12, 3, incoming);
    picture = Between("XQVE Push", {{"direction", 1}}).Render(22);
    ExpectPixel(picture, 3, 1, incoming);
    ExpectPixel(picture, 3, 2, outgoing);
    picture = Between("XQVE Push", {{"direction", 4}, {"border_width", 4}, {"border_color", {255, 0, 0}}}).Render(24);
    ExpectPixel(picture, 3, 1, outgoing);
    ExpectPixel(picture, 3, 2, {1, 0, 0, 1});
    ExpectPixel(picture, 3, 5, {1, 0, 0, 1});
    ExpectPixel(picture, 3, 6, incoming);
    picture = Between("XQVE Push", {{"reverse", true}}).Render(22);
    ExpectPixel(picture, 11, 3, outgoing);
    ExpectPixel(picture, 12, 3, incoming);
}

TEST_F(Transitions, UnknownOnesDissolveAndAreTold) {
    Stage stage = Between("Some Wipe");
    ExpectPixel(stage.Render(24), 3, 3, {0.5, (kThird + kTwoThirds) / 2, 0.5, 1});
    EXPECT_THAT(stage.GetRenderer().GetPassedThrough(), testing::ElementsAre("Some Wipe"));
}

TEST_F(Transitions, ABlankSideIsTransparentNotBlack) {
    Stage stage(Timeline({Track({Dissolve(0, 8), Solid(255, 85, 0, 24)})}, Format(16, 8)));
    ExpectPixel(stage.Render(2), 3, 3, {1, kThird, 0, 0.25});
}

TEST(Structure, DisabledLayersShowNothingAndSidesOfTransitionsPass) {
    Json disabled = Solid(0, 255, 0, 10, Own({{"disabled", "node"}}));
    disabled["enabled"] = false;
    Stage stage(Timeline({Track({Solid(255, 0, 0, 10)}), Track({disabled})}, Format(8, 4)));
    ExpectPixel(stage.Render(0), 3, 1, {1, 0, 0, 1});
    ASSERT_EQ(stage.SegmentAt(0).root->inputs.size(), 2U);
    const auto picture = stage.GetRenderer().RenderNode(*stage.SegmentAt(0).root->inputs[1].node, 0, stage.GetSize(),
                                                        stage.Describe(8, 4));
    EXPECT_EQ(reinterpret_cast<const float*>(picture->GetRow(1))[1], 1.0F) << "asked for by itself it gives its clip";
}

TEST(Structure, AdjustmentLayersChangeWhatLiesBelow) {
    const auto adjusted = [](std::vector<Json> effects) {
        return Stage(Timeline(
                         {Track({Solid(255, 85, 0, 10)}), Track({Clip("adjust", Range(0, 10), GeneratorOf("adjustment"),
                                                                      Effects(std::move(effects)))})},
                         Format(16, 8)))
            .Render(3);
    };
    const Json invert = Effect("TQ.XQVE Invert", {{"channel", 0}});
    ExpectPixel(adjusted({invert}), 3, 3, {0, kTwoThirds, 1, 1});
    ExpectPixel(adjusted({invert, Opacity(25)}), 3, 3, {0.75, 0.75 * kThird + 0.25 * kTwoThirds, 0.25, 1});
    const Picture moved = adjusted({invert, Move({{"0", {1.0, 0.5}}})});
    ExpectPixel(moved, 7, 3, {1, kThird, 0, 1});
    ExpectPixel(moved, 8, 3, {0, kTwoThirds, 1, 1});
    ExpectPixel(adjusted({invert, Opacity(100, 17)}), 3, 3, {0, kThird * kTwoThirds, 0, 1});
}

TEST(Structure, TheMulticamMonitorTilesItsAngles) {
    Json angles = Stack({Track({Solid(255, 0, 0, 10)}), Track({Solid(0, 255, 0, 10)}), Track({Solid(0, 0, 255, 10)})});
    angles["metadata"] = {{"vantrel", {{"multicam", {{"selected", 1}, {"view", "grid"}}}}}};
    Stage stage(Timeline({Track({angles})}, Format(32, 16)));
    const Picture picture = stage.Render(0);
    ExpectPixel(picture, 5, 3, {1, 0, 0, 1});
    ExpectPixel(picture, 24, 4, {0, 1, 0, 1});
    ExpectPixel(picture, 16, 4, {1, 1, 0, 1});
    ExpectPixel(picture, 31, 7, {1, 1, 0, 1});
    ExpectPixel(picture, 5, 12, {0, 0, 1, 1});
    ExpectPixel(picture, 24, 12, {0, 0, 0, 1});

    angles["metadata"] = {{"vantrel", {{"multicam", {{"selected", 2}}}}}};
    ExpectPixel(Stage(Timeline({Track({angles})}, Format(32, 16))).Render(0), 9, 9, {0, 0, 1, 1});
}

TEST(Structure, OperatorsEndWhereTheRequestSays) {
    Stage stage(Timeline(
        {Track({Solid(255, 85, 0, 10, Effects({Effect("TQ.XQVE Invert"), Effect("lavfi:negate"), Opacity(50)}))})},
        Format(16, 8)));
    const Host::Node& clip = *stage.SegmentAt(0).root->inputs[0].node;
    // A neutral motion follows the opacity.
    ASSERT_EQ(clip.operators.size(), 4U);
    const std::array<std::array<double, 4>, 5> expected{
        {{1, kThird, 0, 1}, {0, kTwoThirds, 1, 1}, {1, kThird, 0, 1}, {1, kThird, 0, 0.5}, {1, kThird, 0, 0.5}}};
    for (int end = 0; end <= 4; ++end) {
        const auto picture = stage.GetRenderer().RenderOperators(clip, end, 0, stage.GetSize(), stage.Describe(16, 8));
        const auto* pixel = reinterpret_cast<const float*>(picture->GetRow(4)) + 4 * 8;
        const auto& rgba = expected[static_cast<std::size_t>(end)];
        EXPECT_NEAR(pixel[2], rgba[0], 1e-4) << end;
        EXPECT_NEAR(pixel[1], rgba[1], 1e-4) << end;
        EXPECT_NEAR(pixel[0], rgba[2], 1e-4) << end;
        EXPECT_NEAR(pixel[3], rgba[3], 1e-4) << end;
    }
}

TEST(Structure, UnknownEffectsPassOrFail) {
    const Json timeline = Timeline(
        {Track({Solid(255, 85, 0, 10, Effects({Effect("Some Plug-in"), Effect("Another One")}))})}, Format(8, 4));
    Stage stage(timeline);
    ExpectPixel(stage.Render(0), 3, 1, {1, kThird, 0, 1});
    ExpectPixel(stage.Render(1), 3, 1, {1, kThird, 0, 1});
    EXPECT_THAT(stage.GetRenderer().GetPassedThrough(), testing::ElementsAre("Another One", "Some Plug-in"));
    Stage strict(timeline, true);
    EXPECT_THAT([&] { (void)strict.Render(0); },
                testing::ThrowsMessage<std::runtime_error>(testing::HasSubstr("Some Plug-in")));
}

TEST(Structure, ReadyPicturesLieOnBlackWhereAsked) {
    Stage stage(Timeline({Track({Solid(255, 85, 0, 10, Effects({Opacity(50)}))})}, Format(8, 4)));
    VantrelRenderDescription description = stage.Describe(8, 4);
    description.compositeOnBlack = 1;
    const std::uint32_t bytes[] = {Vellum::FourCC("bgra"), 0};
    description.pixelFormats = bytes;
    const auto picture = stage.RenderHost(0, description);
    const auto* pixel = reinterpret_cast<const std::uint8_t*>(picture->GetRow(1)) + 4;
    EXPECT_NEAR(pixel[2], 128, 1);
    EXPECT_NEAR(pixel[1], 43, 1);
    EXPECT_EQ(pixel[3], 255);
    EXPECT_THROW((void)stage.RenderHost(0, stage.Describe(0, 4)), std::invalid_argument);
}

TEST(Structure, TitlesBarsAndSlatesAppearInTheirPlace) {
    const Json title = Clip("title", Range(0, 10), GeneratorOf("title", {{"text", "HELLO"}, {"size", 40}}));
    Stage stage(
        Timeline({Track({Clip("bars", Range(0, 10), GeneratorOf("SMPTEBars"))}), Track({title})}, Format(320, 180)));
    const Picture picture = stage.Render(0);
    ExpectPixel(picture, 10, 10, {0.75, 0.75, 0.75, 1});
    int white = 0;
    for (int y = 60; y < 120; ++y) {
        for (int x = 80; x < 240; ++x) white += picture.At(x, y)[0] > 0.99F && picture.At(x, y)[1] > 0.99F ? 1 : 0;
    }
    EXPECT_GT(white, 200);
    Stage offline(Timeline({Track({Clip("lost shot", Range(0, 10), {{"OTIO_SCHEMA", "MissingReference.1"}})})},
                           Format(320, 180)));
    ExpectPixel(offline.Render(0), 4, 4, {0.09, 0.10, 0.13, 1}, 1e-4);
    Stage source(Timeline({Track({Clip("test", Range(0, 10), GeneratorOf("testsrc2"))})}, Format(64, 48)));
    EXPECT_FALSE(PicturesAgree(source.Render(0), source.Render(5), kExactly));
    EXPECT_TRUE(PicturesAgree(source.Render(3), source.Render(3), kExactly));
}

TEST(Structure, AWholeFrameGoesTogether) {
    const Json source =
        Clip("source", Range(0, 10), GeneratorOf("testsrc2"),
             Effects({Effect("lavfi:hue=h=90"), Opacity(80), Move({{"1", 50}, {"4", 20}, {"0", {0.35, 0.4}}})}));
    const Json light = Solid(255, 160, 40, 10, Effects({Opacity(100, 22), Move({{"1", 40}, {"0", {0.75, 0.35}}})}));
    const Json title = Clip("title", Range(0, 10),
                            GeneratorOf("title", {{"text", "Over\neverything"},
                                                  {"size", 36},
                                                  {"position", {0.5, 0.75}},
                                                  {"font", "Liberation Serif Bold"}}));
    Stage stage(Timeline({Track({Clip("bars", Range(0, 10), GeneratorOf("SMPTEBars"))}), Track({source}),
                          Track({light}), Track({title})},
                         Format(480, 270)));
    const Picture picture = stage.Render(4);
    KeepPicture(picture, "composite");
    EXPECT_TRUE(stage.GetRenderer().GetPassedThrough().empty());
    // Screen over the bars' third stripe from the right: 1 - (1 - b)(1 - s).
    ExpectPixel(picture, 310, 100, {1, 160.0 / 255, 0.75 + 0.25 * 40.0 / 255, 1}, 1e-4);
    ExpectPixel(picture, 476, 10, {0, 0, 0.75, 1}, 1e-4);
    // The turned source lies within the frame: its corner's surroundings are the bars' own.
    ExpectPixel(picture, 10, 10, {0.75, 0.75, 0.75, 1}, 1e-4);
    for (std::size_t i = 3; i < picture.pixels.size(); i += 4) ASSERT_EQ(picture.pixels[i], 1.0F);
}

}  // namespace
}  // namespace Vantrel::Testing
