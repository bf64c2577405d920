// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Snapshot/NodeFactory.h"

#include <algorithm>
#include <deque>
#include <utility>

#include "Host/Snapshot/NodeHash.h"
#include "Host/Snapshot/PropertyWriter.h"
#include "Host/Time/ExactTime.h"
#include "Host/Timeline/EffectTables.h"
#include "Marl/BinaryData.h"

namespace Vantrel::Host {
namespace {

constexpr const char* kTrackMatteMatchName = "TQ.XQVE Legacy Key Track Matte";

bool IsIntrinsic(const Effect& effect) {
    return effect.matchName == kMotionMatchName || effect.matchName == kOpacityMatchName;
}

/// An intrinsic effect that moves nothing and hides nothing needn't be there.
bool IsIdentity(const Effect& effect) {
    constexpr std::size_t kScaleWidth = 2;
    constexpr std::size_t kUniformScale = 3;
    const EffectTable& table = *FindEffectTable(effect.matchName);
    const bool uniform = effect.matchName == kMotionMatchName && !effect.parameters[kUniformScale].IsAnimated() &&
                         effect.parameters[kUniformScale].value[0] != 0;
    for (std::size_t i = 0; i < effect.parameters.size(); ++i) {
        if (uniform && i == kScaleWidth) continue;
        if (effect.parameters[i].IsAnimated() || effect.parameters[i].value != table.parameters[i].value) return false;
    }
    return true;
}

Effect NeutralEffect(const Item& item, const char* matchName) {
    Effect effect;
    effect.path = item.path + "/" + matchName;
    effect.matchName = matchName;
    effect.parameters = FindEffectTable(matchName)->parameters;
    return effect;
}

/// File order, then opacity, then motion. An adjustment layer always has those two, if need be those in `neutral`:
/// otherwise a search for them that begins above it would go on into the picture below and find those of a clip there.
/// What has opacity has motion: a tree without it gets a node for it, which in front of a nested sequence's only layer
/// would find that layer's opacity and apply it once more.
std::vector<const Effect*> OrderEffects(const Item& item, std::deque<Effect>& neutral) {
    const bool adjusts = item.media.generator == "adjustment";
    std::vector<const Effect*> ordered;
    for (const Effect& effect : item.effects) {
        if (!IsIntrinsic(effect)) ordered.push_back(&effect);
    }
    for (const char* name : {kOpacityMatchName, kMotionMatchName}) {
        const bool fades = !ordered.empty() && ordered.back()->matchName == kOpacityMatchName;
        const auto given = std::find_if(item.effects.begin(), item.effects.end(),
                                        [name](const Effect& effect) { return effect.matchName == name; });
        if (given != item.effects.end() && (adjusts || !IsIdentity(*given))) {
            ordered.push_back(&*given);
        } else if (adjusts || fades) {
            ordered.push_back(&neutral.emplace_back(NeutralEffect(item, name)));
        }
    }
    return ordered;
}

/// Whether a graph's picture changes with time by itself: it names the time or frame variables of expressions, or a
/// filter that makes something new each frame.
bool GraphDependsOnTime(const std::string& graph) {
    constexpr const char* kWords[] = {"t", "T", "n", "N", "pts", "random", "noise", "drawtext"};
    std::size_t begin = 0;
    while (begin < graph.size()) {
        const auto isWord = [](char c) {
            return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '_';
        };
        std::size_t end = begin;
        while (end < graph.size() && isWord(graph[end])) ++end;
        // An option's name is no variable.
        const bool option = end < graph.size() && graph[end] == '=' && end - begin == 1;
        const std::string word = graph.substr(begin, end - begin);
        if (!option && std::find(std::begin(kWords), std::end(kWords), word) != std::end(kWords)) return true;
        begin = end + 1;
    }
    return false;
}

bool IsAnimated(const EffectDetail& effect) {
    return std::any_of(effect.parameters.begin(), effect.parameters.end(),
                       [](const Parameter& parameter) { return parameter.IsAnimated(); });
}

}  // namespace

TimeMap MakeTimeMap(const Item& item, std::int64_t mediaStart, std::int64_t duration, std::int64_t frameTicks) {
    const std::int64_t trimmedStart = TrimmedRange(item).start;
    TimeMap map;
    map.in = trimmedStart - mediaStart;
    map.duration = duration;
    map.frameTicks = frameTicks;
    map.speed = item.speed;
    if (item.media.generator == "adjustment") {
        map.motion = Motion::kAdjustment;
        map.speed = 1.0;
    } else if (item.freeze) {
        map.motion = Motion::kFreeze;
        map.speed = 1.0;
        map.hold = item.options.hold ? *item.options.hold - mediaStart : map.in;
        map.holdFilters = item.options.holdFilters;
    } else if (!item.options.remap.empty()) {
        map.motion = Motion::kRemap;
        map.speed = 1.0;
        for (const RemapKey& key : item.options.remap) {
            map.curve.push_back({key.time - trimmedStart, key.mediaTime - mediaStart, key.interpolation});
        }
    } else if (item.speed < 0) {
        map.motion = Motion::kBackward;
    }
    return map;
}

bool UsesTrackMatte(const Item& item) {
    return std::any_of(item.effects.begin(), item.effects.end(),
                       [](const Effect& effect) { return effect.matchName == kTrackMatteMatchName; });
}

NodePtr NodeFactory::Finish(Node node) const {
    std::sort(node.properties.begin(), node.properties.end());
    node.hash = HashNode(node, mFormat);
    return std::make_shared<const Node>(std::move(node));
}

NodePtr NodeFactory::Effect(const Host::Effect& effect, const ClipRequest& request, bool still,
                            const MatteLookup& mattes) const {
    Node node;
    node.kind = NodeKind::kEffect;
    EffectDetail detail;
    detail.matchName = effect.matchName;
    detail.filterGraph = effect.filterGraph;
    detail.instanceID = mIdentities.InstanceID(effect.path);
    detail.timeDependent = effect.timeDependent || GraphDependsOnTime(effect.filterGraph);
    detail.parameters = effect.parameters;
    for (Parameter& parameter : detail.parameters) {
        for (Keyframe& key : parameter.keys) key.time -= request.mediaStart;
    }
    if (!effect.opaqueData.empty() && Marl::DecodeBinaryDataFromUTF8String(effect.opaqueData, detail.opaqueData) != 0) {
        detail.opaqueData.clear();
    }
    if (effect.matchName == kTrackMatteMatchName && mattes) {
        const auto trackID = static_cast<std::int32_t>(detail.parameters.front().value[0]);
        if (const auto matte = mattes(trackID)) {
            detail.matte = {matte->anchor - request.placed->start, matte->node};
        }
    }
    if (!IsAnimated(detail) && !detail.timeDependent && !detail.matte.node) detail.constantHash = HashEffect(detail);
    if (still && !IsAnimated(detail) && !detail.timeDependent && !detail.matte.node) node.flags = kNodeFlag_Still;
    PropertyWriter properties(node.properties, "EffectNode::");
    properties.Text("FilterMatchName", effect.matchName);
    properties.Number("RuntimeInstanceID", detail.instanceID);
    properties.Number("EffectDuration", request.placed->duration);
    if (!effect.opaqueData.empty()) properties.Text("FilterOpaqueData", effect.opaqueData);
    node.detail = std::move(detail);
    return Finish(std::move(node));
}

void NodeFactory::AddOperators(Node& clip, const ClipRequest& request, const NodePtr& input,
                               const MatteLookup& mattes) const {
    bool still = (input->flags & kNodeFlag_Still) != 0;
    std::deque<Host::Effect> neutral;
    for (const Host::Effect* effect : OrderEffects(*request.placed->item, neutral)) {
        clip.operators.push_back(Effect(*effect, request, still, mattes));
        still = (clip.operators.back()->flags & kNodeFlag_Still) != 0;
    }
}

NodePtr NodeFactory::Clip(const ClipRequest& request, const NodePtr& input, const MatteLookup& mattes) const {
    const PlacedItem& placed = *request.placed;
    Node node;
    node.kind = NodeKind::kClip;
    node.inputs.push_back({request.time.MediaOffset(), input});
    AddOperators(node, request, input, mattes);
    node.detail = ItemDetail{placed.item->path, placed.item->name, request.time};
    PropertyWriter properties(node.properties, "ClipNode::");
    properties.Real("ClipSpeed", request.time.ClipSpeed());
    properties.Bool("ClipBackwards", request.time.IsBackward());
    if (request.time.motion == Motion::kRemap) properties.Bool("TimeRemapping", true);
    properties.Number("TrackItemStartAsTicks", placed.start);
    properties.Number("TrackItemEndAsTicks", placed.End());
    properties.Number("EffectiveTrackItemStartAsTicks", placed.start - placed.head);
    properties.Number("EffectiveTrackItemEndAsTicks", placed.End() + placed.tail);
    if (request.time.motion == Motion::kFreeze) properties.Number("FrameHoldAtTime", request.time.hold);
    properties.Bool("FrameHoldFilters", request.time.holdFilters);
    properties.Number("TrackID", request.trackID);
    return Finish(std::move(node));
}

Node NodeFactory::StartMedia(const ClipRequest& request, const MediaClipPtr& clip) const {
    const Item& item = *request.placed->item;
    const MediaInfo& info = clip->info;
    Node node;
    node.kind = NodeKind::kMedia;
    if (info.still) node.flags = kNodeFlag_Still;
    MediaDetail detail;
    detail.clip = clip;
    detail.name = item.name;
    detail.scale = item.options.scale;
    detail.alpha = item.options.alpha;
    // A sequence that the engine renders itself isn't blended: its media node has no such property.
    detail.frameBlend = item.options.frameBlend && clip->id != 0;
    detail.deinterlace = item.options.deinterlace;
    detail.reverseFieldDominance = item.options.reverseFieldDominance;
    detail.speed = request.time.ClipSpeed();
    detail.backwards = request.time.IsBackward();
    detail.held = request.time.motion == Motion::kFreeze;
    const bool merges =
        info.fieldType != FieldType::kProgressive && mFormat.fieldType == FieldType::kProgressive && detail.frameBlend;
    detail.samplesTime = !info.still && (info.ticksPerFrame != mFormat.frameTicks || !request.time.KeepsFrames() ||
                                         merges || detail.deinterlace);
    node.detail = detail;
    PropertyWriter properties(node.properties, "MediaNode::");
    AddStreamProperties(properties, info);
    const double speed = request.time.ClipSpeed();
    properties.Real("ClipSpeed", speed);
    properties.Bool("ClipBackwards", request.time.IsBackward());
    properties.Number("ContentStart", 0);
    properties.Number("StartTimecodeOffset", request.mediaStart);
    properties.Number("InPointMediaTimeAsTicks", request.time.in);
    properties.Number("OutPointMediaTimeAsTicks", request.time.in + ScaleTicks(request.placed->duration, speed));
    properties.Number("ClipScaleToFramePolicy", static_cast<std::int64_t>(item.options.scale));
    return node;
}

NodePtr NodeFactory::Media(const ClipRequest& request, const ResolvedMedia& media) const {
    const ItemOptions& options = request.placed->item->options;
    Node node = StartMedia(request, media.clip);
    PropertyWriter properties(node.properties, "MediaNode::");
    if (!media.instance.empty()) properties.Text("MediaInstanceString", media.instance);
    if (!media.opaqueData.empty()) properties.Text("StreamOpaqueData", media.opaqueData);
    properties.Bool("MediaIsOffline", media.offline);
    if (media.hasClipID) {
        properties.Number("ClipID", media.clip->id);
        AddAlphaProperties(properties, media.clip->info, options.alpha);
        properties.Number("StreamFrameVidSubType", static_cast<std::int32_t>(media.clip->info.codecTag));
        properties.Bool("MediaIsPending", false);
        properties.Bool("StreamFrameBlend", options.frameBlend);
        properties.Bool("DeinterlaceAlways", options.deinterlace);
        properties.Bool("StreamReverseFieldDominance", options.reverseFieldDominance);
    }
    return Finish(std::move(node));
}

NodePtr NodeFactory::NestedMedia(const ClipRequest& request, const SequencePtr& sequence) const {
    MediaInfo info = InfoOfFormat(sequence->format);
    info.fieldType = sequence->format.fieldType;
    // No clip id: of a sequence that the engine renders it asks no frames.
    Node node = StartMedia(
        request, std::make_shared<MediaClip>(MediaClip{0, info, NestedSource{sequence}, sequence->plain.hash}));
    PropertyWriter(node.properties, "MediaNode::").Number("NestedSequenceTimelineID", sequence->timelineID);
    return Finish(std::move(node));
}

NodePtr NodeFactory::VirtualMedia(const ClipRequest& request, const MediaClipPtr& clip) const {
    Node node = StartMedia(request, clip);
    PropertyWriter properties(node.properties, "MediaNode::");
    properties.Number("ClipID", clip->id);
    properties.Bool("MediaIsOffline", false);
    properties.Bool("MediaIsPending", false);
    properties.Bool("StreamFrameBlend", request.placed->item->options.frameBlend);
    AddAlphaProperties(properties, clip->info, AlphaChoice::kAsMedia);
    return Finish(std::move(node));
}

NodePtr NodeFactory::MulticamMedia(const ClipRequest& request, const SequencePtr& sequence,
                                   std::vector<NodeInput> angles) const {
    MediaClip clip{0, InfoOfFormat(sequence ? sequence->format : mFormat), SolidSource{}, {}};
    if (sequence) {
        clip.info.fieldType = sequence->format.fieldType;
        clip.source = NestedSource{sequence};
        clip.identity = sequence->plain.hash;
    }
    Node node = StartMedia(request, std::make_shared<const MediaClip>(std::move(clip)));
    node.inputs = std::move(angles);
    PropertyWriter properties(node.properties, "MediaNode::");
    properties.Number("SelectedMulticamTrack", request.placed->item->multicam->selected);
    if (sequence) properties.Number("SelectedMulticamTrackTimelineID", sequence->timelineID);
    return Finish(std::move(node));
}

NodePtr NodeFactory::Compositor(std::vector<NodeInput> layers) const {
    Node node;
    node.kind = NodeKind::kCompositor;
    node.inputs = std::move(layers);
    return Finish(std::move(node));
}

NodePtr NodeFactory::Transition(const Item& transition, NodeInput outgoing, NodeInput incoming) const {
    Node node;
    node.kind = NodeKind::kTransition;
    node.inputs = {std::move(outgoing), std::move(incoming)};
    const std::int64_t duration = transition.inOffset + transition.outOffset;
    node.detail = TransitionDetail{transition.matchName, duration, transition.parameters};
    node.properties = transition.properties;
    PropertyWriter properties(node.properties, "TransitionNode::");
    properties.Text("TransitionMatchName", transition.matchName);
    properties.Number("TransitionDuration", duration);
    return Finish(std::move(node));
}

NodePtr NodeFactory::Disabled(const NodePtr& clip) const {
    Node node;
    node.kind = NodeKind::kDisabled;
    node.inputs = {{0, clip}};
    return Finish(std::move(node));
}

NodePtr NodeFactory::Adjustment(const NodePtr& below, const NodePtr& clip) const {
    Node node;
    node.kind = NodeKind::kAdjustment;
    node.inputs = {{0, below}, {0, clip}};
    PropertyWriter(node.properties, "AdjustmentNode::").Bool("AdjustmentMediaIsOpaque", true);
    return Finish(std::move(node));
}

NodePtr NodeFactory::Multicam(const Host::Multicam& options, std::vector<NodeInput> angles) const {
    Node node;
    node.kind = NodeKind::kMulticam;
    node.inputs = std::move(angles);
    node.detail = MulticamDetail{options};
    PropertyWriter properties(node.properties, "MulticamNode::");
    properties.Number("SelectedTrack", options.selected);
    properties.Bool("ShowProgram", options.showProgram);
    properties.Bool("Recording", options.recording);
    properties.Bool("IsNonMultiCam", options.isNonMulticam);
    return Finish(std::move(node));
}

NodePtr NodeFactory::HostSolid(const MediaClipPtr& clip) const {
    Node node;
    node.kind = NodeKind::kSolidColor;
    MediaDetail detail;
    detail.clip = clip;
    node.detail = detail;
    return Finish(std::move(node));
}

NodePtr NodeFactory::Preview(const MediaClipPtr& clip) const {
    Node node;
    node.kind = NodeKind::kPreview;
    MediaDetail detail;
    detail.clip = clip;
    detail.samplesTime = clip->info.ticksPerFrame != mFormat.frameTicks;
    node.detail = detail;
    PropertyWriter properties(node.properties, "MediaNode::");
    AddStreamProperties(properties, clip->info);
    AddAlphaProperties(properties, clip->info, AlphaChoice::kAsMedia);
    properties.Number("ClipID", clip->id);
    properties.Text("MediaInstanceString", clip->info.identity.path);
    properties.Number("StreamFrameVidSubType", static_cast<std::int32_t>(clip->info.codecTag));
    properties.Bool("MediaIsOffline", false);
    properties.Bool("MediaIsPending", false);
    properties.Real("ClipSpeed", 1.0);
    properties.Bool("ClipBackwards", false);
    properties.Number("ContentStart", 0);
    properties.Number("StartTimecodeOffset", 0);
    properties.Number("ClipScaleToFramePolicy", static_cast<std::int64_t>(ScalePolicy::kFit));
    return Finish(std::move(node));
}

}  // namespace Vantrel::Host
