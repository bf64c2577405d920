// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <gtest/gtest.h>

#include <map>
#include <nlohmann/json.hpp>
#include <string>
#include <utility>
#include <vector>

#include "Host/Snapshot/Snapshot.h"
#include "Host/Suites/HostServices.h"
#include "Host/Timeline/OtioReader.h"

/// Timelines in a few words, and media that exist only here.
namespace Vantrel::Host::Test {

using Json = nlohmann::json;

constexpr double kRate = 24;
/// One frame at 24 frames a second.
constexpr std::int64_t kFrame = 10584000000;

inline Json Time(double value, double rate = kRate) {
    return {{"OTIO_SCHEMA", "RationalTime.1"}, {"value", value}, {"rate", rate}};
}

inline Json Range(double start, double duration, double rate = kRate) {
    return {{"OTIO_SCHEMA", "TimeRange.1"}, {"start_time", Time(start, rate)}, {"duration", Time(duration, rate)}};
}

inline Json File(const std::string& name, double start = 0, double frames = 1000) {
    return {{"OTIO_SCHEMA", "ExternalReference.1"},
            {"target_url", "file:///media/" + name},
            {"available_range", Range(start, frames)}};
}

inline Json GeneratorOf(const std::string& kind, Json parameters = Json::object()) {
    return {{"OTIO_SCHEMA", "GeneratorReference.1"}, {"generator_kind", kind}, {"parameters", std::move(parameters)}};
}

/// `range` is a source_range; `more` is merged into the object.
inline Json Clip(const std::string& name, Json range, Json media, Json more = Json::object()) {
    Json clip = {{"OTIO_SCHEMA", "Clip.2"},
                 {"name", name},
                 {"source_range", std::move(range)},
                 {"media_references", {{"DEFAULT_MEDIA", std::move(media)}}},
                 {"active_media_reference_key", "DEFAULT_MEDIA"}};
    clip.update(more);
    return clip;
}

inline Json Clip(const std::string& name, double start, double duration, Json more = Json::object()) {
    return Clip(name, Range(start, duration), File(name + ".mov"), std::move(more));
}

inline Json Gap(double duration) { return {{"OTIO_SCHEMA", "Gap.1"}, {"source_range", Range(0, duration)}}; }

inline Json Dissolve(double in, double out) {
    return {{"OTIO_SCHEMA", "Transition.1"},
            {"transition_type", "SMPTE_Dissolve"},
            {"in_offset", Time(in)},
            {"out_offset", Time(out)}};
}

inline Json Composition(const char* schema, std::vector<Json> children, Json more = Json::object()) {
    Json composition = {{"OTIO_SCHEMA", schema}, {"name", schema}, {"children", std::move(children)}};
    composition.update(more);
    return composition;
}
inline Json Track(std::vector<Json> children, Json more = Json::object()) {
    Json track = Composition("Track.1", std::move(children), std::move(more));
    track["kind"] = "Video";
    return track;
}
inline Json Stack(std::vector<Json> children, Json more = Json::object()) {
    return Composition("Stack.1", std::move(children), std::move(more));
}

inline Json Timeline(std::vector<Json> tracks, Json more = Json::object()) {
    Json timeline = {{"OTIO_SCHEMA", "Timeline.1"}, {"tracks", Stack(std::move(tracks))}};
    timeline.update(more);
    return timeline;
}

inline Json Warp(double speed) { return {{"OTIO_SCHEMA", "LinearTimeWarp.1"}, {"time_scalar", speed}}; }
inline Json Freeze() { return {{"OTIO_SCHEMA", "FreezeFrame.1"}, {"time_scalar", 0}}; }
inline Json Effect(const std::string& name, Json params = Json::object()) {
    return {{"OTIO_SCHEMA", "Effect.1"},
            {"effect_name", name},
            {"metadata", {{"vantrel", {{"params", std::move(params)}}}}}};
}
inline Json Effects(std::vector<Json> effects) { return {{"effects", std::move(effects)}}; }
inline Json Own(Json metadata) { return {{"metadata", {{"vantrel", std::move(metadata)}}}}; }

/// Knows every file below /media/ whose name doesn't say "missing"; 24 frames a second unless told otherwise.
class FakeProbe : public IMediaProbe {
public:
    MediaProbeResult ProbeFile(const std::string& path) override {
        const auto known = infos.find(path);
        if (known == infos.end() && (path.rfind("/media/", 0) != 0 || path.find("missing") != std::string::npos)) {
            return {std::nullopt, path + ": no such file"};
        }
        ++probes[path];
        MediaInfo info = known != infos.end() ? known->second : Usual();
        info.identity.path = path;
        return {info, {}};
    }

