// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>

#include "Src/Filters/HostRenderSubtreeNode.h"
#include "Src/Filters/MediaNode.h"
#include "Src/Filters/SWHostRenderClipPrefetch.h"
#include "Src/Filters/Source/InterlaceConsecutiveFramesSource.h"
#include "Src/Filters/Source/ReverseFieldDominanceSource.h"
#include "Src/Filters/Source/TimeSampleSource.h"
#include "Src/Filters/UploadNode.h"
#include "Src/Nodes/ProxyNode.h"
#include "Tests/Media/MediaScript.h"
#include "Tests/Support/FakeDevice.h"
#include "Tests/Support/HostedTest.h"

namespace Vantrel::Testing {
namespace {

using ::testing::ElementsAre;
using Upload = ProxyNode<UploadNode, SWHostRenderClipPrefetch>;
using ClipMedia = ProxyNode<MediaNode, Upload>;

class MediaChain : public HostedTest {
protected:
    InterfaceRef<ClipMedia> MakeMedia() { return script.Make<ClipMedia>(MediaScript::Media(), device); }
    /// The names below the media node, down to the producer.
    std::vector<std::string> Chain(const MediaScript::Properties& properties) {
        script.Set(properties);
        std::vector<std::string> names;
        const auto media = MakeMedia();
        if (!media) return {"none"};
        for (auto node = Ostrand::Query<FilterNode>(media->GetInput(0)); node;
             node = Ostrand::Query<FilterNode>(node->GetInput(0))) {
            names.push_back(Halden::ToUTF8(node->GetName()));
        }
        return names;
    }
    RenderParams Select(MediaNode& media) {
        RenderParams out;
        media.SelectInput(out, script.params, selected);
        return out;
    }

