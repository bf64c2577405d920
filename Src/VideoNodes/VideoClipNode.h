// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/VideoNodes/VideoNode.h"
#include "Vellum/Time.h"

namespace Vantrel {

/// A clip on a track: its media is input 0, its effects are its operators.
class VideoClipNode final : public VideoNode, public Ostrand::Allocated<VideoClipNode> {
public:
    /// Asks the host for the clip's frame hold.
    explicit VideoClipNode(VideoNodeRecord record)
        : VideoNode(std::move(record)),
          mFrameHoldAtTime(ReadInt64("ClipNode::FrameHoldAtTime", Vellum::kTime_Max)),
          mFrameHoldFilters(ReadBool("ClipNode::FrameHoldFilters")) {}
    [[nodiscard]] NodeType GetNodeType() const override { return NodeType::kClip; }

    /// The time at which the media is held, in its own ticks; Vellum::kTime_Max: no hold.
    [[nodiscard]] std::int64_t GetFrameHoldAtTime() const { return mFrameHoldAtTime; }
    [[nodiscard]] bool HasFrameHold() const { return mFrameHoldAtTime != Vellum::kTime_Max; }
    /// Do the effects stand still with the media?
    [[nodiscard]] bool GetFrameHoldFilters() const { return mFrameHoldFilters; }

    [[nodiscard]] double GetClipSpeed() const { return ReadDouble("ClipNode::ClipSpeed", 1.0); }
    [[nodiscard]] bool GetClipBackwards() const { return ReadBool("ClipNode::ClipBackwards"); }
    /// Is there a time remapping, whatever it holds?
    [[nodiscard]] bool GetTimeRemapping() const {
        std::string remapping;
        return !Ostrand::Failed(GetTextProperty("ClipNode::TimeRemapping", remapping));
    }
    [[nodiscard]] std::int64_t GetTrackItemStartAsTicks() const { return ReadInt64("ClipNode::TrackItemStartAsTicks"); }
    [[nodiscard]] std::int64_t GetTrackItemEndAsTicks() const { return ReadInt64("ClipNode::TrackItemEndAsTicks"); }
    [[nodiscard]] std::int64_t GetEffectiveTrackItemStartAsTicks() const {
        return ReadInt64("ClipNode::EffectiveTrackItemStartAsTicks");
    }
    [[nodiscard]] std::int64_t GetEffectiveTrackItemEndAsTicks() const {
        return ReadInt64("ClipNode::EffectiveTrackItemEndAsTicks");
    }
    /// `trackID` stays when the clip has none.
    void GetTrackID(std::int32_t& trackID) const { static_cast<void>(GetIntProperty("ClipNode::TrackID", trackID)); }

private:
    std::int64_t mFrameHoldAtTime;
    bool mFrameHoldFilters;
};

}  // namespace Vantrel
