// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cmath>
#include <limits>

#include "Src/Filters/Effects/UltraKeySetup.h"
#include "Src/VideoNodes/VideoNodeFactory.h"
#include "Tests/Effects/EffectTester.h"
#include "Tests/Effects/KernelArguments.h"
#include "Tests/Effects/ScreenShot.h"
#include "Vantrel/EffectTable.h"

namespace Vantrel::Testing {
namespace {

constexpr const char* kMatchName = "TQ.XQVE Ultra Key";
constexpr Pixel kGreen = {0.25, 0.7, 0.1, 1}, kBlue = {0.75, 0.25, 0.1, 1};

FakeParam Color(const Pixel& color) {
    std::array<std::uint16_t, 4> words{};
    for (std::size_t c = 0; c < 4; ++c) words[c] = static_cast<std::uint16_t>(color[c] * 65280.0);
    return words;
}

class UltraKeyOnEachDevice : public EffectTest {
protected:
    /// The defaults but for these.
    static Params Settings(const Pixel& key, const std::map<std::int32_t, double>& changes = {}) {
        Params params = {{2, Color(key)}};
        for (const ParameterRow& row : kUltraKeyParameters) {
            if (row.type == ParameterType::kDouble) params[row.index] = row.value[0];
            if (row.type == ParameterType::kInt) params[row.index] = static_cast<std::int32_t>(row.value[0]);
        }
        for (const auto& [index, value] : changes) {
            params[index] = index == 0 ? FakeParam(static_cast<std::int32_t>(value)) : FakeParam(value);
        }
        return params;
    }

    UltraKeySetup Read(const Params& params, float scale = 1.0F) {
        static_cast<void>(MakeEffect(kMatchName, params));
        const VideoNodeRef effect = GetEffect(AcquireRootNode({kSequence, SegmentsMode::kPlain, ""}, 0), 0);
        RenderParams renderParams;
        renderParams.scaleX = renderParams.scaleY = scale;
        return UltraKeySetup::Read(ParameterReader(*effect, kUltraKeyEffect, 0), renderParams);
    }

