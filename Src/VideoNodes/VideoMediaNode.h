// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/VideoNodes/VideoNode.h"
#include "Vellum/Geometry.h"

namespace Vantrel {

/// A clip's media: a stream, a preview file, synthetic media or a nested sequence.
class VideoMediaNode final : public VideoNode, public Ostrand::Allocated<VideoMediaNode> {
public:
    explicit VideoMediaNode(VideoNodeRecord record) : VideoNode(std::move(record)) {}
    [[nodiscard]] NodeType GetNodeType() const override { return mIsPreview ? NodeType::kPreview : NodeType::kMedia; }
    [[nodiscard]] bool IsPreview() const { return mIsPreview; }
    void SetPreview(bool isPreview) { mIsPreview = isPreview; }

    // The stream's pictures.
    [[nodiscard]] Vellum::PixelAspectRatio GetStreamPixelAspectRatio() const {
        return {ReadInt("MediaNode::StreamPixelAspectRatioNum", 1), ReadInt("MediaNode::StreamPixelAspectRatioDen", 1)};
    }
    /// (0, 0, width, height).
    [[nodiscard]] Vellum::Rect GetStreamFrameRect() const {
        return {0, 0, ReadInt("MediaNode::StreamFrameWidth"), ReadInt("MediaNode::StreamFrameHeight")};
    }
    /// Ticks per frame.
    [[nodiscard]] std::int64_t GetStreamFrameRate() const { return ReadInt64("MediaNode::StreamFrameRate"); }
    [[nodiscard]] std::int32_t GetStreamFieldType() const { return ReadInt("MediaNode::StreamFieldType"); }
    /// One of Vellum's kAlphaType values, or 0 for no alpha.
    [[nodiscard]] std::uint32_t GetStreamAlphaType() const;
    [[nodiscard]] bool GetStreamInvertAlpha() const { return ReadBool("MediaNode::StreamInvertAlpha"); }
    [[nodiscard]] bool GetStreamIgnoreAlpha() const { return ReadBool("MediaNode::StreamIgnoreAlpha"); }
    /// Blue, green and red in the lower three bytes.
    [[nodiscard]] std::uint32_t GetStreamAlphaMatteColor() const;
    /// A four-character code.
    [[nodiscard]] std::int32_t GetStreamFrameVidSubType() const { return ReadInt("MediaNode::StreamFrameVidSubType"); }
    [[nodiscard]] bool GetStreamIsContinuousTime() const {
        return ReadBool("MediaNode::kVideoSegmentProperty_Media_StreamIsContinuousTime");
    }
    [[nodiscard]] bool GetStreamIsRollCrawl() const { return ReadBool("MediaNode::StreamIsRollCrawl"); }
    [[nodiscard]] Marl::BinaryData GetStreamOpaqueData() const { return ReadBinary("MediaNode::StreamOpaqueData"); }

    // Its state.
    [[nodiscard]] bool GetMediaIsDraft() const { return ReadBool("MediaNode::MediaIsDraft"); }
    [[nodiscard]] bool GetMediaIsPending() const { return ReadBool("MediaNode::MediaIsPending"); }
    [[nodiscard]] bool GetMediaIsOffline() const { return ReadBool("MediaNode::MediaIsOffline"); }

    // How it is played.
    [[nodiscard]] double GetClipSpeed() const { return ReadDouble("MediaNode::ClipSpeed", 1.0); }
    [[nodiscard]] bool GetClipBackwards() const { return ReadBool("MediaNode::ClipBackwards"); }
    [[nodiscard]] std::int64_t GetStartTimecodeOffset() const { return ReadInt64("MediaNode::StartTimecodeOffset"); }
    [[nodiscard]] bool GetStreamRemovePulldown() const { return ReadBool("MediaNode::StreamRemovePulldown"); }
    [[nodiscard]] std::uint32_t GetStreamPullDownCadence() const;
    [[nodiscard]] bool GetStreamFrameBlend() const { return ReadBool("MediaNode::StreamFrameBlend"); }
    /// 0 none, 1 fit, 2 fill, others each direction by itself.
    [[nodiscard]] std::int32_t GetClipScaleToFramePolicy() const;
    [[nodiscard]] std::int64_t GetContentStart() const { return ReadInt64("MediaNode::ContentStart"); }
    [[nodiscard]] std::int64_t GetInPointMediaTimeAsTicks() const {
        return ReadInt64("MediaNode::InPointMediaTimeAsTicks");
    }
    [[nodiscard]] std::int64_t GetOutPointMediaTimeAsTicks() const {
        return ReadInt64("MediaNode::OutPointMediaTimeAsTicks");
    }

    // What is done about its fields.
    [[nodiscard]] bool GetStreamReverseFieldDominance() const {
        return ReadBool("MediaNode::StreamReverseFieldDominance");
    }
    [[nodiscard]] bool GetDeinterlaceAlways() const { return ReadBool("MediaNode::DeinterlaceAlways"); }
    [[nodiscard]] bool GetRemoveFlicker() const { return ReadBool("MediaNode::RemoveFlicker"); }
    [[nodiscard]] bool GetInterlaceConsecutiveFrames() const {
        return ReadBool("MediaNode::InterlaceConsecutiveFrames");
    }
    /// Is any of the four above set?
    [[nodiscard]] bool HasFieldOptions() const {
        return GetStreamReverseFieldDominance() || GetDeinterlaceAlways() || GetRemoveFlicker() ||
               GetInterlaceConsecutiveFrames();
    }
    [[nodiscard]] std::int32_t GetScanlineOffsetToImproveVerticalCentering() const {
        return ReadInt("MediaNode::ScanlineOffsetToImproveVerticalCentering");
    }

    // Who it is.
    [[nodiscard]] std::int32_t GetClipID() const { return ReadInt("MediaNode::ClipID"); }
    [[nodiscard]] std::int32_t GetNestedSequenceTimelineID() const {
        return ReadInt("MediaNode::NestedSequenceTimelineID");
    }
    /// `track` becomes 0 when the read fails; the status says so.
    [[nodiscard]] Status GetSelectedMulticamTrack(std::int32_t& track) const {
        track = 0;
        return GetIntProperty("MediaNode::SelectedMulticamTrack", track);
    }
    [[nodiscard]] std::int32_t GetSelectedMulticamTrackTimelineID() const {
        return ReadInt("MediaNode::SelectedMulticamTrackTimelineID");
    }
    /// Names synthetic media: a registry key.
    [[nodiscard]] WideString GetMediaInstanceString() const { return ReadWideText("MediaNode::MediaInstanceString"); }

private:
    bool mIsPreview = false;
};

using VideoMediaNodeRef = boost::shared_ptr<VideoMediaNode>;

}  // namespace Vantrel
