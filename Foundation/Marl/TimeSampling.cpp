// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Marl/TimeSampling.h"

#include <algorithm>
#include <cmath>

namespace Marl {

namespace {

/// A smaller share than this comes from times that were rounded to ticks, and can't be seen.
constexpr double kLeastShare = 1e-6;

std::int64_t Align(std::int64_t time, Vellum::FrameRate rate) {
    Vellum::TickTime aligned(time);
    aligned.AlignToFrame(rate);
    return aligned.GetTicks();
}

/// Limited to the end of time; a speed that isn't a number counts as that of a held frame.
std::int64_t Scale(std::int64_t ticks, double speed) {
    const double scaled = static_cast<double>(ticks) * speed + 0.5;
    if (!(scaled > 0.0)) return 0;
    return scaled < static_cast<double>(Vellum::kTime_Max) ? static_cast<std::int64_t>(scaled) : Vellum::kTime_Max;
}

/// Names the fields of a frame in the order in which they are shown backwards.
void ExchangeFields(std::vector<TimeSample>& samples, Vellum::FrameRate fieldRate) {
    for (TimeSample& sample : samples) {
        sample.time =
            sample.time == sample.frameTime ? sample.frameTime + fieldRate.GetTicksPerFrame() : sample.frameTime;
    }
}

}  // namespace

TimeSpan CalculateDurationInMediaTime(std::int64_t instant, Vellum::FrameRate outputRate, double speed) {
    return {instant, instant + Scale(outputRate.GetTicksPerFrame(), std::fabs(speed))};
}

bool IsDegenerate(const TimeSpan& span, Vellum::FrameRate fieldRate) {
    return fieldRate.GetTicksPerFrame() <= 0 || span.end - span.start <= fieldRate.GetTicksPerFrame();
}

void GetWeightedSamplesForRange(const TimeSpan& span, Vellum::FrameRate fieldRate, Vellum::FrameRate frameRate,
                                std::uint32_t fieldIndex, std::vector<TimeSample>& samples) {
    const std::int64_t step = fieldRate.GetTicksPerFrame();
    if (step <= 0) return;
    const std::int64_t first = Align(span.start, fieldRate);
    const std::int64_t fieldsEach = 1 + (span.end - first - 1) / step / kMostSamples;
    for (std::int64_t time = first; time < span.end; time += fieldsEach * step) {
        const std::int64_t covered = std::min(time + fieldsEach * step, span.end) - std::max(time, span.start);
        const std::int64_t shown = time + fieldsEach / 2 * step;
        samples.push_back({shown, Align(shown, frameRate), fieldIndex, static_cast<double>(covered)});
    }
}

void NormalizeSampleWeights(std::vector<TimeSample>& samples) {
    double sum = 0.0;
    for (const TimeSample& sample : samples) sum += sample.weight;
    if (!(sum > 0.0)) return;
    for (TimeSample& sample : samples) sample.weight /= sum;
    const auto isSliver = [](const TimeSample& sample) { return sample.weight < kLeastShare; };
    samples.erase(std::remove_if(samples.begin(), samples.end(), isSliver), samples.end());
}

void GetSamplesAroundTime(std::int64_t time, Vellum::FrameRate fieldRate, bool blend, std::int64_t& before,
                          std::int64_t& after) {
    before = Align(time, fieldRate);
    after = before;
    if (before == time) return;
    after = before + fieldRate.GetTicksPerFrame();
    if (blend) return;
    const bool earlierIsNearest = time - before <= after - time;
    before = after = earlierIsNearest ? before : after;
}

double CalculateSampleWeight(std::int64_t time, std::int64_t before, std::int64_t after) {
    if (before == after) return 1.0;
    const double share = static_cast<double>(after - time) / static_cast<double>(after - before);
    if (share < kLeastShare) return 0.0;
    return share > 1.0 - kLeastShare ? 1.0 : share;
}

std::vector<TimeSample> SampleMoment(std::int64_t instant, const StreamTiming& stream, const SampledOutput& output) {
    constexpr std::uint32_t kWholePicture = 0;
    if (stream.backwards) {
        const std::int64_t rest = output.frameRate.GetTicksPerFrame() - output.pictureRate.GetTicksPerFrame();
        instant += Scale(rest, stream.speed);
    }
    std::vector<TimeSample> samples;
    const TimeSpan span = CalculateDurationInMediaTime(instant, output.pictureRate, stream.speed);
    if (output.blend && !IsDegenerate(span, stream.fieldRate)) {
        GetWeightedSamplesForRange(span, stream.fieldRate, stream.frameRate, kWholePicture, samples);
        NormalizeSampleWeights(samples);
    } else {
        std::int64_t before = 0;
        std::int64_t after = 0;
        GetSamplesAroundTime(instant, stream.fieldRate, output.blend, before, after);
        const double share = CalculateSampleWeight(instant, before, after);
        const auto add = [&](std::int64_t time, double weight) {
            if (weight > 0.0) samples.push_back({time, Align(time, stream.frameRate), kWholePicture, weight});
        };
        add(before, share);
        add(after, 1.0 - share);
    }
    if (stream.backwards && stream.fieldRate != stream.frameRate) ExchangeFields(samples, stream.fieldRate);
    return samples;
}

}  // namespace Marl
