// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "SessionArguments.h"

namespace Vantrel::Tool {

void AddSessionArguments(CLI::App& command, SessionArguments& arguments) {
    command.add_option("file", arguments.file, "OpenTimelineIO file")->required();
    command.add_option("--device", arguments.device, "The device that renders")
        ->check(CLI::IsMember({"auto", "cuda", "opencl"}));
    command.add_option("--device-memory", arguments.deviceMemoryMB, "Use at most this many megabytes of it");
    command.add_option("--media-root", arguments.mediaRoots, "Folder to look for media in, by name; may be repeated");
}

Host::SessionOptions MakeSessionOptions(const SessionArguments& arguments) {
    Host::SessionOptions options;
    options.file = arguments.file;
    options.snapshot.mediaRoots = arguments.mediaRoots;
    options.deviceMemory = arguments.deviceMemoryMB << 20;
    if (arguments.device == "cuda") options.device = Host::DeviceChoice::kCuda;
    if (arguments.device == "opencl") options.device = Host::DeviceChoice::kOpenCL;
    return options;
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

}  // namespace Vantrel::Tool
