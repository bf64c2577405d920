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

}  // namespace

TimeSpan CalculateDurationInMediaTime(std::int64_t instant, Vellum::FrameRate outputRate, double speed) {
    const double duration = static_cast<double>(outputRate.GetTicksPerFrame()) * std::fabs(speed);
    return {instant, instant + static_cast<std::int64_t>(duration + 0.5)};
}

bool IsDegenerate(const TimeSpan& span, Vellum::FrameRate fieldRate) {
    return fieldRate.GetTicksPerFrame() <= 0 || span.end - span.start <= fieldRate.GetTicksPerFrame();
}

void GetWeightedSamplesForRange(const TimeSpan& span, Vellum::FrameRate fieldRate, Vellum::FrameRate frameRate,
                                std::uint32_t fieldIndex, std::vector<TimeSample>& samples) {
    const std::int64_t step = fieldRate.GetTicksPerFrame();
    if (step <= 0) return;
    for (std::int64_t time = Align(span.start, fieldRate); time < span.end; time += step) {
        const std::int64_t covered = std::min(time + step, span.end) - std::max(time, span.start);
        samples.push_back({time, Align(time, frameRate), fieldIndex, static_cast<double>(covered)});
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

}  // namespace Marl
