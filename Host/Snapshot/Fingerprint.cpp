// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Snapshot/Fingerprint.h"

#include <algorithm>

#include "Host/Snapshot/ContentHasher.h"
#include "Host/Time/ExactTime.h"
#include "Vellum/FieldOrder.h"

namespace Vantrel::Host {
namespace {

/// The frame, or in interlaced media the field, that lies at a media time.
std::int64_t MediaFieldAt(const MediaInfo& info, std::int64_t mediaTime) {
    const std::int64_t frame = MediaFrameAt(info, mediaTime);
    if (info.still || info.fieldType == FieldType::kProgressive) return frame;
    return 2 * frame + (FrameNumberAt(mediaTime, Vellum::HalfFrameTicks(info.ticksPerFrame)) & 1);
}

bool HoldsTwoMoments(const VantrelRenderDescription& description, std::int64_t fieldTicks) {
    return fieldTicks > 0 && Vellum::IsInterlaced(description.fieldType);
}

/// Walks a tree at one instant and collects what the picture shows there.
class Evaluation {
public:
    /// @param time the node's own time; media time for media
    void Node(const Host::Node& node, std::int64_t time) {
        mHasher.Number(static_cast<std::int64_t>(node.kind));
        switch (node.kind) {
            case NodeKind::kClip:
                return Clip(node, node.AsItem()->time.AtItemTime(time), node.operators.size());
            case NodeKind::kMedia:
            case NodeKind::kPreview:
            case NodeKind::kSolidColor:
                return Media(*node.AsMedia(), time);
            case NodeKind::kTransition:
                Transition(node, time);
                break;
            case NodeKind::kAdjustment:
                return Adjustment(node, time);
            case NodeKind::kMulticam:
                for (const auto& [key, value] : node.properties) mHasher.Text(value);
                break;
            default:
                break;
        }
        for (const NodeInput& input : node.inputs) Input(input, time);
    }

    void Clip(const Host::Node& node, const ItemTimes& times, std::size_t endOperator) {
        const NodeInput& input = node.inputs.front();
        const bool media = input.node->AsMedia() != nullptr;
        Node(*input.node, media ? times.media : times.item - input.offset);
        Operators(node, times, endOperator);
    }

    void Description(const VantrelRenderDescription& description, std::int64_t fieldTicks) {
        mHasher.Number(fieldTicks);
        mHasher.Number(description.width).Number(description.height);
        mHasher.Number(description.aspectNumerator).Number(description.aspectDenominator);
        mHasher.Number(description.quality).Number(description.fieldType).Number(description.compositeOnBlack);
        for (std::int32_t i = 0; i < description.pixelFormatCount; ++i) mHasher.Number(description.pixelFormats[i]);
    }

    [[nodiscard]] Guid Finish() const { return mHasher.Finish(); }

private:
    void Input(const NodeInput& input, std::int64_t time) {
        mHasher.Number(input.node != nullptr);
        if (input.node) Node(*input.node, time - input.offset);
    }

    void Operators(const Host::Node& node, const ItemTimes& times, std::size_t endOperator) {
        for (std::size_t i = 0; i < std::min(endOperator, node.operators.size()); ++i) {
            const EffectDetail& effect = *node.operators[i]->AsEffect();
            if (!effect.constantHash.IsNil()) {
                mHasher.Identifier(effect.constantHash);
                continue;
            }
            mHasher.Text(effect.matchName).Text(effect.filterGraph);
            mHasher.Number(static_cast<std::int64_t>(effect.opaqueData.size()));
            mHasher.Bytes(effect.opaqueData.data(), effect.opaqueData.size());
            Parameters(effect.parameters, times.parameters);
            if (effect.timeDependent) Times(node, times);
            Input(effect.matte, times.item);
        }
    }

    /// All that a burnt-in timecode can show.
    void Times(const Host::Node& clip, const ItemTimes& times) {
        mHasher.Number(times.parameters).Number(times.item);
        const NodePtr& media = clip.inputs.at(0).node;
        const std::string* start = media ? media->FindProperty("MediaNode::StartTimecodeOffset") : nullptr;
        if (start) mHasher.Text(*start);
    }

    void Parameters(const std::vector<Parameter>& parameters, std::int64_t time) {
        for (const Parameter& parameter : parameters) {
            const ParameterValue value = parameter.At(time);
            mHasher.Number(parameter.index).Bytes(value.data(), value.size() * sizeof value[0]);
        }
    }

