// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/PointwiseFilterHostNode.h"

#include <cmath>

#include <boost/make_shared.hpp>

#include "Src/Nodes/NodeRegistry.h"
#include "Src/VideoNodes/VideoNodeFactory.h"
#include "Tests/Effects/EffectTester.h"
#include "Tests/Effects/KernelArguments.h"
#include "Vantrel/Effects/FastColorCorrector.h"

namespace Vantrel::Testing {
namespace {

using Words = std::array<std::uint16_t, 4>;

/// An effect with parameters.
struct Link {
    const char* matchName;
    std::map<std::int32_t, FakeParam> params;
};

class PointwiseFilters : public EffectTest {
protected:
    static constexpr std::int64_t kFrameTicks = 10;

    /// The clip's effect at a place of its list.
    RenderNodeRef MakeLink(std::uint32_t place, const Link& link) {
        const std::uint32_t id = kEffect + place;
        host.nodes[id].kind = "Effect";
        host.nodes[id].properties["EffectNode::FilterMatchName"] = link.matchName;
        host.nodes[id].params = link.params;
        std::vector<std::uint32_t>& operators = host.nodes[kClip].operators;
        if (operators.size() <= place) operators.resize(place + 1, id);
        const VideoSegmentsHandle handle(kSequence, SegmentsMode::kPlain, "");
        return MakeNode(link.matchName, GetEffect(AcquireRootNode(handle, 0), place));
    }

    /// The links over a frame, the first one lowest. @return from the lowest to the top
    std::vector<RenderNodeRef> MakeChain(const std::vector<Link>& links, const VideoFrameRef& input) {
        std::vector<RenderNodeRef> nodes;
        for (std::uint32_t i = 0; i < links.size(); ++i) {
            nodes.push_back(MakeLink(i, links[i]));
            nodes.back()->SetInput(0, i == 0 ? RenderNodeRef(new FrameSource(input)) : nodes[i - 1]);
        }
        return nodes;
    }

    VideoFrameRef Render(const RenderNodeRef& top, const VideoFrameRef& input) {
        RenderParams params;
        params.time = params.clipTime = 7 * kFrameTicks;
        params.frameTicks = kFrameTicks;
        params.outputRect = params.sequenceRect = input->GetBounds();
        const auto results = boost::make_shared<RenderResults>();
        VideoFrameRef output;
        EXPECT_EQ(top->RenderFrame({}, params, results, output), Ostrand::kStatus_OK);
        top->EndFrame({}, params, results, 0);
        return output;
    }

