// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <sstream>

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

using Upload = ProxyNode<UploadNode, SWHostRenderClipPrefetch>;
using ClipMedia = ProxyNode<MediaNode, Upload>;

class MediaChain : public HostedTest {
protected:
    InterfaceRef<ClipMedia> MakeMedia() { return script.Make<ClipMedia>(MediaScript::Media(), device); }
    /// The usual properties of the media, and some as "key=value key=value".
    void SetMedia(const std::string& text) {
        host.nodes[MediaScript::kMedia].properties = mUsual;
        std::istringstream words(text);
        for (std::string word; words >> word;) {
            const std::size_t end = word.find('=');
            script.Set({{"MediaNode::" + word.substr(0, end), word.substr(end + 1)}});
        }
    }
    /// The names of the sources between the media node and its upload.
    std::string Sources() {
        std::string names;
        const auto media = MakeMedia();
        for (auto node = Ostrand::Query<FilterNode>(media->GetInput(0)); node;
             node = Ostrand::Query<FilterNode>(node->GetInput(0))) {
            if (node->GetName() != u"Upload Node") names += Halden::ToUTF8(node->GetName()) + " ";
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

private:
    const MediaScript::Properties mUsual = host.nodes[MediaScript::kMedia].properties;
};

TEST_F(MediaChain, HasOnlyTheSourcesThatTheMediaNeeds) {
    const struct {
        const char* media;
        const char* sources;
        std::uint32_t fieldType = 0;  ///< of the sequence
    } kRows[] = {
        {"", "ScaleSource "},
        {"ClipSpeed=0.5", "TimeSampleSource ScaleSource "},
        {"ClipBackwards=1", "TimeSampleSource ScaleSource "},
        {"StreamFrameRate=400", "TimeSampleSource ScaleSource "},
        {"StreamInvertAlpha=1", "ScaleSource InvertAlphaSource "},
        {"StreamInvertAlpha=1 StreamIgnoreAlpha=1", "ScaleSource "},
        {"RemoveFlicker=1", "ScaleSource RemoveFlickerSource "},
        {"StreamFieldType=1", "ScaleSource FieldReverseSource ", 2},
        {"StreamFieldType=1 StreamReverseFieldDominance=1", "ScaleSource ReverseFieldDominanceSource ", 2},
        // Backwards and reversed cancel each other.
        {"StreamFieldType=1 StreamReverseFieldDominance=1 ClipBackwards=1",
         "TimeSampleSource ScaleSource FieldReverseSource ", 2},
        {"StreamFieldType=1 DeinterlaceAlways=1", "TimeSampleSource ScaleSource DeinterlaceSource FieldReverseSource ",
         2},
        {"StreamFieldType=1 DeinterlaceAlways=1 StreamRemovePulldown=1 StreamPullDownCadence=1",
         "TimeSampleSource ScaleSource ", 2},
        // A reduced picture is resampled anyway, and two fields merge into a frame.
        {"StreamFieldType=1 ClipScaleToFramePolicy=1 StreamFrameHeight=72", "ScaleSource ", 2},
        {"StreamFieldType=1 StreamFrameBlend=1", "TimeSampleSource ScaleSource "},
    };
    for (const auto& row : kRows) {
        SetMedia(row.media);
        script.params.fieldType = row.fieldType;
        EXPECT_EQ(Sources(), row.sources) << row.media;
    }
    SetMedia("");
    script.params.fieldType = 0;
    host.nodes[MediaScript::kClip].properties["ClipNode::TimeRemapping"] = "x";
    EXPECT_EQ(Sources(), "TimeSampleSource ScaleSource ");
    host.nodes[MediaScript::kMedia].flags = kNodeFlag_Still;
    SetMedia("InterlaceConsecutiveFrames=1 StreamFrameBlend=1");
    EXPECT_EQ(Sources(), "ScaleSource ") << "a still has no time";
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
    const auto interlace = script.Make<InterlaceConsecutiveFramesSource>(MediaScript::Media(), device);
    interlace->SetInput(0, {});
    EXPECT_EQ(interlace->GetFrameRate().GetTicksPerFrame(), 500);
    const struct {
        TransformRenderParamsBaseNode& source;
        std::int64_t clipTime;
        std::uint32_t selection;
        std::int64_t outTime, outClipTime;
        std::uint32_t outSelection;
    } kRows[] = {{*reverse, 2300, 0, 500, 2500, 1},
                 {*reverse, 2300, 1, 0, 2000, 0},
                 {*reverse, 2300, 2, 0, 2000, 2},
                 {*interlace, 10, 0, 0, 20, 0},
                 {*interlace, 250, 0, 0, 500, 1}};  // 500 lies in the second half frame
    for (const auto& row : kRows) {
        script.params.clipTime = row.clipTime;
        script.params.fieldSelection = row.selection;
        RenderParams out;
        row.source.TransformParams(out, script.params);
        EXPECT_EQ(out.time, row.outTime) << row.clipTime;
        EXPECT_EQ(out.clipTime, row.outClipTime) << row.clipTime;
        EXPECT_EQ(out.fieldSelection, row.outSelection) << row.clipTime;
    }
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

TEST_F(TimeSamples, FollowRatesBlendingAndFields) {
    const struct {
        const char* media;
        std::int64_t clipTime;  ///< of a sequence with 1000 ticks a frame
        const char* samples;
        std::uint32_t quality = 2, sequenceField = 0, selection = Vellum::kFieldSelection_Frame;
    } kRows[] = {
        {"StreamFrameRate=1250", 1000, "1250: 1250*1@0; "},
        {"StreamFrameRate=1250", 3000, "2500: 2500*1@0; "},  // the nearer one
        {"StreamFrameRate=1250 StreamFrameBlend=1", 3000, "2500: 2500*1@0; ", 1},
        {"StreamFrameRate=1250 ContentStart=12500", 1000, "13750: 13750*1@0; "},
        // Slower than the sequence: the two around the moment; faster: all that it lasts.
        {"StreamFrameRate=1250 StreamFrameBlend=1", 1000, "0: 0*0.2@0; 1250: 1250*0.8@0; "},
        {"StreamFrameRate=1250 StreamFrameBlend=1", 2500, "2500: 2500*1@0; "},
        {"StreamFrameRate=400 StreamFrameBlend=1", 1000, "800: 800*0.2@0; 1200: 1200*0.4@0; 1600: 1600*0.4@0; "},
        {"ClipSpeed=2 StreamFrameBlend=1", 1000, "1000: 1000*0.5@0; 2000: 2000*0.5@0; "},
        {"StreamFieldType=1 StreamFrameBlend=1", 1000, "1000: 1000*0.5@0 1500*0.5@0; "},
        // Fields of the sequence are moments of their own, of which one may show the same frame as the other.
        {"StreamFrameRate=500", 3000, "3000: 3000*1@2; 3500: 3500*1@1; ", 2, 2},
        {"StreamFrameRate=1500", 3000, "3000: 3000*1@0; ", 2, 2},
        {"StreamFrameRate=500", 3000, "3000: 3000*1@0; ", 2, 2, 0},
        {"StreamFrameRate=500", 3500, "3500: 3500*1@0; ", 2, 2, 1},
    };
    for (const auto& row : kRows) {
        SetMedia(row.media);
        script.params.clipTime = row.clipTime;
        script.params.quality = row.quality;
        script.params.sequenceFieldType = row.sequenceField;
        script.params.fieldSelection = row.selection;
        EXPECT_EQ(Ask(), row.samples) << row.media << " at " << row.clipTime;
    }
}

}  // namespace
}  // namespace Vantrel::Testing
