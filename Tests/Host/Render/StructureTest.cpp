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

using Color = std::array<double, 4>;  // red, green, blue, alpha

/// What stands at some places of a picture.
struct Spot {
    int x, y;
    Color color;
};
void ExpectSpots(const Picture& picture, const std::vector<Spot>& spots, double tolerance = 1e-5) {
    for (const Spot& spot : spots) ExpectPixel(picture, spot.x, spot.y, spot.color, tolerance);
}
/// A picture of one colour, told by a pixel within.
void ExpectColor(const Picture& picture, const Color& color, double tolerance = 1e-5) {
    ExpectPixel(picture, 3, 1, color, tolerance);
}

/// What an animated mix of two colours gives; alpha is the first one's.
Color Mix(const Color& a, const Color& b, double share) {
    return {a[0] + (b[0] - a[0]) * share, a[1] + (b[1] - a[1]) * share, a[2] + (b[2] - a[2]) * share, a[3]};
}
Color Product(const Color& a, const Color& b) { return {a[0] * b[0], a[1] * b[1], a[2] * b[2], a[3]}; }

const Color kRed{1, 0, 0, 1};
const Color kGreen{0, 1, 0, 1};
const Color kBlue{0, 0, 1, 1};
const Color kWhite{1, 1, 1, 1};
/// Of the solids that most tests show, (255, 85, 0) and (0, 170, 255).
const Color kOrange{1, kThird, 0, 1};
const Color kAzure{0, kTwoThirds, 1, 1};

TEST(Structure, ALayerCoversWhatLiesBelow) {
    Stage stage(Timeline({Track({Solid(255, 0, 0, 24)}), Track({Gap(12), Solid(0, 255, 0, 12)})}, Format(16, 8)));
    for (const auto& [frame, color] : {std::pair{0, kRed}, {11, kRed}, {12, kGreen}}) {
        ExpectSpots(stage.Render(frame), {{0, 0, color}, {15, 7, color}});
    }
}

TEST(Structure, OpacityAndBlendModesMeetWhatLiesBelow) {
    const Color below{kTwoThirds, kThird, 0, 1};
    const Color above{kThird, kTwoThirds, 1, 1};
    const Json rising = {{"keyframes", {{{"t", Time(0)}, {"value", 0}}, {{"t", Time(8)}, {"value", 100}}}}};
    const std::pair<Json, Color> cases[] = {
        {Opacity(50), Mix(below, above, 0.5)},
        {Opacity(100, 17), Product(below, above)},
        {Opacity(50, 17), Mix(below, Product(below, above), 0.5)},
        {Effect("TQ.XQVE Opacity", {{"0", rising}}), Mix(below, above, 0.25)},
    };
    for (const auto& [effect, color] : cases) {
        const Json top = Solid(85, 170, 255, 10, Effects({effect}));
        Stage stage(Timeline({Track({Solid(170, 85, 0, 10)}), Track({top})}, Format(8, 4)));
        ExpectColor(stage.Render(2), color);
    }
}

TEST(Structure, TheBottomLayerHasNoBlendModeAndWithOneNoOpacity) {
    for (const auto& [effect, alpha] : {std::pair{Opacity(40, 17), 1.0}, {Opacity(40), 0.4}, {Opacity(99.9995), 1.0}}) {
        Stage stage(Timeline({Track({Solid(255, 85, 0, 10, Effects({effect}))})}, Format(8, 4)));
        ExpectColor(stage.Render(0), {1, kThird, 0, alpha});
    }
}

TEST(Structure, MotionScalesMovesAndTurns) {
    const struct {
        Json motion;
        std::vector<Spot> spots;
    } cases[] = {
        {{{"1", 50}}, {{4, 2, kWhite}, {11, 5, kWhite}, {3, 2, kBlue}, {12, 5, kBlue}, {4, 1, kBlue}}},
        {{{"0", {0.75, 0.5}}}, {{4, 0, kWhite}, {3, 0, kBlue}}},
        {{{"0", {0.0, 0.0}}, {"5", {0.0, 0.0}}, {"1", 50}, {"2", 25}, {"3", false}},
         {{3, 3, kWhite}, {4, 3, kBlue}, {3, 4, kBlue}}},
        {{{"4", 90}}, {{4, 0, kWhite}, {11, 7, kWhite}, {3, 4, kBlue}}},
        // Half a pixel to the right: the border pixel is half covered.
        {{{"0", {0.5 + 0.5 / 16, 0.5}}}, {{0, 4, {0.5, 0.5, 1, 1}}, {1, 4, kWhite}}},
    };
    for (const auto& each : cases) {
        SCOPED_TRACE(each.motion.dump());
        const Json moved = Solid(255, 255, 255, 10, Effects({Move(each.motion)}));
        ExpectSpots(Stage(Timeline({Track({Solid(0, 0, 255, 10)}), Track({moved})}, Format(16, 8))).Render(0),
                    each.spots);
    }
}