    Picture RunChain(const std::vector<Link>& links, const Picture& picture) {
        constexpr int kSparePixels = 3;
        const VideoFrameRef input = MakePaddedFrame(GetDevice(), GetFormat(), picture, kSparePixels);
        return DownloadFrame(GetDevice(), Render(MakeChain(links, input).back(), input));
    }
};

PointwiseFilterRecord MakeRecord(int type, const std::vector<float>& values) {
    PointwiseFilterRecord record{};
    record.type = type;
    if (!values.empty()) std::memcpy(&record.r1, values.data(), values.size() * sizeof(float));
    return record;
}

TEST_P(PointwiseFilters, RecordsHoldEachParameterAtItsPlace) {
    const float pi = 3.14159274F;
    const auto corrector = [](std::int32_t output, bool split, std::int32_t layout) {
        std::map<std::int32_t, double> values = {{3, 40},  {6, 180}, {7, 30},   {8, 60},  {9, 60},  {11, 45},
                                                 {21, 51}, {22, 2},  {23, 204}, {24, 10}, {25, 250}};
        values[0] = output, values[1] = split, values[2] = layout;
        return Link{"TQ.XQVE Fast Color Corrector", MakeParams(kFastColorCorrectorEffect, values)};
    };
    const float turn = 1.04719758F;  // 60 degrees
    const auto corrected = [pi, turn](int type, float split) {
        const float direction = std::atan2(std::sin(turn) * 0.3F * 0.5F, std::cos(turn) * 0.3F * 0.5F);
        return MakeRecord(type,
                          {204.0F / 255.0F, 51.0F / 255.0F, 250.0F / 255.0F, 10.0F / 255.0F, 0.5F, 45.0F * 0.01F, -pi,
                           std::cos(-direction) * 0.70710677F, std::sin(-direction) * 0.70710677F, 0.6F * 0.3F, split});
    };
    const Words first{16320, 32640, 65280, 1}, second{65280, 0, 8160, 2};
    const auto procAmp = [](bool split) {
        return Link{"TQ.XQVE ProcAmp", {{0, 10.0F}, {1, 150.0F}, {2, 60.0F}, {3, 80.0F}, {4, split}, {5, 30.0F}}};
    };
    RenderParams params;
    params.clipTime = 10 * kFrameTicks + 9;
    params.frameTicks = kFrameTicks;
    const auto check = [&](const Link& link, const PointwiseFilterRecord& expected) {
        const auto node = Ostrand::Query<FilterNode>(MakeLink(0, link));
        PointwiseFilterRecord record{};
        bool needsNewFrame = false;
        FillPointwiseFilterRecord(*node, params, record, needsNewFrame);
        EXPECT_EQ(std::memcmp(&record, &expected, sizeof record), 0)
            << link.matchName << ": " << testing::PrintToString(std::vector<float>(&record.r1, &record.r1 + 11));
        EXPECT_EQ(needsNewFrame, record.type == 12 || record.type == 16);
    };
    for (const int set : {1, 2, 3}) {
        check({"TQ.XQVE Alpha Adjust", {{0, 50.0F}, {1, set == 1}, {2, set == 2}, {3, set == 3}}},
              MakeRecord(0, {0.5F, set == 1 ? 1.0F : 0.0F, set == 2 ? 1.0F : 0.0F, set == 3 ? 1.0F : 0.0F}));
    }
    check({"KL.XQVE Black & White", {}}, MakeRecord(1, {}));
    check({"TQ.XQVE Brightness & Contrast 2", {{0, 0.0F}, {1, 0.0F}}}, MakeRecord(2, {1, 1, 0, 1, 0, 1}));
    check({"TQ.XQVE Brightness & Contrast 2", {{0, 0.0F}, {1, 100.0F}}}, MakeRecord(2, {0, 0, 0.5F, 0.5F, 0, 1}));
    check({"TQ.XQVE Brightness & Contrast 2", {{0, 255.0F}, {1, -100.0F}}}, MakeRecord(2, {1, 0, 0, 1, 1.5F, 1.5F}));
    check({"KL.XQVE Color Balance", {{0, 30}, {1, 60}, {2, 90}}},
          MakeRecord(3, {90 / 255.0F, 60 / 255.0F, 30 / 255.0F}));
    check({"KL.XQVE Color Pass", {{0, 20}, {1, 5}, {2, first}}}, MakeRecord(4, {1, 20 / 127.0F, 0.25F, 0.5F, 1}));
    check({"KL.XQVE Color Replace", {{0, 127}, {1, 0}, {2, first}, {3, second}}},
          MakeRecord(5, {0, 1, 0.25F, 0.5F, 1, 1, 0, 0.125F}));
    check({"KL.XQVE Edge Feather", {{0, 30}}}, MakeRecord(6, {40.5F}));
    check({"KL.XQVE Extract", {{0, 30}, {1, 60}, {2, 90}, {3, true}}},
          MakeRecord(7, {1, 30 / 255.0F, 60 / 255.0F, 90 / 255.0F}));
    check(corrector(0, false, 0), corrected(8, 1.0F));
    check(corrector(3, true, 1), corrected(8, 0.4F));
    check(corrector(1, true, 0), corrected(9, -0.4F));
    check(corrector(2, true, 2), corrected(10, -0.4F));
    check({"KL.XQVE Gamma Correction", {{0, 25}}}, MakeRecord(11, {2.5F}));
    check({"KL.XQVE Horizontal Flip", {}}, MakeRecord(12, {}));
    check({"TQ.XQVE Noise", {{0, 50.0F}, {1, false}, {2, true}}}, MakeRecord(13, {0.5F, 0, 1, 10}));
    check(procAmp(false), MakeRecord(14, {0.1F, 1.5F, std::cos(turn) * 0.8F, std::sin(turn) * 0.8F, 1}));
    check(procAmp(true), MakeRecord(14, {0.1F, 1.5F, std::cos(turn) * 0.8F, std::sin(turn) * 0.8F, 0.3F}));
    check({"TQ.XQVE Tint", {{0, first}, {1, second}, {2, 25.0F}}},
          MakeRecord(15, {0.25F, 0.5F, 1, 1, 0, 0.125F, 0.25F}));
    check({"KL.XQVE Vertical Flip", {}}, MakeRecord(16, {}));
    check({"TQ.XQVE Invert", {}}, MakeRecord(0, {}));
}

TEST_P(PointwiseFilters, UpToFourInARowAreOneLaunch) {
    const Link half{"KL.XQVE Color Balance", {{0, 510}, {1, 255}, {2, 255}}};
    const Link invert{"TQ.XQVE Invert", {{0, 0}, {1, 0.0F}}};
    const Link flip{"KL.XQVE Vertical Flip", {}};
    const struct {
        std::vector<Link> links;
        std::vector<std::size_t> arguments;  ///< of each launch
        bool inPlace;
    } rows[] = {{{half}, {8}, true},
                {{half, half}, {9}, true},
                {{half, half, half}, {10}, true},
                {{half, half, half, half}, {11}, true},
                {{half, half, half, half, half}, {8, 11}, true},
                {{half, invert, half, half}, {8, 9, 9}, false},
                {{half, flip, half}, {10}, false},
                {{flip, half, half, half, half}, {8, 11}, false}};
    for (const auto& row : rows) {
        const VideoFrameRef input = UploadFrame(GetDevice(), GetFormat(), Plain(5, 3, {0.5, 0.5, 0.125, 1}));
        input->SetOrigin({3, -4});
        const std::vector<RenderNodeRef> nodes = MakeChain(row.links, input);
        KernelArguments told;
        const VideoFrameRef output = Render(nodes.back(), input);
        ASSERT_EQ(told.kernels.size(), row.arguments.size()) << row.links.size();
        for (std::size_t i = 0; i < told.kernels.size(); ++i) EXPECT_EQ(told.kernels[i].Count(), row.arguments[i]);
        EXPECT_EQ(output == input, row.inPlace);
        EXPECT_EQ(output->GetOrigin(), (Vellum::Point{3, -4}));
        for (const RenderNodeRef& node : nodes) EXPECT_TRUE(Ostrand::Query<FilterNode>(node)->IsCaching());
        if (row.inPlace) {
            const float gain = std::exp2(static_cast<float>(row.links.size()));
            EXPECT_EQ(DownloadFrame(GetDevice(), output).At(4, 2)[2], 0.125F * gain) << "each filter ran once";
        }
    }
}

/// All filters with settings that show, gentle enough for the rounding of halves between them.
std::vector<Link> AllLinks() {
    const Words red{8160, 8160, 65280, 65280}, blue{65280, 16320, 0, 65280};
    const std::map<std::int32_t, double> corrections = {{1, 1},   {3, 40}, {6, 30},   {7, 40},   {8, 50},  {9, 70},
                                                        {11, 80}, {21, 0}, {22, 1.2}, {23, 230}, {24, 10}, {25, 250}};
    return {{"TQ.XQVE Alpha Adjust", {{0, 60.0F}, {1, false}, {2, true}, {3, false}}},
            {"KL.XQVE Black & White", {}},
            {"TQ.XQVE Brightness & Contrast 2", {{0, 25.0F}, {1, 20.0F}}},
            {"KL.XQVE Color Balance", {{0, 200}, {1, 300}, {2, 100}}},
            {"KL.XQVE Color Pass", {{0, 60}, {1, 0}, {2, red}}},
            {"KL.XQVE Color Replace", {{0, 60}, {1, 0}, {2, red}, {3, blue}}},
            {"KL.XQVE Edge Feather", {{0, 6}}},
            {"KL.XQVE Extract", {{0, 100}, {1, 150}, {2, 200}, {3, false}}},
            {"TQ.XQVE Fast Color Corrector", MakeParams(kFastColorCorrectorEffect, corrections)},
            {"KL.XQVE Gamma Correction", {{0, 8}}},
            {"KL.XQVE Horizontal Flip", {}},
            {"TQ.XQVE Noise", {{0, 30.0F}, {1, true}, {2, false}}},
            {"TQ.XQVE ProcAmp", {{0, 5.0F}, {1, 110.0F}, {2, 20.0F}, {3, 90.0F}, {4, true}, {5, 30.0F}}},
            {"TQ.XQVE Tint", {{0, red}, {1, blue}, {2, 40.0F}}},
            {"KL.XQVE Vertical Flip", {}}};
}

TEST_P(PointwiseFilters, AChainIsItsFiltersOneByOne) {
    Random random;
    const std::vector<Link> all = AllLinks();
    for (int i = 0; i < 60; ++i) {
        const Picture picture = RoundTo(RandomPicture(random, random.Int(1, 150), random.Int(1, 9)), GetFormat());
        std::vector<Link> links;
        std::string names;
        for (int left = random.Int(2, 5); left > 0; --left) {
            // Every filter comes first in some chain.
            const int next = links.empty() ? i % static_cast<int>(all.size()) : random.Int(0, 14);
            links.push_back(all[static_cast<std::size_t>(next)]);
            names += std::string(links.back().matchName) + "; ";
        }
        Picture oneByOne = picture;
        for (const Link& link : links) oneByOne = RunChain({link}, oneByOne);
        // The filters one by one round to halves in between, which the edges of a colour key stretch.
        const Tolerance tolerance = IsHalf() ? Tolerance{4e-2, 4e-3} : Tolerance{4e-6, 1e-5};
        EXPECT_TRUE(PicturesAgree(RunChain(links, picture), oneByOne, tolerance)) << names << picture.width;
    }
}

INSTANTIATE_TEST_SUITE_P(Devices, PointwiseFilters, ::testing::ValuesIn(AllDeviceCases()), NameOfCase);

}  // namespace
}  // namespace Vantrel::Testing
