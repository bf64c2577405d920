// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <algorithm>
#include <string>

#include "Vantrel/Effects/EffectRow.h"
#include "Vellum/Timecode.h"

namespace Vantrel {

enum TimecodeParameter : std::int32_t {
    kTimecode_Position = 0,
    kTimecode_Size = 1,
    kTimecode_Opacity = 2,
    kTimecode_FieldSymbol = 3,
    kTimecode_Format = 4,
    kTimecode_Source = 5,
    kTimecode_TimeDisplay = 6,
    kTimecode_Offset = 7,
    kTimecode_StartingFrame = 8,
    kTimecode_Label = 9
};

[[nodiscard]] inline const char* GetTimecodeFormatName(std::int32_t choice) {
    constexpr const char* kNames[] = {"smpte", "frames", "feet_16mm", "feet_35mm"};
    return choice >= 0 && choice < 4 ? kNames[choice] : nullptr;
}
[[nodiscard]] inline const char* GetTimecodeSourceName(std::int32_t choice) {
    constexpr const char* kNames[] = {"clip", "media", "generator", "aux1", "aux2", "aux3", "aux4"};
    return choice >= 0 && choice < 7 ? kNames[choice] : nullptr;
}
[[nodiscard]] inline const char* GetTimecodeDisplayName(std::int32_t choice) {
    constexpr const char* kNames[] = {"24", "25", "30_drop", "30", "50", "60_drop", "60"};
    return choice >= 0 && choice < 7 ? kNames[choice] : nullptr;
}
[[nodiscard]] inline const char* GetTimecodeLabelName(std::int32_t choice) {
    constexpr const char* kNames[] = {"none",    "automatic", "camera1", "camera2", "camera3", "camera4",
                                      "camera5", "camera6",   "camera7", "camera8", "camera9"};
    return choice >= 0 && choice < 11 ? kNames[choice] : nullptr;
}

/// Burns a timecode in: white on a black box, laid over the picture with the opacity, in Liberation Sans.
///
/// The time is that of the clip, counted from its start on the track, or with the source "media" the media's own, from
/// its start timecode; stills have none and show the clip's. Frames keep their numbers when they are written: frame 48
/// of a sequence is frame 48 of the display, whatever their rates. SMPTE displays at 30 and 60 frames that drop leave
/// numbers out as broadcast at 29.97 and 59.94 does (SMPTE ST 12-1). The field symbol is a disc for a whole frame, its
/// upper or lower half for a field.
///
/// The text lies around its centre, and what leaves the frame is cut off; of a picture smaller than the frame the
/// whole frame is made where the text leaves the picture.
inline constexpr ParameterRow kTimecodeParameters[] = {
    {kTimecode_Position,
     "position",
     ParameterType::kPoint,
     "of the frame",
     0,
     1,
     {0.5, 0.9},
     nullptr,
     ParameterConversion::kAsIs,
     "the text's centre"},
    {kTimecode_Size,
     "size",
     ParameterType::kFloat,
     "points",
     1,
     400,
     {20},
     nullptr,
     ParameterConversion::kAsIs,
     "at full resolution, 96 pixels to an inch"},
    {kTimecode_Opacity, "opacity", ParameterType::kFloat, "%", 0, 100, {100}, nullptr, ParameterConversion::kPercent},
    {kTimecode_FieldSymbol, "field_symbol", ParameterType::kBool, "", 0, 1, {0}},
    {kTimecode_Format, "format", ParameterType::kInt, "", 0, 3, {0}, &GetTimecodeFormatName},
    {kTimecode_Source, "source", ParameterType::kInt, "", 0, 6, {0}, &GetTimecodeSourceName},
    {kTimecode_TimeDisplay, "time_display", ParameterType::kInt, "", 0, 6, {0}, &GetTimecodeDisplayName},
    {kTimecode_Offset,
     "offset",
     ParameterType::kFloat,
     "frames",
     -100000,
     100000,
     {0},
     nullptr,
     ParameterConversion::kAsIs,
     "added, without its fraction"},
    {kTimecode_StartingFrame,
     "starting_frame",
     ParameterType::kInt,
     "frames",
     0,
     10000000,
     {0},
     nullptr,
     ParameterConversion::kAsIs,
     "added in format smpte for every source but the clip"},
    {kTimecode_Label,
     "label",
     ParameterType::kInt,
     "",
     0,
     10,
     {0},
     &GetTimecodeLabelName,
     ParameterConversion::kAsIs,
     "three letters before the time; automatic names the source"},
};
inline constexpr EffectRow kTimecodeEffect{"TQ.XQVE Lspr Timecode",
                                           "Timecode",
                                           "Burns the clip's or the media's timecode in.",
                                           kTimecodeParameters,
                                           sizeof kTimecodeParameters / sizeof kTimecodeParameters[0],
                                           true};

/// What a timecode's text depends on besides its time.
struct TimecodeText {
    std::int32_t format = 0;
    std::int32_t source = 0;
    std::int32_t timeDisplay = 0;
    float offset = 0.0F;
    std::int32_t startingFrame = 0;
    std::int32_t label = 0;

