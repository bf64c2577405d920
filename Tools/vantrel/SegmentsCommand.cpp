// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <iostream>
#include <memory>
#include <optional>

#include "Commands.h"
#include "Host/Inspect/SegmentsJson.h"
#include "Host/Media/FFmpegProbe.h"
#include "Host/Timeline/OtioReader.h"
#include "SessionArguments.h"

namespace Vantrel::Tool {

namespace {

struct SegmentsArguments {
    std::string file;
    std::string device = "auto";
    std::vector<std::string> mediaRoots;
};

void Print(const Host::Snapshot& snapshot, const Host::VerdictLookup& verdict) {
    std::cout << Host::SegmentsToJson(snapshot, verdict).dump(2) << "\n";
}

/// The description alone, without any device.
void PrintDescription(const SegmentsArguments& arguments) {
    Host::SnapshotOptions options;
    options.mediaRoots = arguments.mediaRoots;
    Host::FFmpegProbe probe;
    Host::IdentityBook identities;
    Print(*Host::BuildSnapshot(Host::ReadTimelineFile(arguments.file), options, probe, identities), {});
}

void PrintWithVerdicts(const SegmentsArguments& arguments) {
    Host::RenderSession session(MakeSessionOptions({arguments.file, arguments.device, arguments.mediaRoots}));
    Print(session.GetSnapshot(), [&](std::int64_t time) -> std::optional<SegmentInfo> {
        SegmentInfo info;
        if (session.GetSystem().GetSegmentInfo(time, info, false) != 0) return std::nullopt;
        return info;
    });
}

}  // namespace

void AddSegmentsCommand(CLI::App& app, int& status) {
    CLI::App* command = app.add_subcommand(
        "segments", "Print how a timeline is divided and described, and what the engine makes of it");
    const auto arguments = std::make_shared<SegmentsArguments>();
    command->add_option("file", arguments->file, "OpenTimelineIO file")->required();
    command->add_option("--device", arguments->device, "The device that is asked; none for the description alone")
        ->check(CLI::IsMember({"auto", "cuda", "opencl", "none"}));
    command->add_option("--media-root", arguments->mediaRoots, "Folders searched for media that moved");
    command->callback([arguments, &status] {
        arguments->device == "none" ? PrintDescription(*arguments) : PrintWithVerdicts(*arguments);
        status = kExit_Done;
    });
}

}  // namespace Vantrel::Tool
