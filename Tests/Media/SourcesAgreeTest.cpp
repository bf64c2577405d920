// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// The sources of the media's chain against plain arithmetic, over random sizes and pictures.
#include "Host/Software/Effects/Dissolves.h"
#include "Host/Software/Effects/FrameRepairs.h"
#include "Host/Software/Effects/Resample.h"
#include "Src/Filters/Source/FieldReverseSource.h"
#include "Src/Filters/Source/InvertAlphaSource.h"
#include "Src/Filters/Source/RemoveFlickerSource.h"
#include "Src/Filters/Source/ScaleSource.h"
#include "Src/Filters/Source/TimeSampleSource.h"
#include "Tests/Media/MediaDeviceTester.h"

namespace Vantrel::Testing {
namespace {

class SourcesAgree : public MediaDeviceTest {
protected:
    /// Half a step of a 16-bit float at 2, or a few of a 32-bit one.
    [[nodiscard]] Tolerance Arithmetic() const {
        return {WorkingFormat() == Kiln::kPixelFormat_GPU_BGRA_4444_16f ? 2e-3 : 1e-5, 0.0, true};
    }
    [[nodiscard]] Picture Rounded(const Picture& picture) const { return RoundTo(picture, WorkingFormat()); }
    /// What a source makes of pictures, one for each time that it asks for.
    template <class Source>
    Picture Through(const std::function<Picture(std::int64_t)>& pictureAt) {
        const FrameLeafRef leaf(new FrameLeaf(VideoFrameRef()));
        leaf->answer = [&] {
            leaf->frame = Frame(pictureAt(leaf->lastParams.clipTime));
            return Ostrand::kStatus_OK;
        };
        const auto source = script.Make<Source>(MediaScript::Media(), GetDevice());
        source->SetInput(0, RenderNodeRef(leaf.Get()));
        NewRequest();
        const VideoFrameRef frame = Render(*source);
        return frame ? Download(frame) : Picture();
    }
    template <class Source>
    Picture Through(const Picture& picture) {
        return Through<Source>([&](std::int64_t) { return picture; });
    }
    Picture RandomSize(int least = 1) {
        return Rounded(RandomPicture(random, random.Int(least, 150), random.Int(least, 70)));
    }

    Random random;
};

INSTANTIATE_TEST_SUITE_P(OnEachDevice, SourcesAgree, testing::ValuesIn(AllDeviceCases()), NameOfCase);

TEST_P(SourcesAgree, LinesAndAlphaChangeAsTheReferenceSays) {
    for (int round = 0; round < 12; ++round) {
        const Picture in = RandomSize();
        Picture expected = in;
        Host::Software::ReverseFields(expected);
        EXPECT_TRUE(PicturesAgree(Through<FieldReverseSource>(in), expected, kExactly)) << round;
        expected = in;
        for (std::size_t i = 3; i < expected.pixels.size(); i += 4) expected.pixels[i] = 1.0F - expected.pixels[i];
        EXPECT_TRUE(PicturesAgree(Through<InvertAlphaSource>(in), Rounded(expected), Arithmetic())) << round;
        EXPECT_TRUE(
            PicturesAgree(Through<RemoveFlickerSource>(in), Rounded(Host::Software::SoftenLines(in)), Arithmetic()))
            << round;
    }
}

TEST_P(SourcesAgree, FlickerRemovalLeavesFlatFieldsToTheBit) {
    for (int round = 0; round < 12; ++round) {
        const float alpha = random.Uniform(0.01F, 1.0F);
        const Picture flat = Rounded(
            Plain(random.Int(1, 90), random.Int(1, 40),
                  {random.Uniform(-1, 2), random.Uniform(-1, 2), random.Uniform(0, 1), round % 3 == 0 ? 1.0 : alpha}));
        EXPECT_TRUE(PicturesAgree(Through<RemoveFlickerSource>(flat), flat, kExactly)) << round;
    }
}

TEST_P(SourcesAgree, SamplesAreSummedByTheirShareInTheOutput) {
    script.params.quality = 2;
    for (int round = 0; round < 12; ++round) {
        const int rate = random.Int(150, 2500);
        const int sequenceFields = round % 3;
        script.Set({{"MediaNode::StreamFrameBlend", "1"}, {"MediaNode::StreamFrameRate", std::to_string(rate)}});
        script.params.sequenceFieldType = static_cast<std::uint32_t>(sequenceFields);
        script.params.clipTime = MediaScript::kFrameTicks * random.Int(0, 20);
        const int width = random.Int(1, 120);
        const int height = random.Int(1, 50);
        std::map<std::int64_t, Picture> pictures;
        const auto pictureAt = [&](std::int64_t time) {
            const auto [at, isNew] = pictures.try_emplace(time);
            if (isNew)
                at->second = RoundTo(RandomPicture(random, width, height), Frame(Picture(1, 1))->GetPixelFormat());
            return at->second;
        };
        const Picture made = Through<TimeSampleSource>(pictureAt);

        // The share of each frame is what it has in common with the moment that the lines show; a moment that doesn't
        // last longer than a frame is mixed of the two around it.
        const auto mixAt = [&](double from, double lasts) {
            std::vector<Picture> parts;
            std::vector<double> weights;
            const bool around = lasts <= rate;
            const double center = std::floor(from / rate) * rate;
            for (const auto& [time, picture] : pictures) {
                const auto at = static_cast<double>(time);
                const double covered = std::min(at + rate, from + lasts) - std::max(at, from);
                const double near = at == center ? center + rate - from : at == center + rate ? from - center : 0.0;
                const double weight = around ? near / rate : std::max(0.0, covered) / lasts;
                if (weight <= 0.0) continue;
                parts.push_back(picture);
                weights.push_back(weight);
            }
            return Host::Software::WeightedSum(parts, weights);
        };
        const auto start = static_cast<double>(script.params.clipTime);
        const double lasts = sequenceFields == 0 ? 1000.0 : 500.0;
        Picture expected = mixAt(start, lasts);
        if (sequenceFields != 0) {
            Host::Software::WeaveField(expected, mixAt(start + 500.0, lasts), sequenceFields == 1);
        }
        EXPECT_TRUE(PicturesAgree(made, expected, Arithmetic())) << "round " << round << ", rate " << rate;
    }
}

}  // namespace
}  // namespace Vantrel::Testing
