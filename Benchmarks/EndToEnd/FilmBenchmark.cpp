// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// Renders a cut of H.264 clips without effects, and decodes the same clips alone, in turn and in one run: the ratio
// says what the road from the decoder to the finished picture costs, whatever else the machine is doing.
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <string>
#include <vector>

#include <nlohmann/json.hpp>

#include "Host/Media/FilterSourceReader.h"
#include "Host/Media/PictureConverter.h"
#include "Host/Media/VideoFile.h"
#include "Host/Output/FrameWriter.h"
#include "Host/Session/RenderSession.h"

namespace {

using namespace Vantrel;
using Json = nlohmann::json;
using Clock = std::chrono::steady_clock;

constexpr std::int32_t kWidth = 1920;
constexpr std::int32_t kHeight = 1080;
constexpr int kRate = 25;
constexpr int kClipFrames = 100;
constexpr int kRounds = 5;
const std::vector<std::string> kSources = {"testsrc2", "gradients=n=4:seed=3",
                                           "mandelbrot=start_scale=2:end_scale=0.1"};

double SecondsSince(Clock::time_point start) { return std::chrono::duration<double>(Clock::now() - start).count(); }

std::string ClipPath(const std::string& folder, std::size_t index) {
    return folder + "/clip" + std::to_string(index) + ".mp4";
}

void MakeClip(const std::string& path, const std::string& source) {
    if (std::filesystem::exists(path)) return;
    Host::OutputFormat format;
    format.path = path;
    format.width = kWidth;
    format.height = kHeight;
    format.rate = Vellum::FrameRate::FromFraction(kRate, 1);
    const auto writer = Host::CreateFrameWriter(format, kClipFrames);
    Host::FilterSourceReader reader(source, kWidth, kHeight, {kRate, 1});
    Host::PictureConverter converter(Host::PixelBufferPool::Create());
    for (int i = 0; i < kClipFrames; ++i) writer->Write(*converter.Convert(*reader.ReadFrame(i), 0), i);
    writer->Finish();
}

Json Time(int frames) { return {{"OTIO_SCHEMA", "RationalTime.1"}, {"rate", kRate}, {"value", frames}}; }

Json Range(int frames) { return {{"OTIO_SCHEMA", "TimeRange.1"}, {"start_time", Time(0)}, {"duration", Time(frames)}}; }

void WriteTimeline(const std::string& folder) {
    Json clips = Json::array();
    for (std::size_t i = 0; i < kSources.size(); ++i) {
        const Json media = {{"OTIO_SCHEMA", "ExternalReference.1"},
                            {"target_url", std::filesystem::path(ClipPath(folder, i)).filename().string()},
                            {"available_range", Range(kClipFrames)}};
        clips.push_back({{"OTIO_SCHEMA", "Clip.1"},
                         {"name", kSources[i]},
                         {"source_range", Range(kClipFrames)},
                         {"media_reference", media}});
    }
    const Json track = {{"OTIO_SCHEMA", "Track.1"}, {"kind", "Video"}, {"children", clips}};
    const Json timeline = {{"OTIO_SCHEMA", "Timeline.1"},
                           {"tracks", {{"OTIO_SCHEMA", "Stack.1"}, {"children", {track}}}}};
    std::ofstream(folder + "/cut.otio") << timeline.dump(1);
}

/// Frames a second of decoding the clips one after the other, with all the threads that FFmpeg likes.
double DecodeAlone(const std::string& folder) {
    const Clock::time_point start = Clock::now();
    for (std::size_t i = 0; i < kSources.size(); ++i) {
        Host::VideoFile file(ClipPath(folder, i), 0);
        for (int frame = 0; frame < kClipFrames; ++frame) (void)file.ReadFrame(frame);
    }
    return static_cast<double>(kSources.size() * kClipFrames) / SecondsSince(start);
}

Host::RenderSummary RenderCut(const std::string& folder, Host::DeviceChoice device, std::uint32_t quality) {
    Host::SessionOptions options;
    options.file = folder + "/cut.otio";
    options.device = device;
    Host::RenderSession session(options);
    Host::RenderJob job;
    job.endFrame = session.GetFrameCount();
    job.width = kWidth;
    job.height = kHeight;
    job.quality = quality;
    const std::atomic<bool> stop{false};
    return session.Render(
        job, [](Host::RenderedFrame) {}, stop);
}

double Median(std::vector<double> values) {
    std::sort(values.begin(), values.end());
    return values[values.size() / 2];
}

void Compare(const std::string& folder, const char* name, Host::DeviceChoice device, std::uint32_t quality) {
    std::vector<double> ratios;
    std::vector<double> rates;
    std::vector<double> decodes;
    std::vector<double> waits;
    for (int round = 0; round < kRounds; ++round) {
        const double decode = DecodeAlone(folder);
        const Host::RenderSummary summary = RenderCut(folder, device, quality);
        const double rate = static_cast<double>(summary.frames) / summary.seconds;
        ratios.push_back(rate / decode);
        rates.push_back(rate);
        decodes.push_back(decode);
        waits.push_back(summary.waitSeconds / summary.seconds);
    }
    std::printf("| %s, quality %u | %.0f | %.0f | %.2f | %.0f %% |\n", name, quality, Median(decodes), Median(rates),
                Median(ratios), 100 * Median(waits));
}

}  // namespace

int main(int argc, char** argv) {
    if (argc != 2) {
        std::cerr << "usage: vantrel_film_benchmark FOLDER\n";
        return 1;
    }
    try {
        const std::string folder = argv[1];
        std::filesystem::create_directories(folder);
        for (std::size_t i = 0; i < kSources.size(); ++i) MakeClip(ClipPath(folder, i), kSources[i]);
        WriteTimeline(folder);
        std::printf(
            "| cut of 1080p H.264, no effects | decode alone, fps | render, fps | render / decode | waited for media "
            "|\n");
        std::printf("|---|---|---|---|---|\n");
        Compare(folder, "CUDA (CPU driver)", Host::DeviceChoice::kCuda, 4);
        Compare(folder, "CUDA (CPU driver)", Host::DeviceChoice::kCuda, 1);
        Compare(folder, "OpenCL", Host::DeviceChoice::kOpenCL, 4);
        return 0;
    } catch (const std::exception& error) {
        std::cerr << "vantrel_film_benchmark: " << error.what() << "\n";
        return 1;
    }
}