class FilmStructure : public testing::Test {
protected:
    FilmStructure() { WriteNumberFilm(mFilm, 100); }
    /// Which frame of the film some frames of the sequence show.
    static void ExpectNumbers(Stage& stage, const std::vector<std::pair<int, int>>& numbers) {
        for (const auto& [frame, number] : numbers) EXPECT_EQ(stage.NumberAt(frame), number) << "at " << frame;
    }
    [[nodiscard]] Json Film(double start, double duration, Json more = Json::object()) const {
        return FilmClip(mFilm, start, duration, 100, std::move(more));
    }

    ScratchFolder mFolder;
    std::string mFilm = mFolder / "film.mp4";
};

TEST_F(FilmStructure, ItemsShowTheFramesOfTheirTime) {
    Stage stage(Timeline({Track({Film(10, 20), Gap(5), Film(30, 20, Effects({Warp(2)})),
                                 Film(40, 10, Effects({Freeze()})), Film(20, 10, Effects({Warp(-1)})), Film(90, 20)})},
                         Format(64, 64)));
    ExpectNumbers(stage, {{0, 10}, {19, 29}, {25, 30}, {30, 40}, {45, 40}, {54, 40}, {55, 29}, {64, 20}, {65, 90}});
    EXPECT_EQ(stage.NumberAt(80), 99) << "beyond its end the film shows its last frame";
}

TEST_F(FilmStructure, TimesBetweenFramesShowTheNearestOrAMix) {
    const auto warped = [this](double speed, bool blend) {
        Json clip = Film(0, 20, Own({{"frame_blend", blend}}));
        clip["effects"] = {Warp(speed)};
        return clip;
    };
    Stage stage(Timeline({Track({warped(0.5, false), warped(0.5, true)})}, Format(64, 64)));
    ExpectNumbers(stage, {{0, 0}, {1, 0}, {3, 1}, {6, 3}, {20, 0}, {21, -1}});
    // Between frames 0 and 1 only the last square changes; it lies half way.
    const Color grey{0.5, 0.5, 0.5, 1};
    ExpectPixel(stage.Render(21), 56, 56, grey, 0.03);
    // Half a frame of the film passes in each frame of the sequence, which says nothing about shares; at four times the
    // speed four frames do. Of frames 4 to 7 two have the last bit, two the one before, all the third.
    Stage mixed(Timeline({Track({warped(4, true)})}, Format(64, 64)));
    ExpectSpots(mixed.Render(1), {{56, 56, grey}, {40, 56, grey}, {24, 56, kWhite}}, 0.03);
}

TEST_F(FilmStructure, NestedSequencesKeepTheirTimeAndFormat) {
    const auto nested = [this](Json effects) {
        Json inner = Stack({Track({Film(0, 30), Film(50, 30)})}, Effects({std::move(effects)}));
        inner["source_range"] = Range(10, 40);
        inner["metadata"] = Format(32, 32)["metadata"];
        return inner;
    };
    Stage stage(
        Timeline({Track({nested(Warp(1)), nested(Warp(0.5)), nested(Freeze()), nested(Warp(-1))})}, Format(64, 64)));
    ExpectNumbers(stage, {{0, 10}, {19, 29}, {20, 50}, {40, 10}, {60, 20}, {80, 10}, {119, 10}, {120, 69}, {159, 10}});
}

