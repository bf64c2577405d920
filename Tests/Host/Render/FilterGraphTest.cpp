// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "Host/Software/EffectRunner.h"
#include "Host/Software/FilterGraph.h"
#include "Tests/Support/Pictures.h"

namespace Vantrel::Testing {
namespace {

using Host::Software::FilterGraph;
using Host::Software::FilterGraphs;
using Host::Software::LayerPicture;
using testing::HasSubstr;
using testing::ThrowsMessage;

constexpr Vellum::PixelAspectRatio kSquare{1, 1};

Picture RunGraph(const std::string& text, const Picture& picture, std::int64_t time = 0) {
    return FilterGraph(text, picture.width, picture.height, kSquare).Run(picture, time);
}

TEST(FilterGraph, FloatFiltersKeepEveryBit) {
    Random random;
    const Picture picture = RandomPicture(random, 37, 23);
    // A filter that moves nothing, and one that moves pixels: values beyond 0 and 1 and alpha come through both.
    EXPECT_TRUE(PicturesAgree(RunGraph("null", picture), picture, kExactly));
    EXPECT_TRUE(PicturesAgree(RunGraph("hflip,vflip,hflip,vflip", picture), picture, kExactly));
}

TEST(FilterGraph, FiltersOfLumaAndChromaPutAlphaBack) {
    Picture picture(16, 8);
    for (int y = 0; y < 8; ++y) {
        for (int x = 0; x < 16; ++x) picture.Set(x, y, {0.25, 0.25, 0.25, x / 15.0});
    }
    const Picture brighter = RunGraph("eq=brightness=0.25", picture);
    for (int x = 0; x < 16; ++x) {
        EXPECT_FLOAT_EQ(brighter.At(x, 3)[3], picture.At(x, 3)[3]);
        for (int c = 0; c < 3; ++c) EXPECT_NEAR(brighter.At(x, 3)[c], 0.25 + 0.25 * 255 / 219, 0.01) << x;
    }
}

TEST(FilterGraph, RefusalsNameFilterAndReason) {
    const Picture picture(8, 8);
    const auto expect = [&picture](const char* text, const char* filter, const char* reason) {
        EXPECT_THAT([&] { (void)RunGraph(text, picture); },
                    ThrowsMessage<std::runtime_error>(testing::AllOf(HasSubstr(filter), HasSubstr(reason))))
            << text;
    };
    expect("gblur,tmix=frames=3", "tmix", "other frames");
    expect("minterpolate", "minterpolate", "other frames");
    expect("fps=12", "fps", "rate");
    expect("yadif", "yadif", "other frames");
    expect("setpts=2*PTS", "setpts", "rate");
    expect("movie=some.mp4[a];[in][a]overlay", "movie", "files");
    expect("color=red[a];[in][a]overlay", "color", "pictures of its own");
    expect("[in]split=2[a][b];[a][b]hstack,framerate", "framerate", "other frames");
    expect("drawtext=text='a, movie=x', trim", "trim", "other frames");
    expect("split", "split", "one picture");
    expect("overlay", "overlay", "one picture");
    expect("no_such_filter=1", "no_such_filter", "no_such_filter");
    expect("gblur=sigma=wide", "gblur", "sigma");
    expect("volume=2", "volume", "one picture");
}

TEST(FilterGraph, TimeIsTheOneGiven) {
    const Picture picture(4, 4);
    const Picture drawn = RunGraph("geq=r='T/4':g='0':b='0'", picture, 2 * Vellum::kTicksPerSecond);
    EXPECT_NEAR(drawn.At(1, 1)[2], 0.5, 0.01);
}

TEST(FilterGraphs, ALayerOfAnotherSizeStaysCentred) {
    FilterGraphs graphs;
    LayerPicture layer;
    layer.picture = Picture(20, 10);
    layer.origin = {2, -1};
    graphs.Run("pad=30:14:5:2", 0, layer);
    EXPECT_EQ(layer.picture.width, 30);
    EXPECT_EQ(layer.picture.height, 14);
    EXPECT_EQ(layer.origin, (Vellum::Point{7, 1}));
}

TEST(FilterGraph, ParametersFillInTheirNames) {
    Host::EffectDetail effect;
    effect.filterGraph = "geq=lum='{level}':x={at.x}:y={at.y}:c={tint}";
    Host::Parameter level;
    level.name = "level";
    level.keys = {{0, {0}, Host::Interpolation::kLinear, {}, {}}, {100, {50}, Host::Interpolation::kLinear, {}, {}}};
    Host::Parameter at;
    at.name = "at";
    at.type = ParameterType::kPoint;
    at.value = {0.5, 0.25};
    Host::Parameter tint;
    tint.name = "tint";
    tint.type = ParameterType::kColor;
    tint.value = {1, 0.5, 0, 1};
    effect.parameters = {level, at, tint};
    EXPECT_EQ(Host::Software::FillInParameters(effect, 30), "geq=lum='15':x=0.5:y=0.25:c=0xFF8000FF");
    effect.filterGraph = "gblur=sigma={size}";
    EXPECT_THAT([&] { (void)Host::Software::FillInParameters(effect, 0); },
                ThrowsMessage<std::runtime_error>(HasSubstr("{size}")));
}

}  // namespace
}  // namespace Vantrel::Testing
