// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <cstdio>
#include <iostream>
#include <memory>

#include "Commands.h"
#include "Host/Output/FrameWriter.h"
#include "Host/Render/OutputQueue.h"
#include "Interrupts.h"
#include "Progress.h"
#include "SessionArguments.h"

namespace Vantrel::Tool {

namespace {

using Host::RenderSession;
using Host::RenderSummary;

struct RenderArguments {
    SessionArguments session;
    std::string output;
    std::string range;
    std::int64_t frame = -1;
    std::string size;
    std::uint32_t quality = 4;
    std::string previews;
    bool alpha = false;
    bool report = false;
    bool strict = false;
    bool json = false;
};

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

Host::SessionOptions MakeRenderOptions(const RenderArguments& arguments) {
    Host::SessionOptions options = MakeSessionOptions(arguments.session);
    options.snapshot.previews = arguments.previews;
    options.strict = arguments.strict;
    return options;
}

double Percent(std::int64_t part, std::int64_t whole) {
    return whole == 0 ? 0.0 : 100.0 * static_cast<double>(part) / static_cast<double>(whole);
}

void PrintSummary(const RenderSession& session, const RenderSummary& summary, const std::string& output) {
    const double rate = summary.seconds > 0 ? static_cast<double>(summary.frames) / summary.seconds : 0;
    (void)std::fprintf(stderr, "%s: %lld frames in %.2f s, %.1f fps, waited %.1f%% for media\n", output.c_str(),
                       static_cast<long long>(summary.frames), summary.seconds, rate,
                       summary.seconds > 0 ? 100.0 * summary.waitSeconds / summary.seconds : 0.0);
    (void)std::fprintf(
        stderr,
        "on %s: %.1f%% of frames on the device, %.1f%% partly the host's, %.1f%% the host's; peak device "
        "memory %.1f MB\n",
        session.GetDevice()->GetName().c_str(), Percent(summary.deviceFrames, summary.frames),
        Percent(summary.partlyHostFrames, summary.frames), Percent(summary.hostFrames, summary.frames),
        static_cast<double>(summary.peakDeviceBytes) / (1 << 20));
    if (summary.failedFrames > 0) {
        (void)std::fprintf(stderr, "warning: the device gave up %lld frames, which the host rendered\n",
                           static_cast<long long>(summary.failedFrames));
    }
    for (const std::string& text : session.GetOffline()) (void)std::fprintf(stderr, "offline: %s\n", text.c_str());
    for (const std::string& name : session.GetPassedThrough()) {
        (void)std::fprintf(stderr, "passed through: effect \"%s\" is known neither to the device nor to the host\n",
                           name.c_str());
    }
    for (const std::string& text : session.GetService().GetFailures())
        (void)std::fprintf(stderr, "failed: %s\n", text.c_str());
}

int Render(const RenderArguments& arguments) {
    RenderSession session(MakeRenderOptions(arguments));
    for (const std::string& warning : session.GetSnapshot().warnings) std::cerr << "warning: " << warning << "\n";
    const Host::SequenceFormat& sequence = session.GetSequence().format;
    const auto range = ParseRange(arguments, session.GetFrameCount());
    const std::int64_t first = range.first, end = range.second;
    if (end <= first) throw UsageError(arguments.session.file + ": the sequence is empty");
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
            interrupts.GetStop());
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
    AddSessionArguments(*command, arguments->session);
    command->add_option("-o,--output", arguments->output, "FILE.(mp4|mov|mkv|png|exr); pictures take a %d or %0Nd")
        ->required();
    command->add_option("--range", arguments->range, "FIRST:END in frames, half open");
    command->add_option("--frame", arguments->frame, "One frame")->check(CLI::NonNegativeNumber)->excludes("--range");
    command->add_option("--size", arguments->size, "WIDTHxHEIGHT of the output, the sequence's if not given");
    command->add_option("--quality", arguments->quality, "1 (draft, half float on CUDA) to 4 (best)")
        ->check(CLI::Range(1, 4));
    command->add_option("--previews", arguments->previews, "Folder of rendered previews");
    command->add_flag("--alpha", arguments->alpha, "Keep the alpha channel (pictures)");
    command->add_flag("--report", arguments->report, "Print the engine's report for each frame");
    command->add_flag("--strict", arguments->strict, "An effect that nothing can render is a failure");
    command->add_flag("--json", arguments->json, "Progress as JSON lines");
    command->callback([arguments, &status] { status = Render(*arguments); });
}

}  // namespace Vantrel::Tool
