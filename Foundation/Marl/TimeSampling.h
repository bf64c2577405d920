// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <vector>

#include "Vellum/Time.h"

/// Which frames of a stream show what happens at a moment or during a stretch of its time. Times in ticks; frame n of a
/// stream lasts from n to n + 1 frame durations.
namespace Marl {

/// A stretch of media time, half open.
struct TimeSpan {
    std::int64_t start = 0;
    std::int64_t end = 0;

    friend constexpr bool operator==(const TimeSpan& a, const TimeSpan& b) {
        return a.start == b.start && a.end == b.end;
    }
};

/// A frame or field of the stream and its share in a picture.
struct TimeSample {
    std::int64_t time = 0;         ///< where the field begins; for a whole frame its own beginning
    std::int64_t frameTime = 0;    ///< where the frame that holds it begins
    std::uint32_t fieldIndex = 0;  ///< of the picture: 1 and 2 its upper and lower field, 0 all of it
    double weight = 1.0;           ///< 0.0 to 1.0
};

/// The media time that is shown from a media instant on, for an output rate and a speed (1.0: one second a second). At
/// most Vellum::kTime_Max long.
[[nodiscard]] TimeSpan CalculateDurationInMediaTime(std::int64_t instant, Vellum::FrameRate outputRate, double speed);

/// A span that covers no more than one field of the stream: it says nothing about shares, and its instant alone counts.
[[nodiscard]] bool IsDegenerate(const TimeSpan& span, Vellum::FrameRate fieldRate);

/// More fields than this in one picture can't be told apart any more.
constexpr std::int64_t kMostSamples = 64;

/// Appends the stream's fields that a span touches, each weighted by the ticks of it that lie within the span. Of a
/// span of more than kMostSamples fields it takes about that many, evenly spread, each for the stretch around it.
void GetWeightedSamplesForRange(const TimeSpan& span, Vellum::FrameRate fieldRate, Vellum::FrameRate frameRate,
                                std::uint32_t fieldIndex, std::vector<TimeSample>& samples);

/// Brings the weights to a sum of 1 and drops samples below a millionth of it; a list without weight stays as it is.
void NormalizeSampleWeights(std::vector<TimeSample>& samples);

/// The beginnings of the fields on both sides of a time. On a field's beginning, and when `blend` is false, both are
/// the nearest one (of two as near the earlier). A rate of zero gives the time itself.
void GetSamplesAroundTime(std::int64_t time, Vellum::FrameRate fieldRate, bool blend, std::int64_t& before,
                          std::int64_t& after);

/// The share of `before` in the picture at a time between the two: 1.0 on `before`, falling to 0.0 on `after`; 1.0 when
/// they are one. A share within a millionth of 0.0 or 1.0 counts as that.
[[nodiscard]] double CalculateSampleWeight(std::int64_t time, std::int64_t before, std::int64_t after);

/// How the time of a stream runs under a clip.
struct StreamTiming {
    Vellum::FrameRate frameRate;
    Vellum::FrameRate fieldRate;  ///< of the separate fields that can be had; the frame rate if none can
    double speed = 1.0;           ///< 1.0: one second a second; never below 0
    bool backwards = false;
};

/// What is made of a stream.
struct SampledOutput {
    Vellum::FrameRate frameRate;
    Vellum::FrameRate pictureRate;  ///< of fields, where each is a picture of its own; else the frame rate
    bool blend = false;
};

/// The fields that show what happens from a media instant on for as long as a picture of the output lasts: the nearest
/// one, or with blending all that the picture covers, or the two around its moment when it covers no more than one.
///
/// A clip that plays backwards maps the beginning of an output *frame* to the beginning of the media stretch that the
/// frame shows in reverse. A field shows half of that stretch, the later half first. And since what is the second field
/// of a frame comes first then, the samples of separate fields name a frame's fields in the order in which they are
/// shown: the later one has the frame's own time, the earlier one lies half a frame after it.
///
/// @param instant  what the clip maps the beginning of the picture to
[[nodiscard]] std::vector<TimeSample> SampleMoment(std::int64_t instant, const StreamTiming& stream,
                                                   const SampledOutput& output);

}  // namespace Marl