    MediaProbeResult ProbeFilterSource(const std::string& source, std::int32_t width, std::int32_t height,
                                       std::int64_t ticksPerFrame) override {
        if (source.rfind("testsrc2", 0) != 0) return {std::nullopt, "no source filter is called " + source};
        MediaInfo info = Usual();
        info.identity.path = source;
        info.width = width;
        info.height = height;
        info.ticksPerFrame = ticksPerFrame;
        return {info, {}};
    }

    static MediaInfo Usual() {
        MediaInfo info;
        info.identity.sizeBytes = 1000;
        info.identity.modified = 7;
        info.width = 1280;
        info.height = 720;
        info.ticksPerFrame = kFrame;
        info.frameCount = 1000;
        info.codecTag = 0x61766331;
        return info;
    }

    std::map<std::string, MediaInfo> infos;
    std::map<std::string, int> probes;
};

inline Document Read(const Json& timeline) { return ReadTimelineText(timeline.dump(), "/films/film.otio"); }

/// A snapshot of a timeline with media of its own.
struct Described {
    explicit Described(const Json& timeline, const SnapshotOptions& options = {})
        : Described(Read(timeline), options) {}
    explicit Described(Document read, const SnapshotOptions& options = {})
        : document(std::move(read)),
          snapshot(BuildSnapshot(document, options, probe, HostServices::Instance().GetIdentities())) {}

    [[nodiscard]] const std::vector<Segment>& Segments() const { return snapshot->top->plain.segments; }

    FakeProbe probe;
    Document document;
    SnapshotPtr snapshot;
};

/// The same, in force for the suites' functions.
struct Published : Described {
    explicit Published(const Json& timeline, const SnapshotOptions& options = {}) : Described(timeline, options) {
        HostServices::Instance().Publish(snapshot);
    }
    ~Published() { HostServices::Instance().Publish(nullptr); }
    Published(const Published&) = delete;
    Published& operator=(const Published&) = delete;
};

/// A suite of the host, as the engine gets it.
template <class Suite>
const Suite& Acquire(const char* name, std::int32_t version) {
    const void* suite = nullptr;
    EXPECT_EQ(HostServices::Instance().GetBasicSuite()->AcquireSuite(std::string(name).c_str(), version, &suite), 0);
    return *static_cast<const Suite*>(suite);
}
inline const CorvaneVideoSegmentSuite& Segments() {
    return Acquire<CorvaneVideoSegmentSuite>(kVideoSegmentSuiteName, kVideoSegmentSuiteVersion);
}

/// The first segment's root in the published timeline's list, both to be released by the holder.
struct RootHold {
    RootHold() {
        EXPECT_EQ(Segments().AcquireVideoSegments(1, "", &list), 0);
        std::int64_t start = 0;
        std::int64_t end = 0;
        std::int64_t offset = 0;
        EXPECT_EQ(Segments().GetSegmentInfo(list, 0, &start, &end, &offset, hash), 0);
        EXPECT_EQ(Segments().AcquireSegmentNode(list, hash, &root), 0);
    }
    std::uint32_t list = 0;
    std::uint32_t root = 0;
    char hash[40] = {};
};

}  // namespace Vantrel::Host::Test
