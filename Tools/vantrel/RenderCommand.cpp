// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <atomic>
#include <charconv>
#include <csignal>
#include <cstdio>
#include <iostream>
#include <memory>
#include <optional>

#include "Commands.h"
#include "Host/Output/FrameWriter.h"
#include "Host/Render/OutputQueue.h"
#include "Host/Session/RenderSession.h"
#include "Progress.h"

namespace Vantrel::Tool {

namespace {

using Host::RenderSession;
using Host::RenderSummary;

struct RenderArguments {
    std::string file;
    std::string output;
    std::string range;
    std::int64_t frame = -1;
    std::string size;
    std::uint32_t quality = 4;
    std::string device = "auto";
    std::vector<std::string> mediaRoots;
    std::string previews;
    std::uint64_t deviceMemoryMB = 0;
    bool alpha = false;
    bool report = false;
    bool strict = false;
    bool json = false;
};

std::atomic<bool> gStop{false};

void OnInterrupt(int) { gStop = true; }

/// Interrupts stop the render between two frames for as long as this lives.
class InterruptScope {
public:
    InterruptScope()
        : mOldInterrupt(std::signal(SIGINT, OnInterrupt)), mOldTerminate(std::signal(SIGTERM, OnInterrupt)) {}
    ~InterruptScope() {
        std::signal(SIGINT, mOldInterrupt);
        std::signal(SIGTERM, mOldTerminate);
    }
    InterruptScope(const InterruptScope&) = delete;
    InterruptScope& operator=(const InterruptScope&) = delete;

private:
    void (*mOldInterrupt)(int);
    void (*mOldTerminate)(int);
};

template <class Number>
std::optional<Number> ParseNumber(const std::string& text) {
    Number value{};
    const auto result = std::from_chars(text.data(), text.data() + text.size(), value);
    if (result.ec != std::errc() || result.ptr != text.data() + text.size()) return std::nullopt;
    return value;
}

/// "first:end" in frames, either side may be left out.
std::pair<std::int64_t, std::int64_t> ParseRange(const RenderArguments& arguments, std::int64_t frames) {
    if (arguments.frame >= 0) {
        if (arguments.frame >= frames) {
            throw UsageError("--frame " + std::to_string(arguments.frame) + ": the sequence has " +
                             std::to_string(frames) + " frames");
        }
        return {arguments.frame, arguments.frame + 1};
    }
    if (arguments.range.empty()) return {0, frames};
    const std::size_t colon = arguments.range.find(':');
    const std::string from = arguments.range.substr(0, colon);
    const std::string to = colon == std::string::npos ? "" : arguments.range.substr(colon + 1);
    const std::optional<std::int64_t> first = from.empty() ? 0 : ParseNumber<std::int64_t>(from);
    const std::optional<std::int64_t> end = to.empty() ? frames : ParseNumber<std::int64_t>(to);
    if (colon == std::string::npos || !first || !end || *first < 0 || *end <= *first || *end > frames) {
        throw UsageError("--range " + arguments.range +
                         ": expected FIRST:END with 0 <= FIRST < END <= " + std::to_string(frames));
    }
    return {*first, *end};
}

std::pair<std::int32_t, std::int32_t> ParseSize(const std::string& text, const Host::SequenceFormat& format) {
    if (text.empty()) return {format.width, format.height};
    const std::size_t cross = text.find('x');
    const auto width = ParseNumber<std::int32_t>(text.substr(0, cross));
    const auto height = cross == std::string::npos ? std::nullopt : ParseNumber<std::int32_t>(text.substr(cross + 1));
    if (!width || !height || *width < 1 || *height < 1 || *width > 16384 || *height > 16384) {
        throw UsageError("--size " + text + ": expected WIDTHxHEIGHT, each from 1 to 16384");
    }
    return {*width, *height};
}

Host::SessionOptions MakeSessionOptions(const RenderArguments& arguments) {
    Host::SessionOptions options;
    options.file = arguments.file;
    options.snapshot.mediaRoots = arguments.mediaRoots;
    options.snapshot.previews = arguments.previews;
    options.strict = arguments.strict;
    options.deviceMemory = arguments.deviceMemoryMB << 20;
    options.device = arguments.device == "cuda"     ? Host::DeviceChoice::kCuda
                     : arguments.device == "opencl" ? Host::DeviceChoice::kOpenCL
                                                    : Host::DeviceChoice::kAuto;
    return options;
}

double Percent(std::int64_t part, std::int64_t whole) {
    return whole == 0 ? 0.0 : 100.0 * static_cast<double>(part) / static_cast<double>(whole);
}

void PrintSummary(const RenderSession& session, const RenderSummary& summary, const std::string& output) {
    const double rate = summary.seconds > 0 ? static_cast<double>(summary.frames) / summary.seconds : 0;
    std::fprintf(stderr, "%s: %lld frames in %.2f s, %.1f fps, waited %.1f%% for media\n", output.c_str(),
                 static_cast<long long>(summary.frames), summary.seconds, rate,
                 summary.seconds > 0 ? 100.0 * summary.waitSeconds / summary.seconds : 0.0);
    std::fprintf(stderr,
                 "on %s: %.1f%% of frames on the device, %.1f%% partly the host's, %.1f%% the host's; peak device "
                 "memory %.1f MB\n",
                 session.GetDevice()->GetName().c_str(), Percent(summary.deviceFrames, summary.frames),
                 Percent(summary.partlyHostFrames, summary.frames), Percent(summary.hostFrames, summary.frames),
                 static_cast<double>(summary.peakDeviceBytes) / (1 << 20));
    if (summary.failedFrames > 0) {
        std::fprintf(stderr, "warning: the device gave up %lld frames, which the host rendered\n",
                     static_cast<long long>(summary.failedFrames));
    }
    for (const std::string& text : session.GetOffline()) std::fprintf(stderr, "offline: %s\n", text.c_str());
    for (const std::string& name : session.GetPassedThrough()) {
        std::fprintf(stderr, "passed through: effect \"%s\" is known neither to the device nor to the host\n",
                     name.c_str());
    }
    for (const std::string& text : session.GetService().GetFailures())
        std::fprintf(stderr, "failed: %s\n", text.c_str());
}

int Render(const RenderArguments& arguments) {
    RenderSession session(MakeSessionOptions(arguments));
    for (const std::string& warning : session.GetSnapshot().warnings) std::cerr << "warning: " << warning << "\n";
    const Host::SequenceFormat& sequence = session.GetSequence().format;
    const auto [first, end] = ParseRange(arguments, session.GetFrameCount());
    if (end <= first) throw UsageError(arguments.file + ": the sequence is empty");
    const auto [width, height] = ParseSize(arguments.size, sequence);

    Host::OutputFormat format;
    format.path = arguments.output;
    format.width = width;
    format.height = height;
    format.rate = Vellum::FrameRate::Create(sequence.frameTicks);
    format.aspect = {sequence.aspectNumerator, sequence.aspectDenominator};
    format.fieldType = static_cast<std::uint32_t>(sequence.fieldType);
    format.alpha = arguments.alpha;
    const std::unique_ptr<Host::FrameWriter> writer = Host::CreateFrameWriter(format, end - first);

    Host::RenderJob job;
    job.timelineID = session.GetSequence().timelineID;
    job.firstFrame = first;
    job.endFrame = end;
    job.width = width;
    job.height = height;
    job.quality = arguments.quality;
    job.format = writer->GetPixelFormat();
    job.alpha = arguments.alpha;
    job.report = arguments.report;

    const InterruptScope interrupts;
    Progress progress(Progress::ChooseForm(arguments.json), end - first);
    RenderSummary summary;
    {
        Host::OutputQueue queue(*writer);
        summary = session.Render(
            job,
            [&](Host::RenderedFrame frame) {
                if (!frame.report.empty()) {
                    std::cerr << "frame " << frame.number << "\n" << frame.report;
                }
                const std::int64_t done = frame.number - first + 1;
                queue.Push(std::move(frame));
                progress.Advance(done);
            },
            gStop);
        queue.Finish();
    }
    progress.End();
    if (summary.stopped) {
        std::cerr << "vantrel: interrupted after " << summary.frames << " of " << end - first << " frames\n";
        return kExit_Failed;
    }
    writer->Finish();
    PrintSummary(session, summary, arguments.output);
    const bool complete = session.GetOffline().empty() && session.GetPassedThrough().empty() &&
                          session.GetService().GetFailures().empty();
    return complete ? kExit_Done : kExit_Incomplete;
}

}  // namespace

void AddRenderCommand(CLI::App& app, int& status) {
    CLI::App* command = app.add_subcommand("render", "Render a timeline to a film or to pictures");
    const auto arguments = std::make_shared<RenderArguments>();
    command->add_option("file", arguments->file, "OpenTimelineIO file")->required();
    command->add_option("-o,--output", arguments->output, "FILE.(mp4|mov|mkv|png|exr); pictures take a %d or %0Nd")
        ->required();
    command->add_option("--range", arguments->range, "FIRST:END in frames, half open");
    command->add_option("--frame", arguments->frame, "One frame")->check(CLI::NonNegativeNumber)->excludes("--range");
    command->add_option("--size", arguments->size, "WIDTHxHEIGHT of the output, the sequence's if not given");
    command->add_option("--quality", arguments->quality, "1 (draft, half float on CUDA) to 4 (best)")
        ->check(CLI::Range(1, 4));
    command->add_option("--device", arguments->device)->check(CLI::IsMember({"auto", "cuda", "opencl"}));
    command->add_option("--device-memory", arguments->deviceMemoryMB, "Use at most this many megabytes of it");
    command->add_option("--media-root", arguments->mediaRoots, "Folder to look for media in, by name; may be repeated");
    command->add_option("--previews", arguments->previews, "Folder of rendered previews");
    command->add_flag("--alpha", arguments->alpha, "Keep the alpha channel (pictures)");
    command->add_flag("--report", arguments->report, "Print the engine's report for each frame");
    command->add_flag("--strict", arguments->strict, "An effect that nothing can render is a failure");
    command->add_flag("--json", arguments->json, "Progress as JSON lines");
    command->callback([arguments, &status] { status = Render(*arguments); });
}

}  // namespace Vantrel::Tool