    void Transition(const Host::Node& node, std::int64_t time) {
        const TransitionDetail& transition = *node.AsTransition();
        mHasher.Text(transition.matchName).Number(time).Number(transition.duration);
        Parameters(transition.parameters, time);
        // With their keys: a width of 2 isn't a direction of 2.
        for (const auto& [key, value] : node.properties) mHasher.Text(key).Text(value);
    }

    /// The clip's picture is the one below, which is walked once for both.
    void Adjustment(const Host::Node& node, std::int64_t time) {
        Input(node.inputs[0], time);
        const Host::Node& clip = *node.inputs[1].node;
        Operators(clip, clip.AsItem()->time.AtItemTime(time - node.inputs[1].offset), clip.operators.size());
    }

    void Media(const MediaDetail& media, std::int64_t time) {
        const MediaClip& clip = *media.clip;
        mHasher.Number(static_cast<std::int64_t>(media.scale)).Number(static_cast<std::int64_t>(media.alpha));
        mHasher.Number(media.frameBlend)
            .Number(media.deinterlace)
            .Number(media.reverseFieldDominance)
            .Number(media.held && media.GetFieldType() != FieldType::kProgressive);
        mHasher.Number(clip.info.width).Number(clip.info.height);
        const auto* nested = std::get_if<NestedSource>(&clip.source);
        if (nested != nullptr && clip.id == 0 && !media.samplesTime) return Nested(*nested->sequence, time);
        mHasher.Identifier(clip.identity);
        // Of how much lies in a blended frame, and of the order of its fields.
        if (media.samplesTime) mHasher.Real(media.speed).Number(media.backwards);
        mHasher.Number(media.samplesTime ? time : MediaFieldAt(clip.info, time));
    }

    void Nested(const Sequence& sequence, std::int64_t time) {
        const Segment* segment = sequence.plain.Find(time);
        mHasher.Number(segment != nullptr);
        if (segment != nullptr) Node(*segment->root, time - segment->start + segment->offset);
    }

    ContentHasher mHasher;
};

}  // namespace

std::int64_t MediaFrameAt(const MediaInfo& info, std::int64_t mediaTime) {
    if (info.still || info.ticksPerFrame <= 0) return 0;
    return std::clamp<std::int64_t>(FrameNumberAt(mediaTime, info.ticksPerFrame), 0, info.frameCount - 1);
}

ItemTimes TimesOfRawTime(const ItemDetail& item, std::int64_t rawTime) {
    const TimeMap& map = item.time;
    if (map.motion == Motion::kFreeze && map.holdFilters) return {0, map.hold, map.hold};
    return map.AtItemTime(rawTime);
}

Guid NodeFingerprint(const Node& node, std::int64_t nodeTime, const VantrelRenderDescription& description,
                     std::int64_t fieldTicks) {
    Evaluation evaluation;
    const auto add = [&](std::int64_t time) {
        if (node.kind == NodeKind::kClip) {
            evaluation.Clip(node, node.AsItem()->time.FromTransformed(time), node.operators.size());
        } else {
            evaluation.Node(node, time);
        }
    };
    add(nodeTime);
    if (HoldsTwoMoments(description, fieldTicks)) add(node.LaterTime(nodeTime, fieldTicks));
    evaluation.Description(description, fieldTicks);
    return evaluation.Finish();
}

Guid OperatorsFingerprint(const Node& clip, std::int32_t endOperator, std::int64_t rawTime,
                          const VantrelRenderDescription& description, std::int64_t fieldTicks) {
    Evaluation evaluation;
    if (const ItemDetail* item = clip.AsItem()) {
        const auto end = static_cast<std::size_t>(std::max(endOperator, 0));
        evaluation.Clip(clip, TimesOfRawTime(*item, rawTime), end);
        if (HoldsTwoMoments(description, fieldTicks)) {
            evaluation.Clip(clip, TimesOfRawTime(*item, rawTime + fieldTicks), end);
        }
    }
    evaluation.Description(description, fieldTicks);
    return evaluation.Finish();
}

Guid ClipFingerprint(const MediaClip& clip, std::int64_t mediaTime, const VantrelClipRecord& record) {
    ContentHasher hasher;
    hasher.Identifier(clip.identity).Number(MediaFieldAt(clip.info, mediaTime));
    hasher.Number(record.pixelFormat).Number(record.width).Number(record.height);
    hasher.Number(record.aspectNumerator).Number(record.aspectDenominator);
    hasher.Number(record.fieldType).Number(record.quality);
    return hasher.Finish();
}

}  // namespace Vantrel::Host