TEST_F(FilmStructure, ARequestInAnotherSizeSeesTheSameFrame) {
    Stage stage(Timeline({Track({Film(33, 20)})}, Format(64, 64)));
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

TEST(Transitions, MixByTheElapsedShare) {
    const Color black{0, 0, 0, 1};
    const double half = std::pow(0.5, 1 / 2.2);
    const double green = std::pow((std::pow(kThird, 2.2) + std::pow(kTwoThirds, 2.2)) / 2, 1 / 2.2);
    const struct {
        const char* name;
        std::vector<std::pair<int, Color>> frames;
    } cases[] = {
        {"XQVE Cross Dissolve",
         {{19, kOrange},
          {20, kOrange},
          {22, Mix(kOrange, kAzure, 0.25)},
          {24, Mix(kOrange, kAzure, 0.5)},
          {28, kAzure}}},
        {"XQVE Film Dissolve", {{24, {half, green, half, 1}}}},  // of light, not of numbers
        {"XQVE Additive Dissolve", {{22, {1, kThird + kTwoThirds / 2, 0.5, 1}}, {24, {1, kThird + kTwoThirds, 1, 1}}}},
        {"XQVE Dip To Black", {{22, Mix(kOrange, black, 0.5)}, {24, black}, {26, Mix(kAzure, black, 0.5)}}},
        {"XQVE Dip To White", {{24, kWhite}}},
    };
    for (const auto& each : cases) {
        Stage stage = Between(each.name);
        for (const auto& [frame, color] : each.frames) {
            SCOPED_TRACE(testing::Message() << each.name << " at " << frame);
            ExpectColor(stage.Render(frame), color, each.frames.front().first == 24 ? 1e-4 : 1e-5);
        }
    }
}

TEST(Transitions, PushMovesByWholePixelsWithItsBorder) {
    const struct {
        Json properties;
        int frame;
        std::vector<Spot> spots;
    } cases[] = {
        {Json::object(), 22, {{3, 3, kAzure}, {4, 3, kOrange}}},
        {{{"direction", 2}}, 22, {{11, 3, kOrange}, {12, 3, kAzure}}},
        {{{"direction", 1}}, 22, {{3, 1, kAzure}, {3, 2, kOrange}}},
        {{{"direction", 4}, {"border_width", 4}, {"border_color", {255, 0, 0}}},
         24,
         {{3, 1, kOrange}, {3, 2, kRed}, {3, 5, kRed}, {3, 6, kAzure}}},
        {{{"reverse", true}}, 22, {{11, 3, kOrange}, {12, 3, kAzure}}},
    };
    for (const auto& each : cases) {
        SCOPED_TRACE(each.properties.dump());
        ExpectSpots(Between("XQVE Push", each.properties).Render(each.frame), each.spots);
    }
}

TEST(Transitions, UnknownOnesDissolveAndAreToldAndABlankSideIsTransparent) {
    Stage stage = Between("Some Wipe");
    ExpectColor(stage.Render(24), Mix(kOrange, kAzure, 0.5));
    EXPECT_THAT(stage.GetRenderer().GetPassedThrough(), testing::ElementsAre("Some Wipe"));
    Stage blank(Timeline({Track({Dissolve(0, 8), Solid(255, 85, 0, 24)})}, Format(16, 8)));
    ExpectColor(blank.Render(2), {1, kThird, 0, 0.25});
}

TEST(Structure, DisabledLayersShowNothingAndSidesOfTransitionsPass) {
    Json disabled = Solid(0, 255, 0, 10, Own({{"disabled", "node"}}));
    disabled["enabled"] = false;
    Stage stage(Timeline({Track({Solid(255, 0, 0, 10)}), Track({disabled})}, Format(8, 4)));
    ExpectColor(stage.Render(0), kRed);
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
    ExpectColor(adjusted({invert}), kAzure);
    ExpectColor(adjusted({invert, Opacity(25)}), Mix(kOrange, kAzure, 0.25));
    ExpectColor(adjusted({invert, Opacity(100, 17)}), Product(kOrange, kAzure));
    ExpectSpots(adjusted({invert, Move({{"0", {1.0, 0.5}}})}), {{7, 3, kOrange}, {8, 3, kAzure}});
}

TEST(Structure, TheMulticamMonitorTilesItsAngles) {
    Json angles = Stack({Track({Solid(255, 0, 0, 10)}), Track({Solid(0, 255, 0, 10)}), Track({Solid(0, 0, 255, 10)})});
    const auto render = [&](Json multicam) {
        angles["metadata"] = {{"vantrel", {{"multicam", std::move(multicam)}}}};
        return Stage(Timeline({Track({angles})}, Format(32, 16))).Render(0);
    };
    const Color frame{1, 1, 0, 1};
    ExpectSpots(
        render({{"selected", 1}, {"view", "grid"}}),
        {{5, 3, kRed}, {24, 4, kGreen}, {16, 4, frame}, {31, 7, frame}, {5, 12, kBlue}, {24, 12, {0, 0, 0, 1}}});
    ExpectColor(render({{"selected", 2}}), kBlue);
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
