// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Vellum/Timecode.h"

#include <algorithm>
#include <array>
#include <cinttypes>
#include <cstdio>

namespace Vellum {
namespace {

constexpr std::int64_t kSecondsOfMinute = 60, kMinutesOfHour = 60;

/// The number that a frame bears when the first numbers of nine minutes in ten are left out.
std::int64_t NumberWithDrops(std::int64_t frame, std::int64_t base, std::int64_t dropped) {
    constexpr std::int64_t kMinutes = 10;
    const std::int64_t minute = base * kSecondsOfMinute - dropped;
    const std::int64_t tenMinutes = minute * kMinutes + dropped;
    const std::int64_t tens = frame / tenMinutes, rest = frame % tenMinutes;
    // The first minute of the ten is longer: it has all its numbers.
    const std::int64_t minutes = rest < dropped ? 0 : (rest - dropped) / minute;
    return frame + dropped * (tens * (kMinutes - 1) + minutes);
}

template <class... Values>
std::string Format(const char* format, Values... values) {
    std::array<char, 96> text{};
    static_cast<void>(std::snprintf(text.data(), text.size(), format, values...));
    return text.data();
}

std::string ClockText(std::int64_t frame, std::int64_t base, bool drops) {
    constexpr std::int64_t kDroppedOf30 = 2;
    const std::int64_t number = drops ? NumberWithDrops(frame, base, kDroppedOf30 * base / 30) : frame;
    const std::int64_t seconds = number / base, minutes = seconds / kSecondsOfMinute;
    return Format("%02" PRId64 ":%02" PRId64 ":%02" PRId64 "%c%02" PRId64, minutes / kMinutesOfHour,
                  minutes % kMinutesOfHour, seconds % kSecondsOfMinute, drops ? ';' : ':', number % base);
}

std::string FilmText(std::int64_t frame, std::int64_t framesOfFoot) {
    return Format("%" PRId64 "+%02" PRId64, frame / framesOfFoot, frame % framesOfFoot);
}

}  // namespace

FrameRate GetFrameRateForTimeDisplay(std::int32_t display, FrameRate rate) {
    switch (display) {
        case kTimeDisplay_25:
            return FrameRate::FromFraction(25, 1);
        case kTimeDisplay_2997Drop:
        case kTimeDisplay_2997:
            return FrameRate::FromFraction(30000, 1001);
        case kTimeDisplay_30:
            return FrameRate::FromFraction(30, 1);
        case kTimeDisplay_50:
            return FrameRate::FromFraction(50, 1);
        case kTimeDisplay_5994Drop:
        case kTimeDisplay_5994:
            return FrameRate::FromFraction(60000, 1001);
        case kTimeDisplay_23976:
            return FrameRate::FromFraction(24000, 1001);
        default:
            return rate;
    }
}

std::int64_t ToFrame64(TickTime time, FrameRate rate) {
    return rate.GetTicksPerFrame() <= 0 ? 0 : time.GetTicks() / rate.GetTicksPerFrame();
}

std::string TimeToTimecode(TickTime time, FrameRate rate, std::int32_t display) {
    const std::int64_t signedFrame = ToFrame64(time, rate);
    const std::int64_t frame = signedFrame < 0 ? -signedFrame : signedFrame;
    const std::string sign = signedFrame < 0 ? "-" : "";
    switch (display) {
        case kTimeDisplay_Frames:
            return sign + Format("%" PRId64, frame);
        case kTimeDisplay_Film16:
            return sign + FilmText(frame, 40);
        case kTimeDisplay_Film35:
            return sign + FilmText(frame, 16);
        default:
            break;
    }
    const std::int64_t ticks = std::max<std::int64_t>(rate.GetTicksPerFrame(), 1);
    const std::int64_t base = std::max<std::int64_t>((kTicksPerSecond + ticks / 2) / ticks, 1);
    const bool drops = display == kTimeDisplay_2997Drop || display == kTimeDisplay_5994Drop;
    return sign + ClockText(frame, base, drops);
}

}  // namespace Vellum