    /// The display's code in Vellum.
    [[nodiscard]] std::int32_t GetDisplay() const {
        constexpr std::int32_t kSmpte[] = {Vellum::kTimeDisplay_23976,    Vellum::kTimeDisplay_25,
                                           Vellum::kTimeDisplay_2997Drop, Vellum::kTimeDisplay_2997,
                                           Vellum::kTimeDisplay_50,       Vellum::kTimeDisplay_5994Drop,
                                           Vellum::kTimeDisplay_5994};
        constexpr std::int32_t kOthers[] = {Vellum::kTimeDisplay_Frames, Vellum::kTimeDisplay_Film16,
                                            Vellum::kTimeDisplay_Film35};
        if (format == 0 && timeDisplay >= 0 && timeDisplay < 7) return kSmpte[timeDisplay];
        return format >= 1 && format <= 3 ? kOthers[format - 1] : Vellum::kTimeDisplay_30;
    }

    /// With the blank behind it; empty for none.
    [[nodiscard]] std::string GetLabel() const {
        constexpr const char* kSources[] = {"CLP ", "MDA ", "TCG ", "AX1 ", "AX2 ", "AX3 ", "AX4 "};
        if (label == 1) return source >= 0 && source < 7 ? kSources[source] : "";
        return label >= 2 && label <= 10 ? "CM" + std::to_string(label - 1) + " " : "";
    }

    /// Frames to add; more than a hundred million are no time.
    [[nodiscard]] std::int64_t GetAddedFrames() const {
        constexpr float kMost = 1e8F;
        const float whole = offset == offset ? std::clamp(offset, -kMost, kMost) : 0.0F;
        const auto starting =
            std::clamp<std::int64_t>(source != 0 && format == 0 ? startingFrame : 0, -100000000, 100000000);
        return static_cast<std::int64_t>(whole) + starting;
    }
};

/// The text of a time.
/// @param ticks       a quarter of a frame is added, so that a time just before a frame's counts as that frame
/// @param frameTicks  of the sequence
[[nodiscard]] inline std::string FormatTimecode(const TimecodeText& text, std::int64_t ticks, std::int64_t frameTicks) {
    std::int64_t inFrame = ticks + frameTicks / 4;
    if (inFrame < 0) inFrame -= frameTicks / 2;
    const Vellum::FrameRate rate = Vellum::FrameRate::Create(frameTicks);
    const std::int32_t code = text.GetDisplay();
    const Vellum::FrameRate display = text.format == 0 ? Vellum::GetFrameRateForTimeDisplay(code, rate) : rate;
    const Vellum::TickTime moved(inFrame + text.GetAddedFrames() * display.GetTicksPerFrame());
    const Vellum::TickTime shown(Vellum::ToFrame64(moved, rate), display);
    return text.GetLabel() + Vellum::TimeToTimecode(shown, display, code);
}

}  // namespace Vantrel
