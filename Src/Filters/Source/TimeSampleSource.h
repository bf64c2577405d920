// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <vector>

#include "Marl/TimeSampling.h"
#include "Ostrand/Allocated.h"
#include "Src/Nodes/MultipleTimeInputBaseNode.h"
#include "Src/Nodes/SourceBaseNode.h"

namespace Vantrel {

/// Makes an output frame of the input frames that show its stretch of time: for another rate or speed, for reverse and
/// remapped clips, and for fields that have to become frames or the other way round. Without frame blending each output
/// field shows the nearest field of the stream; with it, all fields that the output lasts, by their share in it, or the
/// two that lie around its moment when it doesn't last longer than one.
class TimeSampleSource final : public SourceBaseNode<MultipleTimeInputBaseNode>,
                               public Ostrand::Allocated<TimeSampleSource> {
public:
    TimeSampleSource() : SourceBaseNode(false, false) {}

    Status Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) override;
    [[nodiscard]] WideString GetName() override { return u"TimeSampleSource"; }
    Status RenderFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                       VideoFrameRef& frame) override;
    void GetInputTimes(const RenderParams& params, SampleSet& times, bool forRender) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    /// The rendered samples of one field of the output, or of all of it.
    struct WeightedFrames {
        std::vector<VideoFrameRef> frames;
        std::vector<float> weights;
    };

    /// The media time that a moment of the output shows.
    [[nodiscard]] std::int64_t GetMediaTime(std::int64_t instant) const;
    [[nodiscard]] std::vector<Marl::TimeSample> SampleInstant(std::int64_t instant, const Marl::SampledOutput& output);
    Status Sum(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
               const WeightedFrames& upper, const WeightedFrames& others, VideoFrameRef& frame);
    Status Accumulate(const WeightedFrames& samples, const VideoFrameRef& target, std::int32_t mode) const;

    double mSpeed = 1.0;
    bool mBackwards = false;
    bool mFrameBlend = false;
    std::int64_t mContentStart = 0;
};

}  // namespace Vantrel
