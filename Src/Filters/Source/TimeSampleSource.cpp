// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Source/TimeSampleSource.h"

#include "Brae/Conversions.h"
#include "Kiln/FrameOperations.h"
#include "Kiln/Frames.h"
#include "Src/Filters/FieldTime.h"
#include "Src/Nodes/FrameBuffer.h"

namespace Vantrel {

namespace {

constexpr std::uint32_t kWholePicture = 0;
constexpr std::uint32_t kUpperField = 1;
constexpr std::uint32_t kLowerField = 2;

/// Two fields that show the same are one picture.
bool SameSamples(const std::vector<Marl::TimeSample>& a, const std::vector<Marl::TimeSample>& b) {
    const auto same = [](const Marl::TimeSample& x, const Marl::TimeSample& y) {
        return x.time == y.time && x.weight == y.weight;
    };
    return std::equal(a.begin(), a.end(), b.begin(), b.end(), same);
}

void Add(SampleSet& set, const std::vector<Marl::TimeSample>& samples, std::uint32_t field) {
    for (const Marl::TimeSample& sample : samples) {
        set[sample.frameTime].push_back({sample.time, field, sample.weight});
    }
}

}  // namespace

Status TimeSampleSource::Configure(const VideoNodeRef& description, const RenderRequirements& requirements,
                                   bool& host) {
    const auto media = boost::dynamic_pointer_cast<VideoMediaNode>(description);
    if (!media) return Ostrand::kStatus_Failure;
    mSpeed = media->GetClipSpeed();
    mBackwards = media->GetClipBackwards();
    mFrameBlend = media->GetStreamFrameBlend();
    mContentStart = media->GetContentStart();
    return FilterNode::Configure(description, requirements, host);
}

std::int64_t TimeSampleSource::GetMediaTime(std::int64_t instant) const {
    return GetNodeTime(instant, false) + mContentStart;
}

std::vector<Marl::TimeSample> TimeSampleSource::SampleInstant(std::int64_t instant, const Marl::SampledOutput& output) {
    return Marl::SampleMoment(GetMediaTime(instant), {GetFrameRate(), GetFieldRate(), mSpeed, mBackwards}, output);
}

void TimeSampleSource::GetInputTimes(const RenderParams& params, SampleSet& times, bool) {
    const Vellum::FrameRate rate = Vellum::FrameRate::Create(params.sequenceFrameTicks);
    const std::uint32_t fieldType = Brae::SDKToBEFieldType(params.sequenceFieldType);
    const bool blend = mFrameBlend && params.quality >= 2;
    const bool second = params.fieldSelection == Vellum::kFieldSelection_Second;
    const std::int64_t start = second ? AlignToFrame(params.clipTime, params.sequenceFrameTicks) : params.clipTime;

    times.clear();
    if (!IsInterlaced(fieldType)) {
        Add(times, SampleInstant(start, {rate, rate, blend}), kWholePicture);
        return;
    }
    const Vellum::FrameRate outputFieldRate = rate.Faster(2);
    const auto sampleField = [&](bool later) {
        const std::int64_t instant = start + (later ? outputFieldRate.GetTicksPerFrame() : 0);
        return SampleInstant(instant, {rate, outputFieldRate, blend});
    };
    if (params.fieldSelection != Vellum::kFieldSelection_Frame) {
        Add(times, sampleField(second), kWholePicture);
        return;
    }
    const auto earlier = sampleField(false);
    const auto later = sampleField(true);
    if (SameSamples(earlier, later)) {
        Add(times, earlier, kWholePicture);
        return;
    }
    const bool upperFirst = fieldType == Vellum::kFieldType_UpperFirst;
    Add(times, earlier, upperFirst ? kUpperField : kLowerField);
    Add(times, later, upperFirst ? kLowerField : kUpperField);
}

Status TimeSampleSource::RenderFrame(const RenderToken& token, const RenderParams& params,
                                     const RenderResultsRef& results, VideoFrameRef& frame) {
    const RenderNodeRef input = GetInput(0);
    frame.Reset();
    if (!input) return Ostrand::kStatus_Failure;
    SampleSet samples;
    GetInputTimes(params, samples, true);

    WeightedFrames upper;
    WeightedFrames others;
    for (const auto& [frameTime, fields] : samples) {
        for (const FieldSample& field : fields) {
            RenderParams moved = params;
            moved.fieldSelection =
                field.time == frameTime ? Vellum::kFieldSelection_First : Vellum::kFieldSelection_Second;
            moved.clipTime = field.time;
            moved.time = params.time - params.clipTime + field.time;
            VideoFrameRef sample;
            const Status status = input->RenderFrame(token, moved, results, sample);
            if (Ostrand::Failed(status)) return status;
            WeightedFrames& list = field.fieldType == kUpperField ? upper : others;
            list.frames.push_back(sample);
            list.weights.push_back(static_cast<float>(field.weight));
        }
    }
    if (upper.frames.size() + others.frames.size() == 1) {
        frame = upper.frames.empty() ? others.frames.front() : upper.frames.front();
        return Ostrand::kStatus_OK;
    }
    return Sum(token, params, results, upper, others, frame);
}

Status TimeSampleSource::Sum(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                             const WeightedFrames& upper, const WeightedFrames& others, VideoFrameRef& frame) {
    const VideoFrameRef& first = upper.frames.empty() ? others.frames.front() : upper.frames.front();
    const Vellum::Rect bounds = first->GetBounds();
    VideoFrameRef target;
    Status status = TryWithPurge(token, params, results, [&] {
        return Kiln::CreateGPUVideoFrame(target, mDevice, first->GetPixelFormat(), bounds.Width(), bounds.Height(),
                                         first->GetPixelAspectRatio(), Vellum::kFieldType_Progressive,
                                         first->GetOrigin());
    });
    if (Ostrand::Failed(status)) return status;
    if (upper.frames.empty() || others.frames.empty()) {
        status = Accumulate(upper.frames.empty() ? others : upper, target, Kiln::kAccumulate_Frame);
    } else {
        status = Accumulate(upper, target, Kiln::kAccumulate_UpperField);
        if (!Ostrand::Failed(status)) status = Accumulate(others, target, Kiln::kAccumulate_LowerField);
    }
    if (!Ostrand::Failed(status)) frame = target;
    return status;
}

Status TimeSampleSource::Accumulate(const WeightedFrames& samples, const VideoFrameRef& target,
                                    std::int32_t mode) const {
    const FrameBuffer to = FrameBuffer::Demand(target);
    std::vector<Kiln::DeviceBuffer> sources;
    for (const VideoFrameRef& sample : samples.frames) {
        const FrameBuffer source = FrameBuffer::Demand(sample);
        if (source.bounds != to.bounds || source.rowBytes != to.rowBytes) return Ostrand::kStatus_Failure;
        sources.push_back(source.data);
    }
    return Kiln::Accumulate(mDevice, sources.data(), samples.weights.data(), static_cast<std::int32_t>(sources.size()),
                            to.data, to.rowBytes, to.Width(), to.format, to.Height(), mode);
}

}  // namespace Vantrel
