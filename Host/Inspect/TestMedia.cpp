// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Inspect/TestMedia.h"

#include <algorithm>
#include <cmath>
#include <filesystem>
#include <map>

#include "Host/Media/NumberPicture.h"
#include "Host/Output/FrameWriter.h"
#include "Host/Time/Timecode.h"

namespace Vantrel::Host {

namespace {

constexpr std::int32_t kWidth = 320;
constexpr std::int32_t kHeight = 180;
/// A reference that says nothing of itself still gets something to show.
constexpr std::int64_t kDefaultFrames = 24;

std::string FileNameOf(const Item& clip) {
    if (clip.media.kind == ReferenceKind::kMissing) return clip.name.empty() ? "" : clip.name + ".mov";
    if (clip.media.kind != ReferenceKind::kFile) return {};
    const std::filesystem::path path(clip.media.file);
    const std::string extension = path.extension().string();
    return extension == ".mov" || extension == ".mp4" || extension == ".mkv" ? path.filename().string()
                                                                             : path.filename().string() + ".mov";
}

/// The frame length of the first item that has one: what clips go by that are used whole.
std::int64_t FirstFrameTicks(const Item& item) {
    if (item.sourceFrameTicks > 0) return item.sourceFrameTicks;
    for (const Item& child : item.children) {
        if (const std::int64_t ticks = FirstFrameTicks(child); ticks > 0) return ticks;
    }
    return 0;
}

void Collect(const Item& item, std::int64_t defaultTicks, std::map<std::string, TestMediaPlan>& plans) {
    for (const Item& child : item.children) Collect(child, defaultTicks, plans);
    if (item.kind != ItemKind::kClip) return;
    const std::string name = FileNameOf(item);
    const std::int64_t ticks = item.sourceFrameTicks > 0 ? item.sourceFrameTicks : defaultTicks;
    if (name.empty() || ticks <= 0) return;
    TimeRange range{0, kDefaultFrames * ticks};
    if (item.media.availableRange) {
        range = *item.media.availableRange;
    } else if (item.sourceRange) {
        // The film begins at 0 and reaches as far as the clip, at its speed, asks for.
        const double used = static_cast<double>(item.sourceRange->duration) * std::max(1.0, std::abs(item.speed));
        range = {0, item.sourceRange->start + static_cast<std::int64_t>(used)};
    }
    const std::int64_t first = range.start / ticks;
    const std::int64_t count = std::max<std::int64_t>(1, (range.duration + ticks / 2) / ticks);
    const auto [known, isNew] = plans.try_emplace(name, TestMediaPlan{name, first, count, ticks});
    if (isNew) return;
    const std::int64_t end = std::max(known->second.firstFrame + known->second.frameCount, first + count);
    known->second.firstFrame = std::min(known->second.firstFrame, first);
    known->second.frameCount = end - known->second.firstFrame;
}

}  // namespace

std::vector<TestMediaPlan> PlanTestMedia(const Document& document) {
    std::map<std::string, TestMediaPlan> plans;
    Collect(document.tracks, FirstFrameTicks(document.tracks), plans);
    std::vector<TestMediaPlan> result;
    result.reserve(plans.size());
    for (const auto& [name, plan] : plans) result.push_back(plan);
    return result;
}

void WriteTestMedia(const std::vector<TestMediaPlan>& plans, const std::string& folder,
                    const std::function<void(const std::string&)>& progress) {
    const std::shared_ptr<PixelBufferPool> pool = PixelBufferPool::Create();
    for (const TestMediaPlan& plan : plans) {
        OutputFormat format;
        format.path = (std::filesystem::path(folder) / plan.name).string();
        format.width = kWidth;
        format.height = kHeight;
        format.rate = Vellum::FrameRate::Create(plan.ticksPerFrame);
        if (plan.firstFrame > 0) format.timecode = TimecodeOf(plan.firstFrame, plan.ticksPerFrame);
        progress(format.path);
        const std::unique_ptr<FrameWriter> writer = CreateFrameWriter(format, plan.frameCount);
        const std::shared_ptr<HostPicture> picture =
            MakeHostPicture(*pool, Vellum::kPixelFormat_BGRA_4444_8u, kWidth, kHeight);
        for (std::int64_t i = 0; i < plan.frameCount; ++i) {
            DrawNumber(*picture, static_cast<std::uint32_t>(plan.firstFrame + i));
            writer->Write(*picture, i);
        }
        writer->Finish();
    }
}

}  // namespace Vantrel::Host
