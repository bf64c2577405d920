// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Inspect/InspectionJson.h"

#include <array>

#include "Host/Inspect/SegmentsJson.h"

extern "C" {
#include <libavutil/base64.h>
}

namespace Vantrel::Host {

namespace {

using Json = nlohmann::ordered_json;

std::string Base64(const std::string& bytes) {
    std::string text(AV_BASE64_SIZE(bytes.size()), '\0');
    av_base64_encode(text.data(), static_cast<int>(text.size()), reinterpret_cast<const std::uint8_t*>(bytes.data()),
                     static_cast<int>(bytes.size()));
    text.pop_back();  // its terminator
    return text;
}

const char* NameOf(Reason::Topic topic) {
    constexpr std::array kNames = {"effect", "transition", "media", "limit", "speed", "node", "preview", "engine"};
    return kNames[static_cast<std::size_t>(topic)];
}

Json ReasonToJson(const Reason& reason) {
    return {{"topic", NameOf(reason.topic)},
            {"costs", reason.realTimeOnly ? "real time" : "acceleration"},
            {"subject", reason.subject},
            {"text", reason.text}};
}

Json TreeToJson(const TreeNode& tree) {
    Json json{{"kind", tree.kind},
              {"name", tree.name},
              {"side", tree.side == TreeNode::Side::kDevice ? "device" : "host"},
              {"detail", tree.detail}};
    if (!tree.reason.empty()) json["reason"] = tree.reason;
    if (tree.milliseconds) json["milliseconds"] = *tree.milliseconds;
    json["inputs"] = Json::array();
    for (const TreeNode& input : tree.inputs) json["inputs"].push_back(TreeToJson(input));
    return json;
}

Json FrameToJson(const StretchFrame& frame) {
    Json timings = Json::array();
    for (const NodeTiming& timing : frame.timings) {
        timings.push_back({{"name", timing.name}, {"milliseconds", timing.milliseconds}});
    }
    return {{"frame", frame.frame},
            {"totalMilliseconds", frame.totalMilliseconds},
            {"deviceMegabytes", frame.deviceMegabytes},
            {"timings", timings},
            {"width", frame.width},
            {"height", frame.height},
            {"picture", "data:image/png;base64," + Base64(frame.picture)}};
}

class Writer {
public:
    explicit Writer(const Inspection& inspection) : mInspection(inspection) {}

    [[nodiscard]] Json Write() const {
        Json json{{"version", 1},
                  {"file", mInspection.file},
                  {"name", mInspection.name},
                  {"device",
                   {{"framework", mInspection.framework},
                    {"name", mInspection.deviceName},
                    {"memoryBytes", mInspection.deviceMemory}}},
                  {"format", FormatToJson(mInspection.format)},
                  {"end", Time(mInspection.length, mInspection.GetFrameCount())},
                  {"frames", Frames()},
                  {"stretches", Json::array()}};
        for (const Stretch& stretch : mInspection.stretches) json["stretches"].push_back(StretchToJson(stretch));
        json["warnings"] = mInspection.warnings;
        json["offline"] = mInspection.offline;
        return json;
    }

private:
    [[nodiscard]] Json Time(std::int64_t ticks, std::int64_t frame) const {
        return {{"ticks", ticks}, {"frame", frame}, {"timecode", mInspection.GetTimecode(frame)}};
    }

    [[nodiscard]] Json Frames() const {
        return {{"all", mInspection.GetFrameCount()},
                {"device", mInspection.CountFrames(Rendering::kDevice)},
                {"partlyHost", mInspection.CountFrames(Rendering::kPartlyHost)},
                {"host", mInspection.CountFrames(Rendering::kHost)},
                {"gap", mInspection.CountFrames(Rendering::kGap)}};
    }

    [[nodiscard]] Json StretchToJson(const Stretch& stretch) const {
        const SegmentInfo& info = stretch.info;
        Json json{{"start", Time(stretch.start, stretch.firstFrame)},
                  {"end", Time(stretch.end, stretch.endFrame)},
                  {"rendering", GetName(stretch.rendering)},
                  {"realTime", info.realTime},
                  {"accelerated", info.accelerated},
                  {"hostPart", info.hostPart},
                  {"hostWhole", info.hostWhole},
                  {"nested", info.nested},
                  {"isPreview", info.isPreview},
                  {"counters",
                   {{"effects", info.effectCount},
                    {"intrinsics", info.intrinsicCount},
                    {"transitions", info.transitionCount},
                    {"layers", info.layerCount}}},
                  {"reasons", Json::array()}};
        for (const Reason& reason : stretch.reasons) json["reasons"].push_back(ReasonToJson(reason));
        json["tree"] = TreeToJson(stretch.tree);
        if (stretch.rendered) json["rendered"] = FrameToJson(*stretch.rendered);
        return json;
    }

    const Inspection& mInspection;
};

}  // namespace

nlohmann::ordered_json InspectionToJson(const Inspection& inspection) { return Writer(inspection).Write(); }

}  // namespace Vantrel::Host
