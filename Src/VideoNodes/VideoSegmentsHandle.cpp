// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/VideoNodes/VideoSegmentsHandle.h"

#include "Brae/Conversions.h"
#include "Src/Outside/Suites.h"
#include "Src/VideoNodes/HostTexts.h"

namespace Vantrel {
namespace {

auto SelectAcquire(const CorvaneVideoSegmentSuite& suite, SegmentsMode mode) {
    switch (mode) {
        case SegmentsMode::kPreviews:
            return suite.AcquireVideoSegmentsWithPreviews;
        case SegmentsMode::kNestedPreviews:
            return suite.AcquireNestedVideoSegmentsWithPreviews;
        case SegmentsMode::kPlain:
            break;
    }
    return suite.AcquireVideoSegments;
}

}  // namespace

VideoSegmentsHandle::VideoSegmentsHandle(std::uint32_t timelineID, SegmentsMode mode, const char* previewSpec)
    : mTimelineID(timelineID),
      mValid(SelectAcquire(VideoSegmentSuite(), mode)(timelineID, previewSpec, &mSegmentsID) == 0) {}

void VideoSegmentsHandle::Release() {
    if (mValid) VideoSegmentSuite().ReleaseVideoSegments(mSegmentsID);
    mSegmentsID = 0;
    mValid = false;
}

Ostrand::Status VideoSegmentsHandle::GetSegmentsHash(Halden::utility::Guid& hash) const {
    HostHashText text{};
    if (VideoSegmentSuite().GetSegmentsHash(mSegmentsID, text.data()) != 0) return Ostrand::kStatus_Failure;
    hash = ToGuid(text);
    return Ostrand::kStatus_OK;
}

std::int32_t VideoSegmentsHandle::GetSegmentCount() const {
    std::int32_t count = 0;
    VideoSegmentSuite().GetSegmentCount(mSegmentsID, &count);
    return count;
}

Ostrand::Status VideoSegmentsHandle::GetSegmentInfo(std::int32_t index, VideoSegment& segment) const {
    HostHashText text{};
    const Ostrand::Status status = VideoSegmentSuite().GetSegmentInfo(mSegmentsID, index, &segment.start, &segment.end,
                                                                      &segment.offset, text.data());
    segment.hash = ToGuid(text);
    return status;
}

Ostrand::Status GetSequenceInfo(std::uint32_t timelineID, SequenceInfo& info) {
    Vellum::Rect rect;
    Vellum::PixelAspectRatio aspect{1, 1};
    std::int64_t ticksPerFrame = 0;
    std::uint32_t fieldType = 0;
    if (VideoSegmentSuite().GetSequenceInfo(timelineID, &rect.left, &rect.top, &rect.right, &rect.bottom,
                                            &aspect.numerator, &aspect.denominator, &ticksPerFrame, &fieldType) != 0) {
        return Ostrand::kStatus_Failure;
    }
    info = {rect, aspect, Vellum::FrameRate::Create(ticksPerFrame), Brae::SDKToBEFieldType(fieldType)};
    return Ostrand::kStatus_OK;
}

}  // namespace Vantrel
