// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// The stabilizer with the plug-in that lies beside the engine: tracks in, pictures out.
#include <cmath>
#include <cstdlib>
#include <limits>
#include <sstream>

#include "Src/Filters/Effects/StabilizerWarpNode.h"
#include "Src/Nodes/NodeRegistry.h"
#include "Tests/Effects/EffectTester.h"
#include "Tests/Effects/KernelArguments.h"
#include "Vantrel/Effects/Stabilizer.h"

namespace Vantrel::Testing {
namespace {

constexpr std::int64_t kTicks = 10160640000;  // of a frame
constexpr std::int32_t kInstance = 7, kFirst = 10;

struct Shake {
    double x, y, degrees;
};
using Shakes = std::vector<Shake>;
using Place = std::array<double, 2>;
/// Their mean stands still.
const Shakes kShakes = {{0, 0, 0}, {6, -3, 0}, {-6, 3, 0}, {2.5, 1.25, 4}, {-2.5, -1.25, -4}};

/// A place of the scene in a frame of that size.
Place ToFrame(const Shake& shake, const Place& p, const Picture& frame) {
    const double angle = shake.degrees * std::acos(-1.0) / 180.0, c = std::cos(angle), s = std::sin(angle);
    const double x = p[0] - frame.width / 2.0, y = p[1] - frame.height / 2.0;
    return {c * x - s * y + shake.x + frame.width / 2.0, s * x + c * y + shake.y + frame.height / 2.0};
}

/// A premultiplied sample under tents of a half width; beyond the border the border's pixels go on.
Pixel Sample(const Picture& picture, const Place& at, double tent) {
    Pixel sum{};
    double total = 0.0;
    for (int y = static_cast<int>(std::floor(at[1] - tent)); y <= at[1] + tent; ++y) {
        for (int x = static_cast<int>(std::floor(at[0] - tent)); x <= at[0] + tent; ++x) {
            const double weight = std::max(1.0 - std::abs(x + 0.5 - at[0]) / tent, 0.0) *
                                  std::max(1.0 - std::abs(y + 0.5 - at[1]) / tent, 0.0);
            const Pixel p = picture.Get(std::clamp(x, 0, picture.width - 1), std::clamp(y, 0, picture.height - 1));
            for (std::size_t c = 0; c < 4; ++c) sum[c] += weight * (c < 3 ? p[c] * p[3] : p[3]);
            total += weight;
        }
    }
    for (double& value : sum) value /= total;
    return sum;
}

/// The scene as it is told from a frame, magnified about its middle.
Picture Steady(const Picture& frame, const Shake& shake, int width, int height, double scale,
               const Vellum::Rect& window) {
    Picture result(width, height);
    const double apart = 1.0 / scale, tent = std::max(apart - 0.5, 1.0);
    for (int y = window.top; y < window.bottom; ++y) {
        for (int x = window.left; x < window.right; ++x) {
            const Place place = ToFrame(shake,
                                        {(x + 0.5 - width / 2.0) * apart + frame.width / 2.0,
                                         (y + 0.5 - height / 2.0) * apart + frame.height / 2.0},
                                        frame);
            const auto share = [apart](double at, double size) {
                return std::clamp(std::min(at / apart, 0.5) + std::min((size - at) / apart, 0.5), 0.0, 1.0);
            };
            const double coverage = share(place[0], frame.width) * share(place[1], frame.height);
            if (coverage <= 0.0) continue;
            const Pixel sum = Sample(
                frame, {std::clamp(place[0], 0.0, 1.0 * frame.width), std::clamp(place[1], 0.0, 1.0 * frame.height)},
                tent);
            if (sum[3] < 1e-5) continue;
            result.Set(x, y, {sum[0] / sum[3], sum[1] / sum[3], sum[2] / sum[3], sum[3] * coverage});
        }
    }
    return result;
}

class Stabilizer : public EffectTest {
protected:
    using Overrides = std::map<std::int32_t, double>;

    Stabilizer() {
        host.nodes[kEffect].properties["EffectNode::RuntimeInstanceID"] = std::to_string(kInstance);
        host.nodes[kMedia].properties["MediaNode::StreamFrameRate"] = std::to_string(kTicks);
        Analyse(96, 54, kShakes);
    }