    double MatteOf(const Pixel& color, const std::map<std::int32_t, double>& changes) {
        return static_cast<double>(Apply(kMatchName, Settings(kGreen, changes), Plain(2, 2, color)).At(1, 1)[3]);
    }
};

TEST_P(UltraKeyOnEachDevice, TheRecordHoldsWhatTheControlsSay) {
    const UltraKeySetup setup = Read(Settings({0.5, 1, 0, 1}, {{4, 25},
                                                               {5, 11},
                                                               {6, 12},
                                                               {7, 13},
                                                               {8, 14},
                                                               {13, 50},
                                                               {14, 20},
                                                               {17, 75},
                                                               {18, 50},
                                                               {19, 60},
                                                               {20, 70},
                                                               {23, 50},
                                                               {25, 200}}));
    std::array<float, 41> cells{};
    std::memcpy(cells.data(), &setup.record, sizeof setup.record);
    const float expected[] = {1.0F, 0.2F, 0.13F, 0.5F, 2.0F, -0.24F, 0.22F, 1.4F, 1.14F, 0.14F};
    for (std::size_t i = 0; i < 10; ++i) EXPECT_NEAR(cells[i], expected[i], 1e-6F) << i;
    EXPECT_EQ(cells[15], 0.0F);
    // Grey stays grey under any saturation and gains 2 to the 2.2.
    for (const std::size_t luma : {21U, 24U, 27U}) EXPECT_NEAR(cells[luma], std::pow(2.0F, 2.2F), 1e-4F);
    EXPECT_FLOAT_EQ(cells[35], 1.5F);
    EXPECT_FLOAT_EQ(cells[36], 0.2F - 1.5F * 0.2F);
    EXPECT_NEAR(cells[37] * cells[39], 0.47140452F * 0.21404114F - 0.23570225F, 1e-6F);
    EXPECT_NEAR(std::hypot(cells[37], cells[38]) * cells[40], 1.0F, 1e-6F);
    EXPECT_TRUE(setup.finishes);

    const UltraKeyParams black = Read(Settings({0, 0, 0, 1}, {{0, 2}, {4, 100}, {18, 0}})).record;
    EXPECT_FLOAT_EQ(black.transparency, 1.1754943e38F) << "the view of colours keys nothing";
    EXPECT_FLOAT_EQ(black.spillRange, 1.1754943e38F);
    EXPECT_EQ(black.keyChroma[0], 0.0F);
    EXPECT_FLOAT_EQ(black.keyLuma, 1.0e-37F);
    EXPECT_FLOAT_EQ(black.keyInverseLength, 1.0e37F);
    const UltraKeyParams turned = Read(Settings(kGreen, {{24, 360}})).record, still = Read(Settings(kGreen)).record;
    for (std::size_t i = 0; i < 12; ++i) EXPECT_NEAR(turned.output[i], still.output[i], 1e-5F) << "a whole turn";
}

TEST_P(UltraKeyOnEachDevice, StagesRunWhereTheirRadiiSay) {
    struct Row {
        double choke, soften, contrast;
        int output;
        std::vector<std::size_t> counts;  ///< arguments of each kernel
        std::int32_t reach;
        float fraction;  ///< of the last stage
    };
    const Row rows[] = {{0, 0, 1, 0, {9}, 0, 0},
                        {30, 0, 1, 1, {9, 8, 11, 7}, 1, 0.2F},
                        {0, 25, 1, 0, {9, 8, 11, 8, 11}, 0, 1.0F},
                        {10, 60, 0, 2, {9, 8, 11, 8, 11}, 2, 0.4F},
                        {-10, 10, 1, 0, {9, 8, 11}, 0, 0.4F}};
    const VideoFrameRef input = UploadFrame(GetDevice(), GetFormat(), Picture(5, 3));
    for (const Row& row : rows) {
        const RenderNodeRef node = MakeEffect(
            kMatchName, Settings(kGreen, {{0, row.output}, {11, row.choke}, {12, row.soften}, {13, row.contrast}}));
        KernelArguments told;
        VideoFrameRef output;
        EXPECT_EQ(TryRenderOver(node, input, output), Ostrand::kStatus_OK);
        std::vector<std::size_t> counts;
        std::size_t finishing = ~std::size_t{0};
        std::size_t last = 0;
        for (std::size_t i = 0; i < told.kernels.size(); ++i) {
            const KernelArguments::List& list = told.kernels[i];
            counts.push_back(list.Count());
            if (list.Count() == 9 || list.Count() == 11) last = i;
            const bool finishes = (list.Count() == 9 && list.Get<std::int32_t>(6) == 1) ||
                                  (list.Count() == 11 && list.Get<std::int32_t>(8) == 1);
            if (finishes) {
                EXPECT_EQ(finishing, ~std::size_t{0}) << "only once";
                finishing = i;
            }
        }
        EXPECT_EQ(counts, row.counts) << row.choke << ", " << row.soften;
        EXPECT_EQ(finishing, row.contrast > 0 ? last : ~std::size_t{0}) << row.choke << ", " << row.soften;
        if (row.counts.size() < 3 || last == 0) continue;
        EXPECT_EQ(told.kernels[last - 1].Get<std::int32_t>(6), row.reach);
        EXPECT_EQ(told.kernels[last].Get<std::int32_t>(6), row.reach);
        EXPECT_NEAR(told.kernels[last].Get<float>(7), row.fraction, 1e-6F);
    }
    EXPECT_EQ(Read(Settings(kGreen, {{11, 100}}), 2.0F).choke.reachX, 1) << "radii shrink with the picture";
    EXPECT_EQ(Read(Settings(kGreen, {{11, 1e30}})).choke.reachX, 2147483519);
}

TEST_P(UltraKeyOnEachDevice, MattesAreCleanAndNearTheTruth) {
    Random random;
    SCOPED_TRACE(random.GetSeed());
    using Subject = ScreenShot::Subject;
    const Pixel grey = {0.5, 0.5, 0.5, 1}, skin = {0.5, 0.6, 0.82, 1}, brown = {0.08, 0.12, 0.2, 1};
    struct Row {
        const char* name;
        Subject subject;
        Pixel front;
        double noise, clean;          ///< the error of screen and front is no larger than the second
        std::array<double, 2> edges;  ///< largest error there, of even and uneven light; 0 is not for these controls
        std::map<std::int32_t, double> controls;
    };
    const Row rows[] = {{"grey exact", Subject::kMotion, grey, 0, 1e-3, {1e-3, 0}, {{5, 0}, {6, 50}, {8, 0}}},
                        {"hair exact", Subject::kHair, brown, 0, 1e-3, {0.02, 0}, {{5, 0}, {6, 50}, {8, 0}}},
                        {"grey", Subject::kMotion, grey, 0, 1e-3, {0.04, 0.065}, {}},
                        {"glass", Subject::kGlass, {0.7, 0.7, 0.7, 1}, 0.01, 2e-3, {0.05, 0.09}, {}},
                        {"skin", Subject::kMotion, skin, 0, 1e-3, {0.21, 0.23}, {}},
                        {"skin noise", Subject::kDisc, skin, 0.03, 0.03, {0.2, 0.2}, {}},
                        {"red", Subject::kDisc, {0.08, 0.08, 0.8, 1}, 0, 1e-3, {0.24, 0.25}, {}},
                        {"yellow", Subject::kDisc, {0.1, 0.8, 0.85, 1}, 0, 1e-3, {0.27, 0.28}, {}},
                        {"cyan", Subject::kDisc, {0.8, 0.8, 0.1, 1}, 0, 1e-3, {0.22, 0.22}, {}},
                        {"hair", Subject::kHair, brown, 0, 1e-3, {0.21, 0.21}, {}}};
    for (const Pixel& key : {kGreen, kBlue}) {
        for (const Row& row : rows) {
            for (const int uneven : {0, 1}) {
                if (row.edges[uneven] == 0.0) continue;
                const ScreenShot shot = ScreenShot::Make(
                    random, 180, 100, {key, row.subject, row.front, 1 + uneven / 3.0, 1 - uneven / 3.0, row.noise});
                const auto errors = shot.Judge(Apply(kMatchName, Settings(key, row.controls), shot.shot));
                const double slack = IsHalf() ? 0.002 : 0.0;
                EXPECT_LE(std::max(errors[0], errors[1]), row.clean + slack) << row.name << " " << uneven;
                EXPECT_LE(errors[2], row.edges[uneven] + slack) << row.name << " " << uneven;
            }
        }
    }
}

TEST_P(UltraKeyOnEachDevice, ControlsShapeTheMatteAsTheirNamesSay) {
    struct Row {
        const char* name;
        Pixel color;
        std::int32_t index;
        double low, high;  ///< values of the control
        double sign;       ///< of the change of the matte
    };
    const Pixel mixed = {0.45, 0.7, 0.4, 1}, bright = {0.85, 1.0, 0.8, 1}, dark = {0.08, 0.25, 0.05, 1};
    const Row rows[] = {{"transparency", mixed, 4, 30, 70, -1},
                        {"transparency at 0", kGreen, 4, 50, 0, 1},
                        {"highlight", bright, 5, 0, 60, 1},
                        {"shadow", dark, 6, 0, 60, 1},
                        {"tolerance", {0.15, 0.7, 0.55, 1}, 7, 40, 70, -1},
                        {"pedestal", mixed, 8, 0, 40, -1},
                        {"contrast", mixed, 13, 0, 100, 1}};
    for (const Row& row : rows) {
        const double low = MatteOf(row.color, {{row.index, row.low}, {14, 10}});
        const double high = MatteOf(row.color, {{row.index, row.high}, {14, 10}});
        EXPECT_GT((high - low) * row.sign, 0.02) << row.name << " " << low << " to " << high;
    }
    EXPECT_EQ(MatteOf({0.5, 0.5, 0.5, 1}, {{4, 100}, {8, 40}}), 1.0) << "a neutral colour stays";
    EXPECT_LT(MatteOf(kGreen, {}), 1e-3);
}

/// A square in front of a green screen, seen along its middle row: how much of it there is.
TEST_P(UltraKeyOnEachDevice, ChokeAndSoftenReachPartsOfAPixel) {
    Picture square = Plain(41, 41, kGreen);
    for (int y = 10; y <= 30; ++y) {
        for (int x = 10; x <= 30; ++x) square.Set(x, y, {0.5, 0.5, 0.5, 1});
    }
    const double slack = IsHalf() ? 0.02 : 1e-3;
    for (const double percent : {0.0, 5.0, 30.0, 62.5, 100.0}) {
        const double reach = percent / 25.0;
        const Picture choked = Apply(kMatchName, Settings(kGreen, {{11, percent}}), square);
        const Picture softened = Apply(kMatchName, Settings(kGreen, {{12, percent}}), square);
        double chokedWidth = 0.0, softenedWidth = 0.0;
        for (int x = 0; x < 41; ++x) {
            chokedWidth += static_cast<double>(choked.At(x, 20)[3]);
            softenedWidth += static_cast<double>(softened.At(x, 20)[3]);
            // Where the reach ends within a pixel, a trace of the one beyond is left.
            const bool isBeside = x == 9 || x == 31;
            EXPECT_LE(softened.At(x, 20)[3], x >= 10 && x <= 30 ? 1.0F : (isBeside ? 0.06F : 1e-3F)) << x;
        }
        EXPECT_NEAR(chokedWidth, 21.0 - 2.0 * reach, slack) << percent;
        EXPECT_NEAR(softenedWidth, 21.0 - 2.0 * reach, slack) << percent;
    }
}

TEST_P(UltraKeyOnEachDevice, SpillGoesAndOtherColoursKeepTheirBits) {
    const Pixel spilt = {0.55, 0.7, 0.5, 1};
    const auto excess = [&](const std::map<std::int32_t, double>& changes) {
        const Picture out = Apply(kMatchName, Settings(kGreen, changes), Plain(1, 1, spilt));
        return static_cast<double>(out.At(0, 0)[1] - 0.5F * (out.At(0, 0)[0] + out.At(0, 0)[2]));
    };
    EXPECT_NEAR(excess({{19, 0}, {17, 0}}), 0.7 - 0.525, 2e-3);
    EXPECT_LT(std::abs(excess({})), 0.06);
    EXPECT_LT(excess({{19, 100}}), excess({})) << "beyond all of it the opposite shows";
    Random random;
    Picture in = RoundTo(RandomPicture(random, 31, 5), GetFormat());
    for (std::size_t i = 0; i < in.pixels.size(); i += 4) {
        in.pixels[i + 1] = std::max(in.pixels[i], in.pixels[i + 2]) - 0.02F;  // up to nearly yellow and cyan
    }
    in = RoundTo(in, GetFormat());
    EXPECT_TRUE(PicturesAgree(Apply(kMatchName, Settings(kGreen), in), in, kExactly)) << random.GetSeed();
    EXPECT_TRUE(PicturesAgree(Apply(kMatchName, Settings({0.4, 0.4, 0.4, 1}, {{4, 100}}), in), in, kExactly));
    Picture view = in;
    for (std::size_t i = 0; i < in.pixels.size(); ++i) view.pixels[i] = i % 4 == 3 ? 1.0F : in.pixels[i / 4 * 4 + 3];
    EXPECT_TRUE(PicturesAgree(Apply(kMatchName, Settings(kGreen, {{0, 1}}), in), view, kExactly));
}

TEST_P(UltraKeyOnEachDevice, StrangeInputGivesNumbers) {
    const float infinity = std::numeric_limits<float>::infinity();
    Picture in = Plain(37, 5, {0.3, 0.6, 0.2, 1});
    const float values[] = {infinity, -infinity, 60000.0F, -60000.0F, 0.0F, 1e-30F};
    for (int i = 0; i < 30; ++i) in.At(i, 2)[i % 5 % 4] = i % 5 == 3 ? std::abs(values[i % 6]) : values[i % 6];
    in.At(36, 4)[1] = NAN;
    for (const double extreme : {-1e9, -50.0, 0.0, 100.0, 250.0, 1e9}) {
        for (const ParameterRow& row : kUltraKeyParameters) {
            if (row.type != ParameterType::kDouble) continue;
            const Picture out = Apply(kMatchName, Settings(kGreen, {{11, 20}, {12, 10}, {row.index, extreme}}), in);
            for (std::size_t i = 3; i < out.pixels.size(); i += 4) {
                ASSERT_FALSE(std::isnan(out.pixels[i])) << row.name << " " << extreme << ", pixel " << i / 4;
            }
        }
    }
    EXPECT_TRUE(std::isnan(Apply(kMatchName, Settings(kGreen), in).At(36, 4)[1]));
}

TEST_P(UltraKeyOnEachDevice, EachOfTwoInARowReadsItsOwnRecord) {
    Random random;
    const Picture in = RoundTo(RandomOpaquePicture(random, 70, 20), GetFormat());
    const VideoFrameRef input = UploadFrame(GetDevice(), GetFormat(), in);
    const VideoFrameRef first = RenderOver(MakeEffect(kMatchName, Settings(kGreen)), input);
    const VideoFrameRef second = RenderOver(MakeEffect(kMatchName, Settings(kBlue)), first);
    const Picture apart = Apply(kMatchName, Settings(kBlue), Apply(kMatchName, Settings(kGreen), in));
    EXPECT_TRUE(PicturesAgree(DownloadFrame(GetDevice(), second), apart, kExactly)) << random.GetSeed();
}

TEST_P(UltraKeyOnEachDevice, RefusedMemoryIsToldAndTheNextTrySucceeds) {
    const VideoFrameRef input = UploadFrame(GetDevice(), GetFormat(), Plain(16, 16, kGreen));
    const RenderNodeRef node = MakeEffect(kMatchName, Settings(kGreen, {{11, 20}}));
    VideoFrameRef output;
    // The frame, on OpenCL the record, the filters' buffer: each once refused in both tries.
    const int allocations = GetDevice()->GetFramework() == Kiln::DeviceFramework::kOpenCL ? 3 : 2;
    for (int refused = 0; refused < allocations; ++refused) {
        int count = 0;
        GetDevice()->GetDeviceMemory()->SetAllocationFilter([&](std::uint64_t) {
            if (count++ < refused) return false;
            count = 0;
            return true;
        });
        EXPECT_EQ(TryRenderOver(node, input, output), Ostrand::kStatus_OutOfMemory) << refused;
        EXPECT_FALSE(output);
    }
    GetDevice()->GetDeviceMemory()->SetAllocationFilter({});
    EXPECT_EQ(TryRenderOver(node, input, output), Ostrand::kStatus_OK);
    EXPECT_LT(DownloadFrame(GetDevice(), output).At(5, 5)[3], 1e-3F);
}

INSTANTIATE_TEST_SUITE_P(Devices, UltraKeyOnEachDevice, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
