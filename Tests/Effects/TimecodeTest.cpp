// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0

#include "Tarn/Text.h"
#include "Tests/Effects/EffectTester.h"
#include "Vantrel/Effects/Timecode.h"

namespace Vantrel::Testing {
namespace {

constexpr std::int64_t kFrame25 = Vellum::kTicksPerSecond / 25;

class TimecodeOnEachDevice : public EffectTest {
protected:
    RenderNodeRef MakeTimecode(const std::map<std::int32_t, double>& settings, double x, double y) {
        Params params = MakeParams(kTimecodeEffect, settings);
        params[kTimecode_Position] = FakePoint{x, y};
        return MakeEffect(kTimecodeEffect.matchName, params);
    }
    RenderParams Request(const VideoFrameRef& input, int width, int height) {
        RenderParams request = MakeRequest(input, 100 * kFrame25);
        request.outputRect = {0, 0, width, height};
        request.sequenceRect = {0, 0, 2 * width, 2 * height};
        request.scaleX = request.scaleY = 2.0F;
        request.sequenceFrameTicks = kFrame25;
        return request;
    }
};

TEST_P(TimecodeOnEachDevice, AgreesWithTheScalarVersionOnPicturesOfEverySize) {
    Random random;
    for (int i = 0; i < 40; ++i) {
        SCOPED_TRACE(i);
        const int width = random.Int(1, 260), height = random.Int(1, 60);
        const bool ownSize = random.Chance(0.5F);
        const Picture in =
            RoundTo(RandomPicture(random, ownSize ? random.Int(1, 300) : width, ownSize ? random.Int(1, 80) : height),
                    GetFormat());
        const double x = static_cast<double>(random.Uniform(-0.2F, 1.2F));
        const double y = static_cast<double>(random.Uniform(-0.2F, 1.2F));
        const std::map<std::int32_t, double> settings = {
            {kTimecode_Size, static_cast<double>(random.Uniform(5.0F, random.Chance(0.2F) ? 300.0F : 40.0F))},
            {kTimecode_Opacity, static_cast<double>(random.Int(0, 4) * 25)},
            {kTimecode_FieldSymbol, random.Int(0, 1)},
            {kTimecode_Format, random.Int(0, 4)},
            {kTimecode_TimeDisplay, random.Int(0, 7)},
            {kTimecode_Offset, random.Int(-200, 200)},
            {kTimecode_Label, random.Int(0, 11)}};
        const VideoFrameRef input = MakePaddedFrame(GetDevice(), GetFormat(), in, 2);
        RenderParams request = Request(input, width, height);
        request.sequenceFieldType = static_cast<std::uint32_t>(random.Int(0, 2));
        request.fieldSelection = static_cast<std::uint32_t>(random.Int(0, 2));
        VideoFrameRef output;
        ASSERT_EQ(TryRender(MakeTimecode(settings, x, y), input, request, output), Ostrand::kStatus_OK);

        Host::Software::LayerPicture layer;
        layer.picture = in;
        layer.aspect = {1, 1};
        ParameterValues values = {{kTimecode_Position, {x, y}}};
        for (const auto& [index, value] : settings) values[index] = {value};
        Host::Software::EffectContext context;
        context.itemTime = 100 * kFrame25;
        context.view = {width,
                        height,
                        {1, 1},
                        2 * width,
                        2 * height,
                        kFrame25,
                        4,
                        request.sequenceFieldType,
                        request.fieldSelection};
        layer = OnHost(kTimecodeEffect, values, layer, context);
        const Picture drawn = DownloadFrame(GetDevice(), output);
        ASSERT_EQ(drawn.width, layer.picture.width);
        EXPECT_TRUE(PicturesAgree(drawn, RoundTo(layer.picture, GetFormat()), GetTolerance()));
    }
}

INSTANTIATE_TEST_SUITE_P(Devices, TimecodeOnEachDevice, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

TEST(TimecodeTexts, TellTimeSourceAndFrames) {
    const struct {
        TimecodeText text;
        std::int64_t ticks;
        const char* expected;
    } kRows[] = {
        {{0, 0, 1, 0.0F, 0, 0}, 30 * kFrame25, "00:00:01:05"},
        {{0, 0, 1, 0.0F, 0, 0}, 30 * kFrame25 - kFrame25 / 5, "00:00:01:05"},  // a rounding below the frame
        {{0, 0, 1, 0.0F, 0, 0}, -kFrame25, "-00:00:00:01"},
        {{0, 0, 1, 7.9F, 1000, 0}, 0, "00:00:00:07"},  // the starting frame isn't the clip's
        {{0, 2, 1, -7.9F, 1000, 1}, 0, "TCG 00:00:39:18"},
        {{1, 2, 1, 0.0F, 1000, 1}, 5 * kFrame25, "TCG 5"},
        {{0, 1, 0, 0.0F, 0, 1}, 25 * kFrame25, "MDA 00:00:01:01"},  // frames keep their numbers
        {{0, 6, 1, 0.0F, 0, 1}, 0, "AX4 00:00:00:00"},
        {{0, 7, 1, 0.0F, 0, 1}, 0, "00:00:00:00"},
        {{0, 0, 1, 0.0F, 0, 2}, 0, "CM1 00:00:00:00"},
        {{0, 0, 1, 0.0F, 0, 10}, 0, "CM9 00:00:00:00"},
        {{0, 0, 1, 0.0F, 0, 11}, 0, "00:00:00:00"},
        {{3, 0, 1, 0.0F, 0, 0}, 20 * kFrame25, "1+04"},
    };
    for (const auto& row : kRows) EXPECT_EQ(FormatTimecode(row.text, row.ticks, kFrame25), row.expected);
}

/// Ink in the upper and the lower half of the box, at the symbol's place.
std::pair<int, int> SymbolInk(std::uint32_t fieldType, std::uint32_t selection) {
    Tarn::TextLine line;
    line.text = "1";
    line.hasFieldSymbol = true;
    line.fieldType = fieldType;
    line.fieldSelection = selection;
    std::int32_t width = 200, height = 200;
    Tarn::DrawText(line, width, height, 0, nullptr);
    std::vector<unsigned char> bytes(static_cast<std::size_t>(width * height * 4));
    Tarn::DrawText(line, width, height, width * 4, bytes.data());
    int upper = 0, lower = 0;
    for (int y = 0; y < height; ++y) {
        for (int x = width - 15; x < width; ++x) {
            (2 * y + 1 < height ? upper : lower) += bytes[static_cast<std::size_t>((y * width + x) * 4)] > 0;
        }
    }
    return {upper, lower};
}

TEST(TimecodeTexts, TheFieldSymbolShowsTheHalfThatTheFieldIs) {
    const struct {
        std::uint32_t fieldType, selection;
        bool upper, lower;
    } kRows[] = {{0, 2, true, true},  {0, 0, true, true},  {1, 2, true, true},  {2, 2, true, true},
                 {1, 0, true, false}, {1, 1, false, true}, {2, 0, false, true}, {2, 1, true, false}};
    for (const auto& row : kRows) {
        const auto [upper, lower] = SymbolInk(row.fieldType, row.selection);
        EXPECT_EQ(upper > 40, row.upper) << row.fieldType << ", " << row.selection << ": " << upper;
        EXPECT_EQ(lower > 40, row.lower) << row.fieldType << ", " << row.selection << ": " << lower;
    }
}

}  // namespace
}  // namespace Vantrel::Testing
