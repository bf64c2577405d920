// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

#include <boost/shared_ptr.hpp>

#include "Kiln/Device.h"
#include "Vantrel/HostSuites.h"
#include "Vantrel/IRenderNode.h"
#include "Vantrel/SegmentInfo.h"

#define VANTREL_EXPORT __attribute__((visibility("default")))

namespace Vantrel {

/// Renders one sequence on one device. Held by shared pointer; all render systems must be gone before the last
/// Terminate.
///
/// Any thread may call the first five operations and PrepareRender. RenderFrames runs on the caller's thread, which
/// holds the device (Kiln::Device::AcquireExclusiveAccess) across the call and keeps UpdateTimeline from running
/// meanwhile. One thread in the process is in RenderFrames at a time, whatever the device.
class RenderSystem {
public:
    virtual ~RenderSystem() = default;

    [[nodiscard]] virtual boost::shared_ptr<Kiln::Device> GetDevice() = 0;

    /// Reads the sequence again after a change. 0, or 0xA00F0001 when there is no sequence or reading failed.
    virtual Status UpdateTimeline() = 0;

    /// The hash of the segment list last read; nil after a failed update.
    [[nodiscard]] virtual Guid GetTimelineHash() = 0;

    /// What lies at a time, in ticks. `merged` selects the statistics across nesting levels; trees are only to be
    /// rendered from the other map. Returns 0, or 11 when no segment covers the time.
    virtual Status GetSegmentInfo(std::int64_t ticks, SegmentInfo& info, bool merged) = 0;

    /// Returns 0, or 99 when no sequence has been read. Takes no lock.
    virtual Status GetSequenceFormat(Vellum::Rect& rect, Vellum::PixelAspectRatio& aspect, Vellum::FrameRate& rate,
                                     std::uint32_t& fieldType) = 0;

    /// Queues the staging of a frame's host pictures and returns at once. The caller has counted this piece in
    /// `results`.
    virtual void PrepareRender(const RenderNodeRef& root, const boost::shared_ptr<RenderParams>& params,
                               const RenderResultsRef& results) = 0;

    /// Renders a frame, or two for two fields.
    /// @param first   the frame, or the temporally first field's; stays empty for a black stretch.
    /// @param second  the other field's frame; left as it was when there is none.
    /// @param text    if given, a report with timings replaces it, its old content appended.
    /// @param rect    output rectangle of multicam views and nested sequences as roots.
    /// @return a negative status as the tree gave it, with `first` and `second` untouched.
    virtual Status RenderFrames(const RenderNodeRef& root, const boost::shared_ptr<RenderParams>& params,
                                const RenderResultsRef& results, VideoFrameRef& first, VideoFrameRef& second,
                                std::string* text, const Vellum::Rect& rect) = 0;
};

/// Starts the library; calls nest, and only the first does the work. The record must live until the matching Terminate.
VANTREL_EXPORT void Initialize(QuillBasicSuite* suite);
VANTREL_EXPORT void Terminate();

/// @param timelineID    the host's id of the sequence; 0 makes a render system without one.
/// @param usePreviews   read the lists with rendered previews.
/// @param previewSpec   handed to the host unread; must live as long as the render system.
/// @param nativeSubType four-character code of the sequence's native media.
/// @param parent        empty, or a render system whose trees the new one may take over.
[[nodiscard]] VANTREL_EXPORT boost::shared_ptr<RenderSystem> CreateRenderSystem(
    const boost::shared_ptr<Kiln::Device>& device, std::int32_t timelineID, bool usePreviews, const char* previewSpec,
    std::uint32_t nativeSubType, const boost::shared_ptr<RenderSystem>& parent);

}  // namespace Vantrel
