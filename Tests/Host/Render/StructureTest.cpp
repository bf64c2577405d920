// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "Tests/Host/Render/Stage.h"

namespace Vantrel::Testing {
namespace {

using namespace Vantrel::Host::Test;

constexpr double kThird = 85.0 / 255.0;
constexpr double kTwoThirds = 170.0 / 255.0;

Json Opacity(double percent, int mode = 18) { return Effect("TQ.XQVE Opacity", {{"0", percent}, {"1", mode}}); }

using Color = std::array<double, 4>;  // red, green, blue, alpha

/// A picture of one colour, told by a pixel within.
void ExpectColor(const Picture& picture, const Color& color) { ExpectPixel(picture, 3, 1, color); }

/// What an animated mix of two colours gives; alpha is the first one's.
Color Mix(const Color& a, const Color& b, double share) {
    return {a[0] + (b[0] - a[0]) * share, a[1] + (b[1] - a[1]) * share, a[2] + (b[2] - a[2]) * share, a[3]};
}

/// Of the solids that most tests show, (255, 85, 0) and (0, 170, 255).
const Color kOrange{1, kThird, 0, 1};
const Color kAzure{0, kTwoThirds, 1, 1};

TEST(Structure, TheBottomLayerHasNoBlendModeAndWithOneNoOpacity) {
    for (const auto& [effect, alpha] : {std::pair{Opacity(40, 17), 1.0}, {Opacity(40), 0.4}, {Opacity(99.9995), 1.0}}) {
        Stage stage(Timeline({Track({Solid(255, 85, 0, 10, Effects({effect}))})}, Format(8, 4)));
        ExpectColor(stage.Render(0), {1, kThird, 0, alpha});
    }
}

class FilmStructure : public testing::Test {
protected:
    FilmStructure() { WriteNumberFilm(mFilm, 100); }
    [[nodiscard]] Json Film(double start, double duration, Json more = Json::object()) const {
        return FilmClip(mFilm, start, duration, 100, std::move(more));
    }