    /// Makes the clip, its analysis and its use of all frames of it.
    void Analyse(int width, int height, const Shakes& shakes) {
        std::ostringstream track;
        track << "motion-track 1\nframe " << width << ' ' << height << "\nfirst " << kFirst
              << "\nsmooth 0\ncell 20\nmotion\n";
        for (const Shake& shake : shakes) track << shake.x << ' ' << shake.y << ' ' << shake.degrees << " 1\n";
        mTrack = track.str();
        host.opaqueData[kInstance] = mTrack.data();
        mFrameRect = {0, 0, width, height};
        SetRange(kFirst, kFirst + static_cast<std::int64_t>(shakes.size()));
    }
    /// The frames of the media that the clip shows.
    void SetRange(std::int64_t first, std::int64_t end) {
        host.nodes[kMedia].properties["MediaNode::InPointMediaTimeAsTicks"] = std::to_string(first * kTicks);
        host.nodes[kMedia].properties["MediaNode::OutPointMediaTimeAsTicks"] = std::to_string(end * kTicks);
    }
    /// Empty where Configure refuses.
    [[nodiscard]] RenderNodeRef MakeNode(const Overrides& settings = {}) {
        const VideoNodeRef description =
            DescribeEffect(kStabilizerEffect.matchName, MakeParams(kStabilizerEffect, settings));
        const RenderNodeRef node(new StabilizerWarpNode);
        return Configure(node, description, mFrameRect) ? node : RenderNodeRef();
    }
    /// Frame `index` of the track, at full size or reduced by `scale`.
    Status TryRender(const RenderNodeRef& node, int index, const Picture& in, VideoFrameRef& output,
                     float scale = 1.0F) {
        const VideoFrameRef input = MakePaddedFrame(GetDevice(), GetFormat(), in, 3);
        RenderParams params = MakeRequest(input, (kFirst + index) * kTicks);
        params.sequenceFrameTicks = params.frameTicks = kTicks;
        params.outputRect = params.sequenceRect = mFrameRect;
        params.scaleX = params.scaleY = scale;
        return EffectTest::TryRender(node, input, params, output);
    }
    [[nodiscard]] StabilizerData ReadData() {
        StabilizerData data;
        EXPECT_TRUE(data.Read(FindStabilizer(), mTrack.data()));
        return data;
    }

