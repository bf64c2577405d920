// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
// What an edit costs before a frame is rendered: the host describes the timeline anew, the engine reads what changed.
// Both are measured over timelines of growing length, in processor time, and shall grow no faster than the segments.
#include <algorithm>
#include <cstdio>
#include <ctime>
#include <functional>
#include <iostream>
#include <string>
#include <vector>

#include <nlohmann/json.hpp>

#include "Host/Session/RenderSession.h"
#include "Host/Software/SoftwareRenderer.h"
#include "Host/Suites/HostServices.h"
#include "Host/Timeline/OtioReader.h"

namespace {

using namespace Vantrel;
using Json = nlohmann::json;

constexpr int kRounds = 7;
constexpr int kRate = 24;
constexpr int kClipFrames = 10;
constexpr int kGapFrames = 4;

/// Every file is a film; nothing is opened.
class EveryFile : public Host::IMediaProbe {
public:
    Host::MediaProbeResult ProbeFile(const std::string& path) override {
        Host::MediaInfo info;
        info.identity.path = path;
        info.width = 1920;
        info.height = 1080;
        info.ticksPerFrame = Vellum::kTicksPerSecond / kRate;
        info.frameCount = 1000;
        return {info, {}};
    }
    Host::MediaProbeResult ProbeFilterSource(const std::string& source, std::int32_t, std::int32_t,
                                             std::int64_t) override {
        return {std::nullopt, source};
    }
};

Json Range(int frames) {
    const auto time = [](int value) {
        return Json{{"OTIO_SCHEMA", "RationalTime.1"}, {"rate", kRate}, {"value", value}};
    };
    return {{"OTIO_SCHEMA", "TimeRange.1"}, {"start_time", time(0)}, {"duration", time(frames)}};
}

Json Gap(int frames) { return {{"OTIO_SCHEMA", "Gap.1"}, {"source_range", Range(frames)}}; }

/// Clips of a film each, with motion and an effect, and gaps before and after every one.
Json MakeTimeline(int clips) {
    const Json effects = {{{"OTIO_SCHEMA", "Effect.1"},
                           {"effect_name", "TQ.XQVE Motion"},
                           {"metadata", {{"vantrel", {{"params", {{"1", 50.0}}}}}}}},
                          {{"OTIO_SCHEMA", "Effect.1"}, {"effect_name", "TQ.XQVE Invert"}}};
    Json children = Json::array({Gap(kGapFrames)});
    for (int i = 0; i < clips; ++i) {
        const Json media = {{"OTIO_SCHEMA", "ExternalReference.1"},
                            {"target_url", "/films/" + std::to_string(i) + ".mov"},
                            {"available_range", Range(1000)}};
        children.push_back({{"OTIO_SCHEMA", "Clip.1"},
                            {"name", "clip"},
                            {"source_range", Range(kClipFrames)},
                            {"media_reference", media},
                            {"effects", effects}});
        children.push_back(Gap(kGapFrames));
    }
    const Json track = {{"OTIO_SCHEMA", "Track.1"}, {"kind", "Video"}, {"children", children}};
    return {{"OTIO_SCHEMA", "Timeline.1"}, {"tracks", {{"OTIO_SCHEMA", "Stack.1"}, {"children", {track}}}}};
}

/// Has the processor's caches hold something else. An edit comes after a frame was shown, which leaves nothing of the
/// timeline in them, however short it is.
void ForgetCaches() {
    static std::vector<char> other(std::size_t{128} << 20);
    for (std::size_t i = 0; i < other.size(); i += 64) ++other[i];
}

/// Milliseconds of processor time, of all threads, from cold caches.
double MillisecondsOf(const std::function<void()>& work) {
    ForgetCaches();
    const auto now = [] {
        timespec time{};
        clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &time);
        return static_cast<double>(time.tv_sec) * 1e3 + static_cast<double>(time.tv_nsec) * 1e-6;
    };
    const double start = now();
    work();
    return now() - start;
}

double Median(std::vector<double> values) {
    std::sort(values.begin(), values.end());
    return values[values.size() / 2];
}

/// One timeline, edited and read again and again.
class Edited {
public:
    Edited(int clips, Kiln::DeviceRef device)
        : mDocument(Host::ReadTimelineText(MakeTimeline(clips).dump(), "/films/cut.otio")),
          mDevice(std::move(device)) {}

    void PrintRow(int clips) {
        std::vector<double> describe, first, unchanged, shifted, moved;
        for (int round = 0; round < kRounds; ++round) {
            describe.push_back(MillisecondsOf([this] { Describe(); }));
            boost::shared_ptr<RenderSystem> system;
            first.push_back(MillisecondsOf(
                [&] { system = CreateRenderSystem(mDevice, 1, false, "", 0, boost::shared_ptr<RenderSystem>()); }));
            unchanged.push_back(MillisecondsOf([&] { system->UpdateTimeline(); }));
            Lengthen(0, 1);
            Describe();
            shifted.push_back(MillisecondsOf([&] { system->UpdateTimeline(); }));
            const std::size_t middle = Items().size() / 2;
            Lengthen(middle - 1, 1);
            Lengthen(middle + 1, -1);
            Describe();
            moved.push_back(MillisecondsOf([&] { system->UpdateTimeline(); }));
            Lengthen(0, -1);
            Lengthen(middle - 1, -1);
            Lengthen(middle + 1, 1);
        }
        std::printf("| %d | %.2f | %.2f | %.3f | %.2f | %.2f |\n", clips, Median(describe), Median(first),
                    Median(unchanged), Median(shifted), Median(moved));
    }

private:
    std::vector<Host::Item>& Items() { return mDocument.tracks.children.front().children; }
    /// Of the gap at a place or right before it.
    void Lengthen(std::size_t gap, int frames) {
        Items()[gap & ~std::size_t{1}].sourceRange->duration += frames * (Vellum::kTicksPerSecond / kRate);
    }
    void Describe() {
        Host::HostServices& services = Host::HostServices::Instance();
        services.Publish(Host::BuildSnapshot(mDocument, {}, mProbe, services.GetIdentities()));
    }

    EveryFile mProbe;
    Host::Document mDocument;
    Kiln::DeviceRef mDevice;
};

}  // namespace

int main() {
    try {
        Host::HostServices& services = Host::HostServices::Instance();
        const auto pool = Host::PixelBufferPool::Create();
        const auto renderer = Host::MakeSoftwareRenderer(pool, std::make_shared<Host::MediaReader>(pool, 0), false);
        const Host::RenderService service(services, *renderer, 1);
        Initialize(const_cast<QuillBasicSuite*>(services.GetBasicSuite()));
        std::printf("| segments | describe | first read | nothing changed | every clip moved | one clip moved |\n");
        std::printf("|---|---|---|---|---|---|\n");
        for (const int clips : {50, 500, 5000}) Edited(clips, Host::ChooseDevice({})).PrintRow(clips);
        services.Publish(nullptr);
        Terminate();
        return 0;
    } catch (const std::exception& error) {
        std::cerr << "vantrel_update_benchmark: " << error.what() << "\n";
        return 1;
    }
}
