// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Shared/Src/TimelineState.h"
#include "Vellum/Time.h"

namespace Vantrel {

/// One sequence as a map of render trees over time. It reads the host's segment list, keeps what didn't change, takes
/// over trees of content that it has built before, builds the rest, and fills what lies between with black.
///
/// Thread safe. Readers wait for a whole update with its host calls; GetSequenceFormat alone takes no lock.
class Timeline {
public:
    /// The status of GetSegmentInfo for a time that no segment covers.
    static constexpr Status kStatus_NoSegment = 11;
    /// The status of GetSequenceFormat before a sequence has been read.
    static constexpr Status kStatus_NoSequence = 99;

    /// Reads the sequence at once unless timelineID is 0; a failure leaves the timeline without segments.
    /// @param previewSpec   handed to the host unread; must live as long as the timeline.
    /// @param nativeSubType four-character code of the media subtype that plays natively in this sequence.
    /// @param parent        null, or a timeline whose trees may be taken over. Used during construction only.
    Timeline(std::uint32_t timelineID, bool usePreviews, const char* previewSpec, std::uint32_t nativeSubType,
             Kiln::DeviceRef device, Timeline* parent, CreateNodeFunction createNode,
             IsRegisteredFunction isRegistered);
    Timeline(const Timeline&) = delete;
    Timeline& operator=(const Timeline&) = delete;

    /// Reads the sequence again. Returns at once when its hash is the one that was read last.
    /// @return 0, or a negative status, after which the next update reads everything anew.
    Status UpdateTimeline();

    /// The hash of the segment list last read; nil after a failed update.
    [[nodiscard]] Guid GetTimelineHash() const;

    /// A copy of the stretch that covers a time in ticks, from the map of statistics or from the one to render.
    /// @return 0, or kStatus_NoSegment with `info` untouched.
    Status GetSegmentInfo(std::int64_t ticks, SegmentInfo& info, bool merged) const;

    /// The format of the top sequence. @return 0, or kStatus_NoSequence with nothing touched. Waits for nothing.
    Status GetSequenceFormat(Vellum::Rect& rect, Vellum::PixelAspectRatio& aspect, Vellum::FrameRate& rate,
                             std::uint32_t& fieldType) const;

private:
    TimelineState mState;
};

}  // namespace Vantrel
