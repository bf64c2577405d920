// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/Filters/StreamGeometry.h"
#include "Src/Nodes/SelectInputBaseNode.h"
#include "Src/VideoNodes/VideoMediaNode.h"

namespace Vantrel {

/// One clip's media. It adapts what the producer of the pictures (its input 0 when it is configured) delivers to what
/// the sequence wants, by a chain of sources that it builds between itself and the producer, and by asking the producer
/// in the media's own terms: size, aspect, fields, rate and time. Always the outer half of a ProxyNode.
class MediaNode : public SelectInputBaseNode {
public:
    MediaNode();

    /// kStatus_Failure for a description that isn't media and for pictures that the device has no room for.
    Status Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) override;
    [[nodiscard]] WideString GetName() override { return u"MediaNode"; }
    Status RenderFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                       VideoFrameRef& frame) override;
    /// Renders the input and centres its picture on the sequence's frame, by the frame's origin.
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;
    void SelectInput(RenderParams& out, const RenderParams& params, RenderNodeRef& input) override;

private:
    struct ChainPlan;

    void ReadStream(const VideoMediaNode& media);
    void MakeHostScaledInput(const VideoMediaNode& media, const RenderRequirements& requirements, bool& host);
    Status BuildChain(const ChainPlan& plan, const RenderRequirements& requirements, bool& host);
    /// Puts a source between the chain and the producer.
    template <class Source>
    Status AddSource(const RenderRequirements& requirements, bool& host);
    /// Is the picture wanted so much smaller, at a quality so low, that the host had better reduce it?
    [[nodiscard]] bool UsesHostScaledInput(const RenderParams& params) const;
    void MapTime(RenderParams& out, const RenderParams& params);

    StreamGeometry mStream;
    std::int64_t mStreamFrameTicks = 0;
    std::uint32_t mStreamFieldType = Vellum::kFieldType_Progressive;
    std::int64_t mContentStart = 0;
    bool mStill = false;
    bool mContinuousTime = false;
    /// A TimeSampleSource heads the chain and maps time.
    bool mHasTimeSource = false;
    /// Vellum::kTime_Max: none.
    std::int64_t mFrameHold = Vellum::kTime_Max;
    RenderNodeRef mChainTail;
    RenderNodeRef mProducer;
    RenderNodeRef mHostScaledInput;
    VideoMediaNodeRef mMedia;
};

}  // namespace Vantrel