    MediaScript script{host};
    boost::shared_ptr<FakeDevice> device = boost::make_shared<FakeDevice>();
    RenderNodeRef selected;
};

TEST_F(MediaChain, HasOnlyTheSourcesThatTheMediaNeeds) {
    EXPECT_THAT(Chain({}), ElementsAre("ScaleSource", "Upload Node"));
    EXPECT_THAT(Chain({{"MediaNode::ClipSpeed", "0.5"}}),
                ElementsAre("TimeSampleSource", "ScaleSource", "Upload Node"));
    EXPECT_THAT(Chain({{"MediaNode::ClipSpeed", "1"}, {"MediaNode::ClipBackwards", "1"}}),
                ElementsAre("TimeSampleSource", "ScaleSource", "Upload Node"));
    EXPECT_THAT(Chain({{"MediaNode::ClipBackwards", "0"}, {"MediaNode::StreamFrameRate", "400"}}),
                ElementsAre("TimeSampleSource", "ScaleSource", "Upload Node"));
    host.nodes[MediaScript::kClip].properties["ClipNode::TimeRemapping"] = "x";
    EXPECT_THAT(Chain({{"MediaNode::StreamFrameRate", "1000"}}),
                ElementsAre("TimeSampleSource", "ScaleSource", "Upload Node"));
    host.nodes[MediaScript::kMedia].flags = kNodeFlag_Still;
    EXPECT_THAT(Chain({{"MediaNode::InterlaceConsecutiveFrames", "1"}, {"MediaNode::StreamFrameBlend", "1"}}),
                ElementsAre("ScaleSource", "Upload Node"))
        << "a still has no time";
    EXPECT_THAT(Chain({{"MediaNode::StreamInvertAlpha", "1"}}),
                ElementsAre("ScaleSource", "InvertAlphaSource", "Upload Node"));
    EXPECT_THAT(Chain({{"MediaNode::StreamIgnoreAlpha", "1"}}), ElementsAre("ScaleSource", "Upload Node"));
    EXPECT_THAT(Chain({{"MediaNode::RemoveFlicker", "1"}}),
                ElementsAre("ScaleSource", "RemoveFlickerSource", "Upload Node"));
}

TEST_F(MediaChain, BringsFieldsIntoTheSequencesOrder) {
    script.params.fieldType = 2;
    EXPECT_THAT(Chain({{"MediaNode::StreamFieldType", "1"}}),
                ElementsAre("ScaleSource", "FieldReverseSource", "Upload Node"));
    EXPECT_THAT(Chain({{"MediaNode::StreamReverseFieldDominance", "1"}}),
                ElementsAre("ScaleSource", "ReverseFieldDominanceSource", "Upload Node"));
    EXPECT_THAT(Chain({{"MediaNode::ClipBackwards", "1"}}),
                ElementsAre("TimeSampleSource", "ScaleSource", "FieldReverseSource", "Upload Node"))
        << "backwards and reversed cancel each other";
    EXPECT_THAT(Chain({{"MediaNode::ClipBackwards", "0"},
                       {"MediaNode::StreamReverseFieldDominance", "0"},
                       {"MediaNode::ClipScaleToFramePolicy", "1"},
                       {"MediaNode::StreamFrameHeight", "72"}}),
                ElementsAre("ScaleSource", "Upload Node"))
        << "a reduced picture is resampled anyway";
    EXPECT_THAT(
        Chain({{"MediaNode::ClipScaleToFramePolicy", "0"}, {"MediaNode::DeinterlaceAlways", "1"}}),
        ElementsAre("TimeSampleSource", "ScaleSource", "DeinterlaceSource", "FieldReverseSource", "Upload Node"));
    EXPECT_THAT(Chain({{"MediaNode::StreamRemovePulldown", "1"}, {"MediaNode::StreamPullDownCadence", "1"}}),
                ElementsAre("TimeSampleSource", "ScaleSource", "Upload Node"));
    script.params.fieldType = 0;
    EXPECT_THAT(Chain({{"MediaNode::StreamRemovePulldown", "0"},
                       {"MediaNode::DeinterlaceAlways", "0"},
                       {"MediaNode::StreamFrameBlend", "1"}}),
                ElementsAre("TimeSampleSource", "ScaleSource", "Upload Node"))
        << "two fields merge into a frame";
}

TEST_F(MediaChain, RefusesWhatIsntMediaOrDoesntFit) {
    const RenderNodeRef node(new ProxyNode<MediaNode, Upload>());
    EXPECT_EQ(script.Configure(*node, MediaScript::Clip(), device), Ostrand::kStatus_Failure);
    device->memoryLimit = 64 * 36 * 16 * 4 - 1;
    EXPECT_FALSE(MakeMedia());
    device->memoryLimit += 1;
    EXPECT_TRUE(MakeMedia());
}

TEST_F(MediaChain, AsksInTheMediasOwnTerms) {
    script.Set({{"MediaNode::StreamFrameWidth", "200"},
                {"MediaNode::StreamFrameHeight", "101"},
                {"MediaNode::StreamPixelAspectRatioNum", "2"},
                {"MediaNode::ContentStart", "30000"}});
    host.nodes[MediaScript::kClip].transformTime = [](std::int64_t time) { return time + 500; };
    script.params.sequenceRect = {0, 0, 100, 100};
    script.Output(50, 50);
    script.params.clipTime = 2000;
    script.params.time = 7000;

    auto media = MakeMedia();
    RenderParams out = Select(*media);
    EXPECT_EQ(out.outputRect, Vellum::Rect({0, 0, 100, 51})) << "half, rounded up";
    EXPECT_FLOAT_EQ(out.scaleX, 2.0F);
    EXPECT_FLOAT_EQ(out.scaleY, 101.0F / 51.0F);
    EXPECT_EQ(out.pixelAspectRatio, Vellum::PixelAspectRatio({2, 1}));
    EXPECT_EQ(out.clipTime, 32500);
    EXPECT_EQ(out.time, 7000);
    EXPECT_EQ(selected, media->GetInput(0));

    // Fitting: across, twice the width in square pixels is four times the sequence; down, about once.
    script.Set({{"MediaNode::ClipScaleToFramePolicy", "1"}});
    EXPECT_EQ(Select(*MakeMedia()).outputRect, Vellum::Rect({0, 0, 25, 13}));
    script.Set({{"MediaNode::ClipScaleToFramePolicy", "2"}});
    EXPECT_EQ(Select(*MakeMedia()).outputRect, Vellum::Rect({0, 0, 99, 50}));
    script.Set({{"MediaNode::ClipScaleToFramePolicy", "3"}});
    EXPECT_EQ(Select(*MakeMedia()).outputRect, Vellum::Rect({0, 0, 25, 50}));
}

TEST_F(MediaChain, MapsTimeWhereNoSourceDoes) {
    script.params.clipTime = 5000;
    script.Set({{"MediaNode::ClipSpeed", "0.5"}});
    EXPECT_EQ(Select(*MakeMedia()).clipTime, 5000) << "left to the time source";

    script.Set({{"MediaNode::ClipSpeed", "1"}, {"MediaNode::ContentStart", "100"}});
    host.nodes[MediaScript::kClip].properties["ClipNode::FrameHoldAtTime"] = "1500";
    const RenderParams held = Select(*MakeMedia());
    EXPECT_EQ(held.time, 1500);
    EXPECT_EQ(held.clipTime, 1600);
    EXPECT_EQ(held.fieldSelection, 1U) << "the third half frame";

    host.nodes[MediaScript::kClip].properties.erase("ClipNode::FrameHoldAtTime");
    script.Set({{"MediaNode::StreamFieldType", "4"}, {"MediaNode::StreamFrameRate", "1001"}});
    EXPECT_EQ(Select(*MakeMedia()).frameTicks, 501);
    script.Set({{"MediaNode::kVideoSegmentProperty_Media_StreamIsContinuousTime", "1"}});
    EXPECT_EQ(Select(*MakeMedia()).frameTicks, 1001);

    host.nodes[MediaScript::kMedia].flags = kNodeFlag_Still;
    const RenderParams still = Select(*MakeMedia());
    EXPECT_EQ(still.clipTime, 0);
    EXPECT_EQ(still.fieldType, 0U);
}

TEST_F(MediaChain, LetsTheHostReduceALargeStreamAtLowQuality) {
    script.Set({{"MediaNode::StreamFrameWidth", "256"}, {"MediaNode::StreamFrameHeight", "144"}});
    host.clips[MediaScript::kClipID].deliver = [](VantrelClipRecord wanted) {
        wanted.width = 256;
        wanted.height = 144;
        return wanted;
    };
    script.params.sequenceRect = {0, 0, 256, 144};
    script.Output(64, 36);
    const auto media = MakeMedia();
    const auto usesHost = [&] {
        static_cast<void>(Select(*media));
        return selected != media->GetInput(0);
    };
    EXPECT_TRUE(usesHost());
    EXPECT_EQ(Select(*media).outputRect, Vellum::Rect({0, 0, 64, 36})) << "params go down as they came";
    EXPECT_EQ(media->RequestHostFrames(script.params, MediaScript::MakeResults()), 0);
    EXPECT_EQ(host.Count("RenderNode"), 1);
    EXPECT_EQ(host.Count("RenderClip"), 0);
    script.params.quality = 3;
    EXPECT_FALSE(usesHost());
    script.params.quality = 2;
    script.Output(128, 72);
    EXPECT_FALSE(usesHost()) << "exactly half isn't small";
    script.params.outputRect = {0, 0, 64, 36};
    script.params.scaleX = script.params.scaleY = 1.0F;
    EXPECT_FALSE(usesHost()) << "at full size the picture is cropped, not reduced";

    script.Output(64, 36);
    host.clips[MediaScript::kClipID].deliver = [](VantrelClipRecord wanted) { return wanted; };
    const auto other = MakeMedia();
    static_cast<void>(Select(*other));
    EXPECT_EQ(selected, other->GetInput(0)) << "the clip's own size isn't the stream's";
}

TEST_F(MediaChain, TheUploadAlignsTimeAndSettlesTheFormat) {
    const auto upload = script.Make<Upload>(MediaScript::Media(), device);
    script.params.time = 4700;
    script.params.clipTime = -300;
    script.params.pixelFormat = 0x41444340;
    script.params.sequenceRect = {0, 0, 720, 576};
    RenderParams out;
    upload->TransformParams(out, script.params);
    EXPECT_EQ(out.time, 4000);
    EXPECT_EQ(out.clipTime, -1000);
    EXPECT_EQ(out.pixelFormat, Vellum::FourCC("vuya"));
    script.params.sequenceRect.bottom = 577;
    upload->TransformParams(out, script.params);
    EXPECT_EQ(out.pixelFormat, Vellum::FourCC("VUYA"));
}

TEST_F(MediaChain, TheUploadsFingerprintTellsPicturesApart) {
    const auto hash = [this] {
        const auto upload = script.Make<Upload>(MediaScript::Media(), device);
        return upload->GetFrameHash(script.params, MediaScript::MakeResults());
    };
    host.clips[MediaScript::kClipID].frameHashText = Guid(1, 2, 3, {}).ToString();
    std::set<Guid> hashes{hash()};
    script.params.clipTime = 400;
    EXPECT_EQ(hashes.count(hash()), 1U) << "the same frame of the stream";
    script.params.quality = 3;
    EXPECT_TRUE(hashes.insert(hash()).second);
    const std::pair<std::string, std::string> changes[] = {{"StreamFieldType", "1"},
                                                           {"StreamAlphaType", "2"},
                                                           {"StreamAlphaMatteColor", "255"},
                                                           {"ClipScaleToFramePolicy", "1"},
                                                           {"ScanlineOffsetToImproveVerticalCentering", "1"}};
    for (const auto& [key, value] : changes) {
        script.Set({{"MediaNode::" + key, value}});
        EXPECT_TRUE(hashes.insert(hash()).second) << key;
    }
    host.clips[MediaScript::kClipID].frameHashStatus = -1;
    EXPECT_TRUE(hash().IsNil());
}

TEST_F(MediaChain, FieldSourcesMoveTheRequest) {
    const auto reverse = script.Make<ReverseFieldDominanceSource>(MediaScript::Media(), device);
    script.params.clipTime = 2300;
    script.params.fieldSelection = 0;
    RenderParams out;
    reverse->TransformParams(out, script.params);
    EXPECT_EQ(out.fieldSelection, 1U);
    EXPECT_EQ(out.clipTime, 2500);
    EXPECT_EQ(out.time, 500);
    script.params.fieldSelection = 1;
    reverse->TransformParams(out, script.params);
    EXPECT_EQ(out.fieldSelection, 0U);
    EXPECT_EQ(out.clipTime, 2000);
    script.params.fieldSelection = 2;
    reverse->TransformParams(out, script.params);
    EXPECT_EQ(out.fieldSelection, 2U);

    const auto interlace = script.Make<InterlaceConsecutiveFramesSource>(MediaScript::Media(), device);
    interlace->SetInput(0, {});
    script.params.clipTime = 10;
    script.params.fieldSelection = 0;
    interlace->TransformParams(out, script.params);
    EXPECT_EQ(out.clipTime, 20);
    EXPECT_EQ(out.fieldSelection, 0U);
    script.params.clipTime = 250;
    interlace->TransformParams(out, script.params);
    EXPECT_EQ(out.fieldSelection, 1U) << "500 lies in the second half frame";
    EXPECT_EQ(interlace->GetFrameRate().GetTicksPerFrame(), 500);
}

/// The times and weights that a time source asks for, as "frame: time*weight@field ...".
class TimeSamples : public MediaChain {
protected:
    std::string Ask() {
        const auto source = script.Make<TimeSampleSource>(MediaScript::Media(), device);
        source->SetInput(0, {});
        SampleSet samples;
        source->GetInputTimes(script.params, samples, true);
        std::ostringstream text;
        for (const auto& [frame, fields] : samples) {
            text << frame << ":";
            for (const FieldSample& field : fields) {
                text << " " << field.time << "*" << field.weight << "@" << field.fieldType;
            }
            text << "; ";
        }
        return text.str();
    }
};

TEST_F(TimeSamples, WithoutBlendingTheNearestFrameIsShown) {
    script.Set({{"MediaNode::StreamFrameRate", "1250"}, {"MediaNode::ContentStart", "12500"}});
    script.params.clipTime = 1000;
    EXPECT_EQ(Ask(), "13750: 13750*1@0; ");
    script.params.clipTime = 3000;
    EXPECT_EQ(Ask(), "15000: 15000*1@0; ") << "3000 lies nearer to 2500";
    script.Set({{"MediaNode::StreamFrameBlend", "1"}});
    script.params.quality = 1;
    EXPECT_EQ(Ask(), "15000: 15000*1@0; ");
}

TEST_F(TimeSamples, BlendingSharesByClosenessOrByDuration) {
    script.Set({{"MediaNode::StreamFrameRate", "1250"}, {"MediaNode::StreamFrameBlend", "1"}});
    script.params.clipTime = 1000;
    EXPECT_EQ(Ask(), "0: 0*0.2@0; 1250: 1250*0.8@0; ") << "slower than the sequence: the two around the moment";
    script.params.clipTime = 2500;
    EXPECT_EQ(Ask(), "2500: 2500*1@0; ");

    script.Set({{"MediaNode::StreamFrameRate", "400"}});
    script.params.clipTime = 1000;
    EXPECT_EQ(Ask(), "800: 800*0.2@0; 1200: 1200*0.4@0; 1600: 1600*0.4@0; ") << "faster: all that it lasts";
    script.Set({{"MediaNode::StreamFrameRate", "1000"}, {"MediaNode::ClipSpeed", "2"}});
    EXPECT_EQ(Ask(), "1000: 1000*0.5@0; 2000: 2000*0.5@0; ");
    script.Set({{"MediaNode::ClipSpeed", "1"}, {"MediaNode::StreamFieldType", "1"}});
    EXPECT_EQ(Ask(), "1000: 1000*0.5@0 1500*0.5@0; ") << "two fields make a frame";
}

TEST_F(TimeSamples, FieldsOfTheSequenceAreMomentsOfTheirOwn) {
    script.params.sequenceFieldType = 2;
    script.params.clipTime = 3000;
    script.Set({{"MediaNode::StreamFrameRate", "500"}});
    EXPECT_EQ(Ask(), "3000: 3000*1@2; 3500: 3500*1@1; ") << "the lower field comes first";
    script.Set({{"MediaNode::StreamFrameRate", "1500"}});
    EXPECT_EQ(Ask(), "3000: 3000*1@0; ") << "both show the same frame";
    script.Set({{"MediaNode::StreamFrameRate", "500"}});
    script.params.fieldSelection = 0;
    EXPECT_EQ(Ask(), "3000: 3000*1@0; ");
    script.params.fieldSelection = 1;
    script.params.clipTime = 3500;
    EXPECT_EQ(Ask(), "3500: 3500*1@0; ") << "the request has moved by a field already";
}

}  // namespace
}  // namespace Vantrel::Testing
