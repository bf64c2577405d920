// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// Renders films of H.264 clips, and decodes the same clips alone, in turn and in one run: the ratio says what the road
// from the decoder to the finished picture costs, whatever else the machine is doing. A film is a row of kFilms.
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>
#include <string>
#include <vector>

#include <nlohmann/json.hpp>

#include "Host/Media/FilterSourceReader.h"
#include "Host/Media/PictureConverter.h"
#include "Host/Media/VideoFile.h"
#include "Host/Output/FrameWriter.h"
#include "Host/Session/RenderSession.h"

extern "C" {
#include <libavutil/log.h>
}

namespace {

using namespace Vantrel;
using Json = nlohmann::json;
using Clock = std::chrono::steady_clock;

constexpr std::int32_t kWidth = 1920;
constexpr std::int32_t kHeight = 1080;
constexpr int kRate = 25;
constexpr int kClipFrames = 50;
constexpr int kRounds = 3;
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

Json Range(int first, int frames) {
    return {{"OTIO_SCHEMA", "TimeRange.1"}, {"start_time", Time(first)}, {"duration", Time(frames)}};
}

/// A clip of the source from its first frame on.
Json Clip(const std::string& folder, std::size_t source, int first, int frames) {
    const Json media = {{"OTIO_SCHEMA", "ExternalReference.1"},
                        {"target_url", std::filesystem::path(ClipPath(folder, source)).filename().string()},
                        {"available_range", Range(0, kClipFrames)}};
    return {{"OTIO_SCHEMA", "Clip.1"},
            {"name", kSources[source]},
            {"source_range", Range(first, frames)},
            {"media_reference", media}};
}

Json Track(const Json& items) { return {{"OTIO_SCHEMA", "Track.1"}, {"kind", "Video"}, {"children", items}}; }

/// The clips one after the other, each of the same length.
Json Cut(const std::string& folder, int first, int frames) {
    Json clips = Json::array();
    for (std::size_t i = 0; i < kSources.size(); ++i) clips.push_back(Clip(folder, i, first, frames));
    return clips;
}

Json PlainCut(const std::string& folder) { return Json::array({Track(Cut(folder, 0, kClipFrames))}); }

/// Long enough that the first frames, which find every cache and pool empty, tell little.
Json LongCut(const std::string& folder) {
    constexpr int kTimes = 3;
    Json clips = Json::array();
    for (int i = 0; i < kTimes; ++i) {
        for (const Json& clip : Cut(folder, 0, kClipFrames)) clips.push_back(clip);
    }
    return Json::array({Track(clips)});
}

/// About half of the frames are part of a dissolve.
Json Dissolves(const std::string& folder) {
    constexpr int kHandle = 12;
    Json items = Json::array();
    for (const Json& clip : Cut(folder, kHandle, kClipFrames - 2 * kHandle)) {
        if (!items.empty()) {
            items.push_back({{"OTIO_SCHEMA", "Transition.1"},
                             {"transition_type", "SMPTE_Dissolve"},
                             {"in_offset", Time(kHandle)},
                             {"out_offset", Time(kHandle)}});
        }
        items.push_back(clip);
    }
    return Json::array({Track(items)});
}

Json Nested(const std::string& folder) {
    const Json stack = {{"OTIO_SCHEMA", "Stack.1"}, {"name", "inner"}, {"children", PlainCut(folder)}};
    return Json::array({Track(Json::array({stack}))});
}

Json Adjusted(const std::string& folder) {
    const Json generator = {
        {"OTIO_SCHEMA", "GeneratorReference.1"}, {"generator_kind", "adjustment"}, {"parameters", Json::object()}};
    const Json invert = {{"OTIO_SCHEMA", "Effect.1"}, {"effect_name", "TQ.XQVE Invert"}};
    const Json layer = {{"OTIO_SCHEMA", "Clip.1"},
                        {"name", "adjustment"},
                        {"source_range", Range(0, static_cast<int>(kSources.size()) * kClipFrames)},
                        {"media_reference", generator},
                        {"effects", Json::array({invert})}};
    return Json::array({Track(Cut(folder, 0, kClipFrames)), Track(Json::array({layer}))});
}

/// The clips at half speed, with the frames between made of their neighbours.
Json Blended(const std::string& folder) {
    Json clips = Cut(folder, 0, kClipFrames);
    for (Json& clip : clips) {
        clip["effects"] = Json::array({{{"OTIO_SCHEMA", "LinearTimeWarp.1"}, {"time_scalar", 0.5}}});
        clip["metadata"] = {{"vantrel", {{"frame_blend", true}}}};
    }
    return Json::array({Track(clips)});
}

Json TwoLayers(const std::string& folder) {
    Json upper = Cut(folder, 0, kClipFrames);
    for (Json& clip : upper) {
        const Json values = {{"position", {0.7, 0.3}}, {"scale", 50.0}, {"rotation", 5.0}};
        const Json motion = {{"OTIO_SCHEMA", "Effect.1"},
                             {"effect_name", "TQ.XQVE Motion"},
                             {"metadata", {{"vantrel", {{"params", values}}}}}};
        clip["effects"] = Json::array({motion});
    }
    return Json::array({Track(Cut(folder, 0, kClipFrames)), Track(upper)});
}

struct Film {
    const char* name;
    Json (*tracks)(const std::string& folder);
};
constexpr Film kFilms[] = {
    {"cut", &LongCut},       {"dissolves", &Dissolves},  {"nested cut", &Nested},
    {"adjusted", &Adjusted}, {"time-blended", &Blended}, {"picture in picture", &TwoLayers},
};

std::string TimelinePath(const std::string& folder, const Film& film) { return folder + "/" + film.name + ".otio"; }

void WriteTimeline(const std::string& folder, const Film& film) {
    const Json timeline = {{"OTIO_SCHEMA", "Timeline.1"},
                           {"tracks", {{"OTIO_SCHEMA", "Stack.1"}, {"children", film.tracks(folder)}}}};
    std::ofstream(TimelinePath(folder, film)) << timeline.dump(1);
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

Host::RenderSummary Render(const std::string& file, Host::DeviceChoice device, std::uint32_t quality) {
    Host::SessionOptions options;
    options.file = file;
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

struct Case {
    const Film& film;
    const char* deviceName;
    Host::DeviceChoice device;
    std::uint32_t quality;
    std::vector<double> ratios, rates, decodes, waits;
    Host::RenderSummary last;
};

std::string NameOf(const Case& each) {
    return std::string(each.film.name) + ", " + each.deviceName + ", quality " + std::to_string(each.quality);
}

/// Those whose name begins so.
std::vector<Case> MakeCases(const std::string& beginning) {
    std::vector<Case> cases;
    for (const Film& film : kFilms) {
        const bool plain = &film == &kFilms[0];
        cases.push_back({film, "CUDA", Host::DeviceChoice::kCuda, 4, {}, {}, {}, {}, {}});
        if (plain) cases.push_back({film, "CUDA", Host::DeviceChoice::kCuda, 1, {}, {}, {}, {}, {}});
        cases.push_back({film, "OpenCL", Host::DeviceChoice::kOpenCL, 4, {}, {}, {}, {}, {}});
    }
    std::vector<Case> chosen;
    std::copy_if(cases.begin(), cases.end(), std::back_inserter(chosen),
                 [&](const Case& each) { return NameOf(each).rfind(beginning, 0) == 0; });
    return chosen;
}

void Measure(const std::string& folder, Case& each) {
    const double decode = DecodeAlone(folder);
    each.last = Render(TimelinePath(folder, each.film), each.device, each.quality);
    const double rate = static_cast<double>(each.last.frames) / each.last.seconds;
    each.ratios.push_back(rate / decode);
    each.rates.push_back(rate);
    each.decodes.push_back(decode);
    each.waits.push_back(each.last.waitSeconds / each.last.seconds);
}

void Print(const Case& each) {
    std::printf("| %s | %.0f | %.0f | %.2f | %.0f %% | %lld |\n", NameOf(each).c_str(), Median(each.decodes),
                Median(each.rates), Median(each.ratios), 100 * Median(each.waits),
                static_cast<long long>(each.last.frames - each.last.deviceFrames));
}

}  // namespace

int main(int argc, char** argv) {
    if (argc < 2 || argc > 4) {
        std::cerr << "usage: vantrel_film_benchmark FOLDER [ROUNDS [NAME]]\n"
                     "with a name, such as \"cut, CUDA\", only the rows that begin with it\n";
        return 1;
    }
    try {
        const std::string folder = argv[1];
        const int rounds = argc > 2 ? std::max(1, std::stoi(argv[2])) : kRounds;
        std::filesystem::create_directories(folder);
        av_log_set_level(AV_LOG_WARNING);
        for (std::size_t i = 0; i < kSources.size(); ++i) MakeClip(ClipPath(folder, i), kSources[i]);
        for (const Film& film : kFilms) WriteTimeline(folder, film);
        std::vector<Case> cases = MakeCases(argc > 3 ? argv[3] : "");
        for (int round = 0; round < rounds; ++round) {
            for (Case& each : cases) Measure(folder, each);
        }
        std::printf(
            "| 1080p H.264 films | decode alone, fps | render, fps | render / decode | waited for media | "
            "not the device's |\n");
        std::printf("|---|---|---|---|---|---|\n");
        for (const Case& each : cases) Print(each);
        return 0;
    } catch (const std::exception& error) {
        std::cerr << "vantrel_film_benchmark: " << error.what() << "\n";
        return 1;
    }
}