    std::string mTrack;
    Vellum::Rect mFrameRect;
};

TEST_P(Stabilizer, AgreesWithAScalarOneOnTheSceneBehindEachFrame) {
    EXPECT_TRUE(isRegistered(u"TQ.XQVE SubspaceStabilizer", GetDevice()));
    Random random;
    for (int i = 0; i < 24; ++i) {
        Analyse(random.Int(40, 120), random.Int(30, 70), kShakes);
        const int index = random.Int(0, 4), framing = i % 3;
        const double extra = random.Chance(0.3F) ? 1.0 : random.Uniform(0.4F, 2.0F);
        const Picture in = RoundTo(RandomPicture(random, mFrameRect.Width(), mFrameRect.Height()), GetFormat());
        const StabilizerData data = ReadData();
        int width = in.width, height = in.height;
        double scale = extra;
        Vellum::Rect window;
        if (framing == kStabilizerFraming_Whole) {
            width = static_cast<int>(data.sourceRight - data.sourceLeft);
            height = static_cast<int>(data.sourceBottom - data.sourceTop);
            window = {0, 0, width, height};
        } else {
            const double need = std::max((in.width + 1.0) / data.windowWidth, (in.height + 1.0) / data.windowHeight);
            if (framing == kStabilizerFraming_CropAndScale) scale *= std::min(need, 1.25);
            const auto inner = [scale](int size, int part, std::int32_t& from, std::int32_t& to) {
                from = std::max(0, static_cast<int>(std::ceil((size - part * scale) / 2.0)));
                to = std::min(static_cast<int>(part * scale) + from, size);
            };
            inner(in.width, data.windowWidth, window.left, window.right);
            inner(in.height, data.windowHeight, window.top, window.bottom);
        }
        VideoFrameRef output;
        const RenderNodeRef node = MakeNode({{kStabilizer_Framing, framing},
                                             {kStabilizer_LargestScale, 125.0},
                                             {kStabilizer_ExtraScale, extra * 100.0}});
        ASSERT_TRUE(node);
        ASSERT_EQ(TryRender(node, index, in, output), Ostrand::kStatus_OK);
        EXPECT_EQ(output->GetOrigin(), (Vellum::Point{(width - in.width) / 2, (height - in.height) / 2}));
        const Shake& shake = kShakes[static_cast<std::size_t>(index)];
        EXPECT_TRUE(PicturesAgree(DownloadFrame(GetDevice(), output), Steady(in, shake, width, height, scale, window),
                                  {IsHalf() ? 3e-3 : 2e-4, IsHalf() ? 2e-3 : 0.0, true}))
            << in.width << " by " << in.height << ", frame " << index << ", framing " << framing << ", extra " << extra;
    }
}

TEST_P(Stabilizer, TheWindowIsTheLargestThatEveryFrameCovers) {
    const StabilizerData data = ReadData();
    const Picture in = Plain(mFrameRect.Width(), mFrameRect.Height(), {0.5, 0.5, 0.5, 1.0});
    const auto isCovered = [&](double width, double height) {
        bool covered = true;
        for (const Shake& shake : kShakes) {
            for (const double x : {-0.5, 0.5}) {
                for (const double y : {-0.5, 0.5}) {
                    const Place p = ToFrame(shake, {in.width / 2.0 + x * width, in.height / 2.0 + y * height}, in);
                    covered &= p[0] >= 0.0 && p[0] <= in.width && p[1] >= 0.0 && p[1] <= in.height;
                }
            }
        }
        return covered;
    };
    EXPECT_TRUE(isCovered(data.windowWidth, data.windowHeight));
    EXPECT_FALSE(isCovered(data.windowWidth + 2, data.windowHeight + 2));
}

TEST_P(Stabilizer, RefusesWhatTheAnalysisDoesntFit) {
    const auto clip = [this](const char* key) -> std::string& { return host.nodes[kClip].properties[key]; };
    EXPECT_TRUE(MakeNode());
    SetRange(kFirst - 1, kFirst + 3);
    EXPECT_FALSE(MakeNode()) << "begins before it";
    SetRange(kFirst + 1, kFirst + 6);
    EXPECT_FALSE(MakeNode()) << "ends behind it";
    SetRange(kFirst + 1, kFirst + 4);
    clip("ClipNode::EffectiveTrackItemEndAsTicks") = std::to_string(2 * kTicks);
    EXPECT_FALSE(MakeNode()) << "a transition makes it longer";
    clip("ClipNode::TrackItemEndAsTicks") = std::to_string(kTicks);
    EXPECT_TRUE(MakeNode());
    clip("ClipNode::ClipSpeed") = "1.0000001";
    EXPECT_FALSE(MakeNode());
    clip("ClipNode::ClipSpeed") = "1";
    host.nodes[kMedia].properties["MediaNode::StreamFieldType"] = "2";
    EXPECT_FALSE(MakeNode()) << "the analysis counts fields then";
    SetRange(kFirst / 2, kFirst / 2 + 1);
    EXPECT_TRUE(MakeNode());
    host.nodes[kMedia].properties["MediaNode::StreamFieldType"] = "0";
    SetRange(kFirst, kFirst + 4);
    mFrameRect.right += 1;
    EXPECT_FALSE(MakeNode()) << "another size";
    mFrameRect.right -= 1;
    mTrack = "motion-track 1\nframe 96 54\nfirst 10\nsmooth 0\ncell 20\nmotion\n1 2 three 4\n";
    host.opaqueData[kInstance] = mTrack.data();
    EXPECT_FALSE(MakeNode()) << "no track";
    host.opaqueData.clear();
    EXPECT_FALSE(MakeNode()) << "nothing analysed";
}

TEST_P(Stabilizer, WithoutAMeshAFrameFails) {
    const RenderNodeRef node = MakeNode();
    const Picture in = Plain(mFrameRect.Width(), mFrameRect.Height(), {0, 0, 0, 1});
    VideoFrameRef output;
    EXPECT_EQ(TryRender(node, -1, in, output), Ostrand::kStatus_Failure);
    EXPECT_EQ(TryRender(node, 5, in, output), Ostrand::kStatus_Failure);
    EXPECT_EQ(TryRender(node, 4, in, output), Ostrand::kStatus_OK);
}

TEST_P(Stabilizer, PutsWhatItWorksOutIntoItsKernelsList) {
    const StabilizerData data = ReadData();
    const Picture half = Plain(48, 27, {0.5, 0.5, 0.5, 1.0});
    VideoFrameRef output;
    KernelArguments heard;
    const auto render = [&](double framing) {
        const RenderNodeRef node = MakeNode({{kStabilizer_Framing, framing}, {kStabilizer_ExtraScale, 110.0}});
        EXPECT_EQ(TryRender(node, 1, half, output, 2.0F), Ostrand::kStatus_OK);
        return heard.kernels.back();
    };
    const auto cropped = render(kStabilizerFraming_Crop);
    ASSERT_EQ(cropped.Count(), 19U);
    const std::int32_t numbers[][2] = {{1, IsHalf() ? 0 : 1}, {3, 48}, {4, 27}, {6, 48}, {7, 27}, {9, data.meshWidth},
                                       {10, data.meshHeight}, {13, 1}};
    for (const auto& [index, value] : numbers) {
        EXPECT_EQ(cropped.Get<std::int32_t>(static_cast<std::size_t>(index)), value) << index;
    }
    EXPECT_EQ(cropped.Get<Kiln::float4>(11),
              (Kiln::float4{data.sourceLeft / 2, data.sourceTop / 2, data.sourceRight / 2, data.sourceBottom / 2}));
    const auto window = cropped.Get<Kiln::float4>(12);
    EXPECT_EQ(window.z - window.x, static_cast<float>(data.windowWidth) / 2);
    EXPECT_EQ(window.x + window.z, static_cast<float>(data.sourceRight - data.sourceLeft) / 2);
    const auto whole = render(kStabilizerFraming_Whole);
    const float rectWidth = std::ceil((data.sourceRight - data.sourceLeft) / 2);
    EXPECT_EQ(whole.Get<std::int32_t>(3), static_cast<int>(rectWidth));
    EXPECT_EQ(whole.Get<Kiln::float4>(12).z, rectWidth - 1);
    for (std::size_t i = 13; i < 18; ++i) EXPECT_EQ(whole.Get<std::int32_t>(i), 0) << i;
}

TEST_P(Stabilizer, BadNumbersDoNoHarm) {
    const double nan = std::numeric_limits<double>::quiet_NaN(), infinity = std::numeric_limits<double>::infinity();
    Random random;
    const Picture in = RandomPicture(random, mFrameRect.Width(), mFrameRect.Height());
    for (const double bad : {nan, infinity, -infinity, 0.0, -100.0, 1e-30, 1e9}) {
        for (const std::int32_t index : {kStabilizer_LargestScale, kStabilizer_Margin, kStabilizer_ExtraScale}) {
            const RenderNodeRef node = MakeNode({{index, bad}});
            VideoFrameRef output;
            ASSERT_EQ(TryRender(node, 3, in, output), Ostrand::kStatus_OK);
            for (const float value : DownloadFrame(GetDevice(), output).pixels) ASSERT_TRUE(std::isfinite(value));
        }
    }
}

INSTANTIATE_TEST_SUITE_P(Devices, Stabilizer, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

class WithoutThePlugInDeathTest : public Stabilizer {};

TEST_P(WithoutThePlugInDeathTest, TheEffectIsRefused) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    const auto exit = [this] {
        setenv("VANTREL_PLUGINS", "/nowhere", 1);
        std::_Exit(MakeNode() ? 1 : 0);
    };
    EXPECT_EXIT(exit(), ::testing::ExitedWithCode(0), "");
}

INSTANTIATE_TEST_SUITE_P(Devices, WithoutThePlugInDeathTest, ::testing::Values(AllDeviceCases().front()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
