// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <sstream>

#include "Host/Inspect/SegmentsJson.h"
#include "Tests/Host/TimelineText.h"

/// Files that other programs wrote.
namespace Vantrel::Host::Test {
namespace {

const std::string kData = VANTREL_TEST_DATA;

std::string ReadText(const std::string& path) {
    std::ostringstream text;
    text << std::ifstream(path).rdbuf();
    return text.str();
}

/// A sample under a name that is the same on every machine: relative references count from it.
Document ReadSample(const std::string& name) {
    return ReadTimelineText(ReadText(kData + "/otio/" + name + ".otio"), "/samples/" + name + ".otio");
}

/// JSON in few lines: members share a line while they fit on it.
std::string Fold(const nlohmann::ordered_json& value, std::size_t indent = 0) {
    constexpr std::size_t kWidth = 118;
    const std::string flat = value.dump();
    if (value.is_primitive() || flat.size() + indent < kWidth) return flat;
    std::string text(1, flat.front());
    bool breaks = false;
    for (const auto& [key, member] : value.items()) {
        const std::string name = value.is_object() ? Json(key).dump() + ":" : "";
        const std::string item = name + Fold(member, indent + 1);
        const std::size_t column = text.size() - (text.rfind('\n') + 1);
        const bool spansLines = item.find('\n') != std::string::npos;
        if (text.size() > 1) text += ",";
        if (text.size() > 1 && (breaks || spansLines || column + item.size() > kWidth)) {
            text += "\n" + std::string(indent + 1, ' ');
        }
        text += item;
        breaks = spansLines;
    }
    return text + flat.back();
}

/// With VANTREL_UPDATE_GOLDEN set the files are written anew, to be read and committed.
TEST(Samples, AreDescribedAsTheyWere) {
    for (const char* name : {"transition", "multiple_track", "nested_example", "generator_reference_test"}) {
        Document document = ReadSample(name);
        FakeProbe probe;
        for (const auto& [file, frames] : {std::pair{"titles", 8}, {"wind-up", 9}, {"punchline", 10}}) {
            MediaInfo info = FakeProbe::Usual();
            info.frameCount = frames;
            probe.infos["/folder/" + std::string(file) + ".mov"] = info;
        }
        IdentityBook identities;  // numbers count from the beginning
        const auto described = SegmentsToJson(*BuildSnapshot(document, {}, probe, identities), {});
        const std::string path = kData + "/segments/" + name + ".json";
        if (std::getenv("VANTREL_UPDATE_GOLDEN") != nullptr) std::ofstream(path) << Fold(described) << "\n";
        const auto golden = nlohmann::ordered_json::parse(ReadText(path));
        EXPECT_EQ(golden, described) << path << ": " << nlohmann::ordered_json::diff(golden, described).dump(2);
    }
}

}  // namespace
}  // namespace Vantrel::Host::Test
