// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Shared/Src/Timeline.h"

#include <utility>

#include "Shared/Src/SegmentMap.h"
#include "Shared/Src/SegmentReader.h"
#include "Shared/Src/SubTypes.h"

namespace Vantrel {

Timeline::Timeline(std::uint32_t timelineID, bool usePreviews, const char* previewSpec, std::uint32_t nativeSubType,
                   Kiln::DeviceRef device, Timeline* parent, CreateNodeFunction createNode,
                   IsRegisteredFunction isRegistered) {
    mState.nativeSubTypes = GetNativeSubTypes(nativeSubType);
    mState.hostSubTypes = GetHostSubTypes();
    mState.timelineID = timelineID;
    mState.usePreviews = usePreviews;
    mState.previewSpec = previewSpec;
    mState.device = std::move(device);
    mState.createNode = std::move(createNode);
    mState.isRegistered = std::move(isRegistered);
    if (parent && parent != this) {
        const Ostrand::ScopedLock lock(parent->mState.lock, "Timeline::Timeline");
        mState.treeCache = parent->mState.treeCache;
        mState.blackTree = parent->mState.blackTree;
    }
    if (timelineID != 0) static_cast<void>(UpdateTimeline());
}

Status Timeline::UpdateTimeline() {
    const Ostrand::ScopedLock lock(mState.lock, "Timeline::UpdateTimeline");
    Status status = Ostrand::kStatus_Failure;
    if (mState.timelineID != 0) {
        SegmentInfo scratch;
        status = SegmentReader(mState).ReadSequence(mState.timelineID, {0, Vellum::kTime_Max, 0}, {true, scratch, {}});
    }
    if (Ostrand::Failed(status)) mState.lastHash = Guid();
    return status;
}

Guid Timeline::GetTimelineHash() const {
    const Ostrand::ScopedLock lock(mState.lock, "Timeline::GetTimelineHash");
    return mState.lastHash;
}

Status Timeline::GetSegmentInfo(std::int64_t ticks, SegmentInfo& info, bool merged) const {
    const Ostrand::ScopedLock lock(mState.lock, "Timeline::GetSegmentInfo");
    const SegmentInfo* const segment = FindSegment(merged ? mState.mergedMap : mState.renderMap, ticks);
    if (!segment) return kStatus_NoSegment;
    info = *segment;
    return Ostrand::kStatus_OK;
}

Status Timeline::GetSequenceFormat(Vellum::Rect& rect, Vellum::PixelAspectRatio& aspect, Vellum::FrameRate& rate,
                                   std::uint32_t& fieldType) const {
    const boost::shared_ptr<const SequenceInfo> format = boost::atomic_load(&mState.topFormat);
    if (!format) return kStatus_NoSequence;
    rect = format->rect;
    aspect = format->aspect;
    rate = format->rate;
    fieldType = format->fieldType;
    return Ostrand::kStatus_OK;
}

}  // namespace Vantrel