    ScratchFolder mFolder;
    std::string mFilm = mFolder / "film.mp4";
};

TEST_F(FilmStructure, ARequestInAnotherSizeSeesTheSameFrame) {
    Stage stage(Timeline({Track({Film(33, 20)})}, Format(64, 64)));
    for (const int size : {32, 48, 100}) {
        const auto picture = stage.RenderHost(4, stage.DescribeBytes(size, size));
        EXPECT_EQ(picture->width, size);
        EXPECT_EQ(picture->format, Vellum::kPixelFormat_BGRA_4444_8u);
        EXPECT_EQ(Host::ReadNumber(*picture), 37);
    }
}

TEST_F(FilmStructure, ClipFramesComeInTheirOwnSizeAndTheFormatAsked) {
    Stage stage(Timeline({Track({Film(33, 20)})}, Format(16, 16)));
    const auto& clip = *stage.SegmentAt(0).root->inputs[0].node->inputs[0].node->AsMedia()->clip;
    for (const auto format : {Vellum::kPixelFormat_BGRA_4444_8u, Vellum::kPixelFormat_BGRA_4444_32f}) {
        const auto picture = stage.GetRenderer().RenderClip(clip, 41, format);
        EXPECT_EQ(picture->width, 64);
        EXPECT_EQ(picture->format, format);
    }
    EXPECT_EQ(Host::ReadNumber(*stage.GetRenderer().RenderClip(clip, 41, Vellum::kPixelFormat_BGRA_4444_8u)), 41);
}

TEST_F(FilmStructure, RequestsForClipsBringTransformedAndRawTimes) {
    Stage stage(Timeline({Track({Film(20, 20, Effects({Warp(2)}))})}, Format(64, 64)));
    const Host::Node& clip = *stage.SegmentAt(0).root->inputs[0].node;
    const VantrelRenderDescription description = stage.DescribeBytes(64, 64);
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
    const std::pair<const char*, Color> cases[] = {
        {"keep", {0.8, 2.0, 0.2, 0.25}}, {"ignore", {0.2, 0.5, 0.05, 1}}, {"invert", {0.2, 0.5, 0.05, 0.75}}};
    for (const auto& [alpha, color] : cases) {
        const Json more = alpha == std::string("keep") ? Json::object() : Own({{"alpha", alpha}});
        ExpectColor(Stage(Timeline({Track({FilmClip(folder / "light.exr", 0, 4, 1, more)})}, Format(8, 4))).Render(0),
                    color);
    }
}

Stage Between(const std::string& name, Json properties = Json::object()) {
    Json transition = Dissolve(4, 4);
    transition["transition_type"] = "Custom_Transition";
    transition["metadata"] = {{"vantrel", {{"match_name", name}, {"properties", std::move(properties)}}}};
    return Stage(Timeline({Track({Solid(255, 85, 0, 24), transition, Solid(0, 170, 255, 24)})}, Format(16, 8)));
}

TEST(Transitions, UnknownOnesDissolveAndAreToldAndABlankSideIsTransparent) {
    Stage stage = Between("Some Wipe");
    ExpectColor(stage.Render(24), Mix(kOrange, kAzure, 0.5));
    EXPECT_THAT(stage.GetRenderer().GetPassedThrough(), testing::ElementsAre("Some Wipe"));
    Stage blank(Timeline({Track({Dissolve(0, 8), Solid(255, 85, 0, 24)})}, Format(16, 8)));
    ExpectColor(blank.Render(2), {1, kThird, 0, 0.25});
}

TEST(Structure, OperatorsEndWhereTheRequestSays) {
    Stage stage(Timeline(
        {Track({Solid(255, 85, 0, 10, Effects({Effect("TQ.XQVE Invert"), Effect("lavfi:negate"), Opacity(50)}))})},
        Format(16, 8)));
    const Host::Node& clip = *stage.SegmentAt(0).root->inputs[0].node;
    // A neutral motion follows the opacity.
    ASSERT_EQ(clip.operators.size(), 4U);
    const Color expected[] = {kOrange, kAzure, kOrange, {1, kThird, 0, 0.5}, {1, kThird, 0, 0.5}};
    for (int end = 0; end <= 4; ++end) {
        const auto picture = stage.GetRenderer().RenderOperators(clip, end, 0, stage.GetSize(), stage.Describe(16, 8));
        const auto* pixel = reinterpret_cast<const float*>(picture->GetRow(4)) + 4 * 8;
        constexpr int kOrder[] = {2, 1, 0, 3};
        for (int c = 0; c < 4; ++c)
            EXPECT_NEAR(pixel[kOrder[c]], expected[end][static_cast<std::size_t>(c)], 1e-4) << end;
    }
}

TEST(Structure, UnknownEffectsPassOrFail) {
    const Json timeline = Timeline(
        {Track({Solid(255, 85, 0, 10, Effects({Effect("Some Plug-in"), Effect("Another One")}))})}, Format(8, 4));
    Stage stage(timeline);
    for (const int frame : {0, 1}) ExpectColor(stage.Render(frame), kOrange);
    EXPECT_THAT(stage.GetRenderer().GetPassedThrough(), testing::ElementsAre("Another One", "Some Plug-in"));
    Stage strict(timeline, true);
    EXPECT_THAT([&] { (void)strict.Render(0); },
                testing::ThrowsMessage<std::runtime_error>(testing::HasSubstr("Some Plug-in")));
}

TEST(Structure, ReadyPicturesLieOnBlackWhereAsked) {
    Stage stage(Timeline({Track({Solid(255, 85, 0, 10, Effects({Opacity(50)}))})}, Format(8, 4)));
    VantrelRenderDescription description = stage.DescribeBytes(8, 4);
    description.compositeOnBlack = 1;
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
    for (int bar = 0; bar < 7; ++bar) {  // white, yellow, cyan, green, magenta, red, blue
        const double red = bar % 4 < 2 ? 0.75 : 0, green = bar < 4 ? 0.75 : 0, blue = bar % 2 == 0 ? 0.75 : 0;
        ExpectPixel(picture, 22 + 320 * bar / 7, 10, {red, green, blue, 1});
        ExpectPixel(picture, 22 + 320 * (6 - bar) / 7, 127,
                    {bar % 2 == 0 ? red : 0, bar % 2 == 0 ? green : 0, bar % 2 == 0 ? blue : 0, 1});
    }
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

}  // namespace
}  // namespace Vantrel::Testing
