// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "Halden/Guid.h"
#include "Ostrand/Status.h"
#include "Vellum/Geometry.h"
#include "Vellum/Time.h"

namespace Vantrel {

/// One entry of a sequence's segment list, in ticks.
struct VideoSegment {
    std::int64_t start = 0;
    std::int64_t end = 0;
    std::int64_t offset = 0;
    Halden::utility::Guid hash;
};

/// The format of a sequence.
struct SequenceInfo {
    Vellum::Rect rect;
    Vellum::PixelAspectRatio aspect;
    Vellum::FrameRate rate;
    std::uint32_t fieldType = 0;
};

/// Which of the host's segment lists is read.
enum class SegmentsMode : std::int32_t { kPlain = 0, kPreviews = 1, kNestedPreviews = 2 };

/// A sequence's segment list, held for a scope.
class VideoSegmentsHandle {
public:
    VideoSegmentsHandle(std::uint32_t timelineID, SegmentsMode mode, const char* previewSpec);
    ~VideoSegmentsHandle() { Release(); }
    VideoSegmentsHandle(const VideoSegmentsHandle&) = delete;
    VideoSegmentsHandle& operator=(const VideoSegmentsHandle&) = delete;

    [[nodiscard]] bool IsValid() const { return mValid; }
    [[nodiscard]] std::uint32_t GetTimelineID() const { return mTimelineID; }
    [[nodiscard]] std::uint32_t GetSegmentsID() const { return mSegmentsID; }
    /// Gives the list back to the host, once.
    void Release();

    /// kStatus_Failure when the host fails; `hash` then stays.
    Ostrand::Status GetSegmentsHash(Halden::utility::Guid& hash) const;
    /// 0 when the host fails.
    [[nodiscard]] std::int32_t GetSegmentCount() const;
    /// The host's status.
    Ostrand::Status GetSegmentInfo(std::int32_t index, VideoSegment& segment) const;

private:
    std::uint32_t mTimelineID;
    std::uint32_t mSegmentsID = 0;
    bool mValid = false;
};

/// kStatus_Failure when the host fails; `info` then stays.
Ostrand::Status GetSequenceInfo(std::uint32_t timelineID, SequenceInfo& info);

}  // namespace Vantrel
