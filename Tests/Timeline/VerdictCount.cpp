// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tests/Timeline/VerdictCount.h"

#include <utility>

namespace Vantrel::Testing {
namespace {

std::string Get(const FakeNode& node, const std::string& key, const std::string& otherwise = "0") {
    const auto found = node.properties.find(key);
    return found == node.properties.end() ? otherwise : found->second;
}

bool Has(const FakeNode& node, const std::string& key) { return node.properties.count(key) != 0; }

double Speed(const FakeNode& node, const std::string& key) { return std::stod(Get(node, key, "1")); }

/// Of these a host's picture stands for work that the device couldn't do.
bool CountsAsHosts(const std::string& kind) { return kind == "Clip" || kind == "Transition" || kind == "Effect"; }

/// From here on it is one layer of the host's.
void GoesToHost(SegmentInfo& r) {
    r.hostPart = true;
    r.effectCount = r.intrinsicCount = r.transitionCount = 0;
    r.nestedEffectCount = r.nestedIntrinsicCount = r.nestedTransitionCount = 0;
    r.layerCount = r.nestedLayerCount = 1;
}

/// A record for one layer of a stretch.
SegmentInfo LayerAt(const SegmentInfo& stretch) {
    SegmentInfo layer;
    layer.in = stretch.in;
    layer.out = stretch.out;
    layer.offset = stretch.offset;
    return layer;
}

/// An effect is the host's, with all that lies below, as soon as anything of it is.
void CountEffect(const std::string& matchName, SegmentInfo& r, bool host) {
    if (host) return GoesToHost(r);
    const bool intrinsic = matchName == "TQ.XQVE Motion" || matchName == "TQ.XQVE Opacity";
    ++(intrinsic ? r.intrinsicCount : r.effectCount);
}

void FoldCommon(SegmentInfo& r, const SegmentInfo& layer) {
    r.hostWhole |= layer.hostWhole;
    r.hostPart |= layer.hostPart;
    r.realTime &= layer.realTime;
    r.isPreview = layer.isPreview;
    r.nested |= layer.nested;
    if (layer.layerCount > 1 || r.layerCount == 0) r.layerCount += layer.layerCount;
    r.effectCount += layer.effectCount;
    r.intrinsicCount += layer.intrinsicCount;
    r.transitionCount += layer.transitionCount;
}

/// The work of a nested sequence, or of one of its segments, is nested work for whoever holds it.
void FoldNested(SegmentInfo& r, const SegmentInfo& inner) {
    r.nestedLayerCount = std::max(r.nestedLayerCount, 1) + (inner.nestedLayerCount > 1 ? inner.nestedLayerCount : 0) +
                         (inner.layerCount > 1 ? inner.layerCount : 0);
    r.nestedEffectCount += inner.effectCount + inner.nestedEffectCount;
    r.nestedIntrinsicCount += inner.intrinsicCount + inner.nestedIntrinsicCount;
    r.nestedTransitionCount += inner.transitionCount + inner.nestedTransitionCount;
}

}  // namespace

void VerdictCount::ReadTop(std::uint32_t sequence) {
    mBefore = std::exchange(mKnown, {});
    Read(mHost.sequences.at(sequence), {0, mEnd, 0}, nullptr, true);
}

void VerdictCount::Read(const FakeSequence& sequence, const Range& range, SegmentInfo* outer, bool top) {
    const std::int64_t shift = range.in - range.offset;
    std::int64_t reached = range.in;
    const auto blackUpTo = [&](std::int64_t time) {
        SegmentInfo gap;
        gap.in = reached;
        gap.out = time;
        if (reached < time) Enter(gap, false, top);
        reached = std::max(reached, time);
    };
    for (const FakeSegment& segment : sequence.segments) {
        if (reached >= range.out) return;
        const std::int64_t in = std::max(range.in, segment.start + shift);
        const std::int64_t out = std::min(range.out, segment.end + shift);
        blackUpTo(in);  // a gap ends where its segment starts, even if that lies beyond the range
        if (reached >= out) continue;
        const SegmentInfo verdict = Place(segment, {in, out, segment.offset + in - segment.start - shift}, top);
        if (outer) FoldNested(*outer, verdict);
        reached = out;
    }
    blackUpTo(range.out);
}

SegmentInfo VerdictCount::Place(const FakeSegment& segment, const Range& range, bool top) {
    const std::optional<SegmentInfo> standing = rendered.At(range.in);
    if (standing && !standing->nested && standing->guid == segment.hash && standing->in == range.in &&
        standing->out == range.out && standing->offset == range.offset) {
        return *standing;  // and both maps stay as they are
    }
    if (top) {
        rendered.Erase(range.in, range.out);
        merged.Erase(range.in, range.out);
    }
    SegmentInfo info;
    auto known = mKnown.find(segment.hash);
    if (known == mKnown.end()) {
        const auto before = mBefore.find(segment.hash);
        if (before != mBefore.end()) known = mKnown.insert(*before).first;
    }
    if (known != mKnown.end()) info = known->second;
    info.in = range.in;
    info.out = range.out;
    info.offset = range.offset;
    info.guid = segment.hash;
    if (known != mKnown.end()) {
        // What is taken over says who renders it, not what became of the first occurrence.
        info.accelerated = true;
        Enter(info, info.hostPart, top);
        return info;
    }
    bool host = false;
    if (!Node(segment.node, {info, host})) host = info.hostWhole = true;
    if (host) {
        info.hostPart = true;
        info.realTime = info.accelerated = false;
    }
    Enter(info, host, top);
    if (info.isPreview && !top && !info.hostWhole) info.realTime = false;
    if (!info.nested && !info.flattened) mKnown[segment.hash] = info;
    return info;
}

void VerdictCount::Enter(SegmentInfo info, bool host, bool top) {
    if (info.flattened) return;
    if (info.isPreview && !top && !info.hostWhole) {
        info.realTime = false;
    } else {
        info.accelerated &= !info.hostWhole && !host;
    }
    if (top || mCreator.unregistered.count("NestedTimelineNode") != 0) rendered.Replace(info);
    merged.Merge(info);
}

bool VerdictCount::Make(const std::string& key, const std::string& kind, bool& host) const {
    if (mCreator.refused.count(key) != 0) return false;
    const bool fallsBack = mCreator.unregistered.count(key) != 0 || mCreator.failing.count(key) != 0;
    if (fallsBack ? CountsAsHosts(kind) : mCreator.needHost.count(key) != 0) {
        host = true;
    }
    return true;
}

bool VerdictCount::Node(std::uint32_t id, Account account) {
    if (id == 0) return Make("BlackVideoSource", "", account.host);
    const FakeNode& node = At(id);
    if (node.kind == "Clip") return Clip(node, account);
    if (node.kind == "Compositor") return Compositor(node, account);
    if (node.kind == "Transition") return Transition(node, account);
    if (node.kind == "Effect") return EffectOver(node, account);
    if (node.kind == "Multicam") return Multicam(node, account);
    if (node.kind == "Adjustment") return Adjustment(node, account);
    if (node.kind == "Media") return Media(node, nullptr, account);
    if (node.kind == "Disabled") {
        return Make("DisabledNode", node.kind, account.host) && Node(node.inputs.at(0).node, account);
    }
    if (node.kind != "Preview" || !Media(node, nullptr, account)) return false;
    account.record.isPreview = account.host = true;
    return true;
}

bool VerdictCount::Clip(const FakeNode& clip, Account account) {
    if (clip.inputs.size() != 1) return false;
    if (Speed(clip, "ClipNode::ClipSpeed") != 1 || Has(clip, "ClipNode::TimeRemapping")) {
        ++account.record.intrinsicCount;
    }
    if (!clip.operators.empty() && mCreator.unregistered.count("LayerBlendNode") != 0) return false;
    if (!Media(At(clip.inputs[0].node), &clip, account)) return false;
    for (const std::uint32_t op : clip.operators) {
        if (!Operator(Get(At(op), "EffectNode::FilterMatchName"), account)) return false;
    }
    return true;
}

bool VerdictCount::Operator(const std::string& matchName, Account account) const {
    if (!Make(matchName, "Effect", account.host)) return false;
    CountEffect(matchName, account.record, account.host);
    return true;
}

bool VerdictCount::EffectOver(const FakeNode& node, Account account) {
    // What lies below may be given to the host whole, and then nothing of the device's needs it any more.
    bool own = false;
    const std::string matchName = Get(node, "EffectNode::FilterMatchName");
    if (!Make(matchName, node.kind, own) || !Node(node.inputs.at(0).node, {account.record, own})) return false;
    CountEffect(matchName, account.record, own);
    account.host |= own;
    return true;
}

bool VerdictCount::Compositor(const FakeNode& node, Account account) {
    const auto count = static_cast<std::int32_t>(node.inputs.size());
    if (mCreator.unregistered.count("LayerBlendNode") != 0) {
        const bool clipAlone = count == 1 && node.inputs[0].node != 0 && At(node.inputs[0].node).kind == "Clip";
        return clipAlone && Clip(At(node.inputs[0].node), account);
    }
    if (!Make("LayerBlendNode", node.kind, account.host)) return false;
    SegmentInfo& r = account.record;
    for (const FakeNode::Input& input : node.inputs) {
        SegmentInfo layer = LayerAt(r);
        if (!Node(input.node, {layer, account.host})) return false;
        FoldCommon(r, layer);
        r.accelerated &= layer.accelerated && !layer.hostWhole && !layer.hostPart;
        if (layer.nestedLayerCount > 1 || r.nestedLayerCount == 0) r.nestedLayerCount += layer.nestedLayerCount;
        r.nestedEffectCount += layer.nestedEffectCount;
        r.nestedIntrinsicCount += layer.nestedIntrinsicCount;
        r.nestedTransitionCount += layer.nestedTransitionCount;
    }
    if (count > 1 || r.layerCount == 0) r.layerCount += count;
    return true;
}

bool VerdictCount::Transition(const FakeNode& node, Account account) {
    bool own = false, sides = false;
    if (!Make(Get(node, "TransitionNode::TransitionMatchName"), node.kind, own)) return false;
    for (const FakeNode::Input& input : node.inputs) {
        bool side = false;
        if (!Node(input.node, {account.record, side})) return false;
        sides |= side;
    }
    account.host |= own || sides;
    if (own) {
        GoesToHost(account.record);
    } else {
        ++account.record.transitionCount;
    }
    return true;
}

bool VerdictCount::Multicam(const FakeNode& node, Account account) {
    if (!Make("MulticamRenderNode", node.kind, account.host)) return false;
    SegmentInfo& r = account.record;
    for (const FakeNode::Input& input : node.inputs) {
        if (input.node == 0) continue;
        if (mCreator.unregistered.count("NestedTimelineNode") != 0) {
            account.host = CountsAsHosts(At(input.node).kind);  // what it says is said of the last angle
            continue;
        }
        SegmentInfo angle = LayerAt(r);
        if (!Node(input.node, {angle, account.host})) return false;
        FoldCommon(r, angle);
        r.nestedLayerCount = angle.nestedLayerCount + r.layerCount;
        r.nestedEffectCount = angle.nestedEffectCount + r.effectCount;
        r.nestedIntrinsicCount = angle.nestedIntrinsicCount + r.intrinsicCount;
        r.nestedTransitionCount = angle.nestedTransitionCount + r.transitionCount;
    }
    return true;
}

bool VerdictCount::Adjustment(const FakeNode& node, Account account) {
    if (!Make("AdjustmentNode", node.kind, account.host)) return false;
    if (!Compositor(At(node.inputs.at(0).node), account)) return false;
    const FakeNode& layer = At(node.inputs.at(1).node);
    if (!Node(layer.inputs.at(0).node, account)) return false;
    for (const std::uint32_t op : layer.operators) {
        bool own = false;
        if (!Operator(Get(At(op), "EffectNode::FilterMatchName"), {account.record, own})) return false;
        if (!own) continue;
        account.host = false;  // the host renders the whole of it, and with it whatever it holds
        return true;
    }
    const bool opaque = Get(node, "AdjustmentNode::AdjustmentMediaIsOpaque") != "0";
    return opaque || Node(node.inputs.at(2).node, account);
}

bool VerdictCount::Media(const FakeNode& media, const FakeNode* clip, Account account) {
    const std::string nested = Get(media, "MediaNode::NestedSequenceTimelineID");
    const bool isNested = nested != "0" || Get(media, "MediaNode::SelectedMulticamTrackTimelineID") != "0";
    const bool plain = Get(media, "MediaNode::StreamFrameWidth") == "64" &&
                       Get(media, "MediaNode::StreamFrameHeight") == "36" &&
                       Get(media, "MediaNode::StreamFrameRate") == "10160640000" &&
                       Speed(media, "MediaNode::ClipSpeed") == 1 && !(clip && Has(*clip, "ClipNode::TimeRemapping"));
    if (clip && !plain) ++account.record.intrinsicCount;
    if (isNested) return Nested(media, clip, plain, account);
    const bool missing = Has(media, "MediaNode::SelectedMulticamTrack") &&
                         std::stoul(Get(media, "MediaNode::SelectedMulticamTrack")) >= media.inputs.size();
    return missing ? Node(0, account) : Stream(media, account);
}

bool VerdictCount::Stream(const FakeNode& media, Account account) {
    if (!Make("HostRenderClip", media.kind, account.host)) {
        account.host = true;
        return false;
    }
    SegmentInfo& r = account.record;
    if (Get(media, "MediaNode::MediaIsOffline") != "0" || Get(media, "MediaNode::MediaIsPending") != "0") {
        r.realTime = false;
        return true;
    }
    const std::string subType = Get(media, "MediaNode::StreamFrameVidSubType");
    r.isPreview = media.kind == "Preview";
    r.realTime &= mNative.count(subType) != 0;
    if (subType == std::to_string(0x444C594D)) r.hostPart = account.host = true;
    return true;
}

bool VerdictCount::Nested(const FakeNode& media, const FakeNode* clip, bool plain, Account account) {
    const double speed = Speed(media, "MediaNode::ClipSpeed");
    SegmentInfo& r = account.record;
    const bool hasNode = mCreator.unregistered.count("NestedTimelineNode") == 0;
    r.nested |= hasNode;
    if (!hasNode) {
        const bool runs = clip && (Speed(*clip, "ClipNode::ClipSpeed") != 1 || Has(*clip, "ClipNode::FrameHoldAtTime"));
        if (!plain || runs) {
            account.host = true;
            return false;
        }
        r.flattened = true;
    }
    std::string id = Get(media, "MediaNode::NestedSequenceTimelineID");
    if (id == "0") id = Get(media, "MediaNode::SelectedMulticamTrackTimelineID");
    const auto at = [speed](std::int64_t time) {
        return static_cast<std::int64_t>(speed * static_cast<double>(time) + 0.5);
    };
    SegmentInfo inner;
    Read(mHost.sequences.at(static_cast<std::uint32_t>(std::stoul(id))), {at(r.in), at(r.out), at(r.offset)},
         hasNode ? &inner : nullptr, false);
    FoldNested(r, inner);
    account.host |= speed != 1 || (clip && Has(*clip, "ClipNode::TimeRemapping"));
    return true;
}

}  // namespace Vantrel::Testing
