// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Inspect/InspectionText.h"

#include <algorithm>
#include <array>
#include <cstdio>

namespace Vantrel::Host {

namespace {

/// What stands for a way of rendering: a letter, small where it isn't real time, or a background colour of the 256.
struct Look {
    char letter;
    char slowLetter;
    int color;
    const char* legend;
};
constexpr std::array<Look, 4> kLooks = {
    {{'.', '.', 238, "gap"}, {'D', 'd', 71, "device"}, {'P', 'p', 172, "partly host"}, {'H', 'h', 131, "host"}}};
constexpr int kLeastWidth = 40;

const Look& LookOf(Rendering rendering) { return kLooks[static_cast<std::size_t>(rendering)]; }

class TextWriter {
public:
    TextWriter(const Inspection& inspection, const TextStyle& style)
        : mInspection(inspection),
          mColors(style.colors),
          mWidth(std::max(kLeastWidth, style.width)),
          mFrames(std::max<std::int64_t>(1, inspection.GetFrameCount())) {}

    std::string Write() {
        WriteHead();
        if (mInspection.stretches.empty()) return mText + "The sequence is empty.\n";
        WriteBar();
        WriteScale();
        WriteLegend();
        mText += "\n";
        WriteTable();
        return mText;
    }

private:
    void WriteHead() {
        const SequenceFormat& format = mInspection.format;
        const double rate = static_cast<double>(Vellum::kTicksPerSecond) / static_cast<double>(format.frameTicks);
        char text[160];
        (void)std::snprintf(text, sizeof text, ": %dx%d, %.6g fps, %lld frames, on %s (", format.width, format.height,
                            rate, static_cast<long long>(mInspection.GetFrameCount()), mInspection.framework.c_str());
        mText += mInspection.file + text + mInspection.deviceName + ")\n\n";
    }

    /// What a column stands for: the worst of what lies in it, so that a short stretch isn't lost.
    [[nodiscard]] const Stretch* PickForColumn(int column) const {
        const std::int64_t first = mFrames * column / mWidth;
        const std::int64_t end = std::max(first + 1, mFrames * (column + 1) / mWidth);
        const Stretch* worst = nullptr;
        for (const Stretch& stretch : mInspection.stretches) {
            if (stretch.endFrame <= first || stretch.firstFrame >= end) continue;
            const bool worse = !worst || stretch.rendering > worst->rendering ||
                               (stretch.rendering == worst->rendering && !stretch.info.realTime);
            if (worse) worst = &stretch;
        }
        return worst;
    }

    void Cell(Rendering rendering, bool realTime) {
        const Look& look = LookOf(rendering);
        if (!mColors) {
            mText += realTime ? look.letter : look.slowLetter;
            return;
        }
        mText += "\033[48;5;" + std::to_string(look.color) + ";38;5;16m";
        mText += realTime || rendering == Rendering::kGap ? ' ' : '/';
        mText += "\033[0m";
    }

    void WriteBar() {
        for (int column = 0; column < mWidth; ++column) {
            const Stretch* stretch = PickForColumn(column);
            Cell(stretch ? stretch->rendering : Rendering::kGap, !stretch || stretch->info.realTime);
        }
        mText += "\n";
    }

    /// Marks at the roundest distance that leaves room for their timecodes.
    [[nodiscard]] std::int64_t ScaleStep(std::int64_t columns) const {
        constexpr std::int64_t kFrames[] = {1, 2, 5, 10};
        constexpr std::int64_t kSeconds[] = {1, 2, 5, 10, 15, 30, 60, 120, 300, 600, 900, 1800, 3600, 7200};
        const std::int64_t second = std::max<std::int64_t>(
            1, (Vellum::kTicksPerSecond + mInspection.format.frameTicks / 2) / mInspection.format.frameTicks);
        const auto fits = [&](std::int64_t step) { return step * mWidth >= columns * mFrames; };
        for (const std::int64_t frames : kFrames) {
            if (frames < second && fits(frames)) return frames;
        }
        for (const std::int64_t seconds : kSeconds) {
            if (fits(seconds * second)) return seconds * second;
        }
        return mFrames;
    }

    void WriteScale() {
        const std::string last = mInspection.GetTimecode(mFrames) + "|";
        const std::size_t room = last.size() + 2;
        std::string line(static_cast<std::size_t>(mWidth), ' ');
        const std::int64_t step = ScaleStep(static_cast<std::int64_t>(room));
        for (std::int64_t frame = 0; frame < mFrames; frame += step) {
            const auto column = static_cast<std::size_t>(frame * mWidth / mFrames);
            if (column + 2 * room > line.size()) break;
            line.replace(column, last.size(), "|" + mInspection.GetTimecode(frame));
        }
        line.replace(line.size() - last.size(), last.size(), last);
        mText += line + "\n";
    }

    void WriteLegend() {
        for (const Rendering rendering :
             {Rendering::kDevice, Rendering::kPartlyHost, Rendering::kHost, Rendering::kGap}) {
            Cell(rendering, true);
            const double percent =
                100.0 * static_cast<double>(mInspection.CountFrames(rendering)) / static_cast<double>(mFrames);
            char text[64];
            (void)std::snprintf(text, sizeof text, " %s %.0f%%   ", LookOf(rendering).legend, percent);
            mText += text;
        }
        mText += mColors ? "/ not real time\n" : "small letters: not real time\n";
    }

    void WriteTable() {
        mText += "     first  frames  from         to           rendered by  ";
        mText += "real time  effects  motion  transitions  layers\n";
        std::size_t number = 0;
        for (const Stretch& stretch : mInspection.stretches) {
            // Between two frames nothing is ever rendered.
            if (stretch.CountFrames() == 0) continue;
            const SegmentInfo& info = stretch.info;
            char text[200];
            (void)std::snprintf(
                text, sizeof text, "%3zu %6lld %7lld  %-12s %-12s ", number++,
                static_cast<long long>(stretch.firstFrame), static_cast<long long>(stretch.CountFrames()),
                mInspection.GetTimecode(stretch.firstFrame).c_str(), mInspection.GetTimecode(stretch.endFrame).c_str());
            mText += text;
            Name(stretch.rendering);
            if (stretch.rendering != Rendering::kGap) {
                (void)std::snprintf(text, sizeof text, "%-9s %8d %7d %12d %7d", info.realTime ? "yes" : "no",
                                    info.effectCount, info.intrinsicCount, info.transitionCount, info.layerCount);
                mText += text;
            }
            mText.erase(mText.find_last_not_of(' ') + 1);
            mText += "\n";
            for (const Reason& reason : stretch.reasons) mText += "      - " + reason.text + "\n";
        }
    }

    void Name(Rendering rendering) {
        char text[32];
        (void)std::snprintf(text, sizeof text, "%-12s ", GetName(rendering));
        if (!mColors) {
            mText += text;
            return;
        }
        mText += "\033[38;5;" + std::to_string(LookOf(rendering).color + (rendering == Rendering::kGap ? 6 : 0)) + "m";
        mText += text;
        mText += "\033[0m";
    }

    const Inspection& mInspection;
    const bool mColors;
    const int mWidth;
    const std::int64_t mFrames;
    std::string mText;
};

}  // namespace

std::string InspectionToText(const Inspection& inspection, const TextStyle& style) {
    return TextWriter(inspection, style).Write();
}

}  // namespace Vantrel::Host
