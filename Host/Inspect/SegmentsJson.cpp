// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Inspect/SegmentsJson.h"

#include <set>

namespace Vantrel::Host {
namespace {

using Json = nlohmann::ordered_json;

const char* NameOf(Interpolation interpolation) {
    constexpr const char* kNames[] = {"hold", "linear", "bezier"};
    return kNames[static_cast<std::size_t>(interpolation)];
}

Json ValueOf(ParameterType type, const ParameterValue& value) {
    if (type == ParameterType::kBool) return value[0] != 0;
    const int count = CountComponents(type);
    if (count == 1) return value[0];
    Json array = Json::array();
    for (int i = 0; i < count; ++i) array.push_back(value[static_cast<std::size_t>(i)]);
    return array;
}

/// Writes one segment's tree.
class TreeWriter {
public:
    explicit TreeWriter(std::int64_t frameTicks) : mFrameTicks(frameTicks) {}

    [[nodiscard]] Json Time(std::int64_t ticks) const {
        Json time{{"ticks", ticks}};
        if (ticks % mFrameTicks == 0) {
            time["frames"] = ticks / mFrameTicks;
        } else {
            time["frames"] = static_cast<double>(ticks) / static_cast<double>(mFrameTicks);
        }
        return time;
    }

    [[nodiscard]] Json Tree(const Node& node) {
        Json json{{"kind", GetKindText(node.kind)}, {"hash", node.hash.ToString()}};
        if (!mWritten.insert(&node).second) {
            json["again"] = true;
            return json;
        }
        if ((node.flags & kNodeFlag_Still) != 0) json["still"] = true;
        if (const ItemDetail* item = node.AsItem()) {
            json["item"] = item->path;
            json["name"] = item->name;
            json["m"] = Time(item->time.MediaOffset());
        }
        AddSource(node, json);
        for (const auto& [key, value] : node.properties) json["properties"][key] = value;
        if (const EffectDetail* effect = node.AsEffect()) AddParameters(effect->parameters, json);
        if (const TransitionDetail* transition = node.AsTransition()) AddParameters(transition->parameters, json);
        for (const NodeInput& input : node.inputs) {
            Json entry{{"offset", Time(input.offset)}};
            entry["node"] = input.node ? Tree(*input.node) : Json();
            json["inputs"].push_back(std::move(entry));
        }
        for (const NodePtr& effect : node.operators) json["operators"].push_back(Tree(*effect));
        return json;
    }

private:
    static void AddSource(const Node& node, Json& json) {
        const MediaDetail* media = node.AsMedia();
        if (media == nullptr) return;
        constexpr const char* kKinds[] = {"offline", "file", "images", "solid", "bars", "title", "filter", "sequence"};
        json["source"] = kKinds[media->clip->source.index()];
        if (const auto* offline = std::get_if<OfflineSource>(&media->clip->source)) json["reason"] = offline->reason;
        if (const auto* nested = std::get_if<NestedSource>(&media->clip->source))
            json["sequence"] = nested->sequence->path;
    }

    void AddParameters(const std::vector<Parameter>& parameters, Json& json) const {
        for (const Parameter& parameter : parameters) {
            if (parameter.name.empty()) continue;
            Json entry{
                {"index", parameter.index}, {"name", parameter.name}, {"type", GetParameterTypeName(parameter.type)}};
            if (parameter.keys.empty()) {
                entry["value"] = ValueOf(parameter.type, parameter.value);
            }
            for (const Keyframe& key : parameter.keys) {
                entry["keyframes"].push_back({{"time", Time(key.time)},
                                              {"value", ValueOf(parameter.type, key.value)},
                                              {"interp", NameOf(key.interpolation)}});
            }
            json["parameters"].push_back(std::move(entry));
        }
    }

    std::int64_t mFrameTicks;
    std::set<const Node*> mWritten;
};

Json VerdictToJson(const SegmentInfo& info) {
    return {{"accelerated", info.accelerated},
            {"realTime", info.realTime},
            {"isPreview", info.isPreview},
            {"nested", info.nested},
            {"flattened", info.flattened},
            {"hostWhole", info.hostWhole},
            {"hostPart", info.hostPart},
            {"effects", info.effectCount},
            {"intrinsics", info.intrinsicCount},
            {"transitions", info.transitionCount},
            {"layers", info.layerCount},
            {"nestedEffects", info.nestedEffectCount},
            {"nestedIntrinsics", info.nestedIntrinsicCount},
            {"nestedTransitions", info.nestedTransitionCount},
            {"nestedLayers", info.nestedLayerCount}};
}

Json SequenceToJson(const Sequence& sequence, const VerdictLookup& verdict) {
    const SequenceFormat& format = sequence.format;
    const TreeWriter times(format.frameTicks);
    Json json{{"timelineID", sequence.timelineID},
              {"path", sequence.path},
              {"name", sequence.name},
              {"format", FormatToJson(format)},
              {"length", times.Time(sequence.length)},
              {"hash", sequence.plain.hash.ToString()},
              {"segments", Json::array()}};
    for (const Segment& segment : sequence.plain.segments) {
        Json entry{{"start", times.Time(segment.start)},
                   {"end", times.Time(segment.end)},
                   {"offset", times.Time(segment.offset)}};
        entry["tree"] = TreeWriter(format.frameTicks).Tree(*segment.root);
        if (const auto info = verdict ? verdict(segment.start) : std::nullopt) entry["verdict"] = VerdictToJson(*info);
        json["segments"].push_back(std::move(entry));
    }
    return json;
}

}  // namespace

Json FormatToJson(const SequenceFormat& format) {
    return {{"width", format.width},
            {"height", format.height},
            {"aspect", {format.aspectNumerator, format.aspectDenominator}},
            {"frameTicks", format.frameTicks},
            {"fields", static_cast<std::uint32_t>(format.fieldType)}};
}

Json SegmentsToJson(const Snapshot& snapshot, const VerdictLookup& verdict) {
    Json json{{"sequences", Json::array()}};
    for (const auto& [id, sequence] : snapshot.sequences) {
        json["sequences"].push_back(SequenceToJson(*sequence, sequence == snapshot.top ? verdict : VerdictLookup()));
    }
    json["warnings"] = snapshot.warnings;
    json["offline"] = snapshot.offline;
    return json;
}

}  // namespace Vantrel::Host
