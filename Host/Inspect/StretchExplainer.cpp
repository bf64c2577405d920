// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Inspect/StretchExplainer.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>

#include "Host/Software/EffectRunner.h"
#include "Vantrel/EffectTable.h"

namespace Vantrel::Host {

namespace {

using Topic = Reason::Topic;

constexpr const char* kMotionKey = "TQ.XQVE Motion";
constexpr const char* kOpacityKey = "TQ.XQVE Opacity";
/// What brings a picture of the host's to the device, decoded or rendered.
constexpr const char* kUploadKey = "Upload Node";
/// Media whose frames come in a form that the host alone reads.
constexpr std::uint32_t kHostSubType = 0x444C594D;

std::string Quoted(const std::string& name) { return "'" + name + "'"; }

std::string FileNameOf(const std::string& path) { return path.substr(path.rfind('/') + 1); }

std::string TextOf(double number) {
    char text[32];
    (void)std::snprintf(text, sizeof text, "%.6g", number);
    return text;
}

std::string SizeAndRate(const MediaInfo& info) {
    std::string text = std::to_string(info.width) + "x" + std::to_string(info.height);
    if (info.still || info.ticksPerFrame <= 0) return text;
    return text + ", " +
           TextOf(static_cast<double>(Vellum::kTicksPerSecond) / static_cast<double>(info.ticksPerFrame)) + " fps";
}

std::string CodecText(std::uint32_t code) {
    std::string text;
    for (int shift = 24; shift >= 0; shift -= 8) {
        const char c = static_cast<char>(code >> static_cast<unsigned>(shift) & 0xFFU);
        if (c >= ' ' && c <= '~') text += c;
    }
    return text.empty() ? "none" : text;
}

std::int64_t NumberOf(const Node& node, const char* key) {
    const std::string* text = node.FindProperty(key);
    return text ? std::strtoll(text->c_str(), nullptr, 10) : 0;
}

TreeNode MakeNode(const char* kind, const std::string& name, const std::string& key = "") {
    TreeNode tree;
    tree.kind = kind;
    tree.name = name;
    tree.key = key;
    return tree;
}

TreeNode MakeBlack() { return MakeNode("black", "Black", "BlackVideoSource"); }

void MarkHost(TreeNode& tree) {
    tree.side = TreeNode::Side::kHost;
    tree.key.clear();
    for (TreeNode& input : tree.inputs) MarkHost(input);
}

/// Kind and detail by what the pictures come from.
TreeNode MakeMedia(const MediaDetail& detail) {
    constexpr const char* kKinds[] = {"offline", "media", "images", "colour", "bars", "title", "generator", "sequence"};
    const MediaClip& clip = *detail.clip;
    TreeNode tree = MakeNode(kKinds[clip.source.index()], detail.name, kUploadKey);
    const auto* file = std::get_if<FileSource>(&clip.source);
    const auto* images = std::get_if<ImageSequenceSource>(&clip.source);
    const auto* filter = std::get_if<FilterSource>(&clip.source);
    const std::string from = file     ? FileNameOf(file->path)
                             : images ? images->images.prefix + "..." + images->images.suffix
                             : filter ? filter->filter
                                      : "";
    if (tree.name.empty()) tree.name = from.empty() ? tree.kind : from;
    tree.detail = (from.empty() ? "" : from + ", ") + SizeAndRate(clip.info);
    return tree;
}

}  // namespace

void StretchExplainer::Note(Reason reason) {
    const bool known = std::any_of(mReasons.begin(), mReasons.end(),
                                   [&reason](const Reason& earlier) { return earlier.text == reason.text; });
    if (!known) mReasons.push_back(std::move(reason));
}

void StretchExplainer::GiveToHost(TreeNode& tree, Reason reason) {
    MarkHost(tree);
    tree.key = kUploadKey;
    tree.reason = reason.text;
    Note(std::move(reason));
}

void StretchExplainer::RefuseSegment(TreeNode& tree, Reason reason) {
    GiveToHost(tree, std::move(reason));
    mSegmentRefused = true;
}

TreeNode StretchExplainer::Explain(const Segment& segment, TimeSpan span, const SequenceFormat& format) {
    const bool refusedAround = std::exchange(mSegmentRefused, false);
    const std::size_t reasonsAround = mReasons.size();
    TreeNode tree = Visit(segment.root.get(), span.Minus(segment.start - segment.offset), nullptr);
    if (mDevice.Exceeds(format.width, format.height)) {
        // What else stands in the way inside doesn't matter then, unless it is to be seen.
        mReasons.erase(std::remove_if(mReasons.begin() + static_cast<std::ptrdiff_t>(reasonsAround), mReasons.end(),
                                      [](const Reason& reason) { return !reason.passedThrough; }),
                       mReasons.end());
        RefuseSegment(
            tree, {Topic::kLimit, false, "",
                   "frame larger than the device's memory allows: " + mDevice.TellExcess(format.width, format.height)});
    }
    if (mSegmentRefused) MarkHost(tree);
    mSegmentRefused = refusedAround;
    return tree;
}

TreeNode StretchExplainer::Visit(const Node* node, TimeSpan span, const Node* clip) {
    if (node == nullptr) return MakeBlack();
    switch (node->kind) {
        case NodeKind::kClip:
            return VisitClip(*node, span);
        case NodeKind::kCompositor:
            return VisitInputs(*node, span, "layers", "LayerBlendNode");
        case NodeKind::kTransition:
            return VisitTransition(*node, span);
        case NodeKind::kEffect:
            return AddEffect(*node, node->inputs.empty() ? MakeBlack() : Visit(node->inputs[0].node.get(), span, clip));
        case NodeKind::kMedia:
            return VisitMedia(*node, span, clip);
        case NodeKind::kPreview:
            return VisitPreview(*node);
        case NodeKind::kDisabled:
            return VisitInputs(*node, span, "disabled", "DisabledNode");
        case NodeKind::kMulticam:
            return VisitInputs(*node, span, "multicam", "MulticamRenderNode");
        case NodeKind::kAdjustment:
            return VisitAdjustment(*node, span);
        case NodeKind::kSolidColor:
            break;
    }
    TreeNode tree = MakeNode("colour", "Colour");
    RefuseSegment(tree, {Topic::kNode, false, "", "a colour that only the host draws"});
    return tree;
}

TreeNode StretchExplainer::VisitInputs(const Node& node, TimeSpan span, const char* kind, const char* key) {
    TreeNode tree = MakeNode(kind, kind, key);
    tree.name[0] = static_cast<char>(tree.name[0] - 'a' + 'A');
    for (const NodeInput& input : node.inputs) {
        tree.inputs.push_back(Visit(input.node.get(), span.Minus(input.offset), nullptr));
    }
    if (!mDevice.HasNode(key)) {
        GiveToHost(tree, {Topic::kNode, false, kind, std::string("no device version of the node ") + Quoted(key)});
    }
    return tree;
}

TreeNode StretchExplainer::VisitClip(const Node& clip, TimeSpan span) {
    TreeNode tree = MakeBlack();
    if (!clip.inputs.empty()) {
        const NodeInput& input = clip.inputs[0];
        tree = Visit(input.node.get(), span.Minus(input.offset), &clip);
    }
    for (const NodePtr& effect : clip.operators) tree = AddEffect(*effect, std::move(tree));
    return tree;
}

TreeNode StretchExplainer::AddEffect(const Node& effect, TreeNode below) {
    const EffectDetail& detail = *effect.AsEffect();
    const std::string& key = detail.matchName;
    const EffectRow* row = FindEffect(key.c_str());
    const char* kind = key == kMotionKey ? "motion" : key == kOpacityKey ? "opacity" : "effect";
    TreeNode tree = MakeNode(kind, row ? row->label : key, key);
    tree.detail = row ? key : "";
    tree.inputs.push_back(std::move(below));
    if (mDevice.HasNode(key)) return tree;
    const bool hostHasIt = !detail.filterGraph.empty() || Software::FindEffectFunction(key) != nullptr;
    Reason reason{Topic::kEffect, false, key, "no device version of the effect " + Quoted(key)};
    reason.passedThrough = !hostHasIt;
    if (!hostHasIt) reason.text += "; the host has none either and passes the picture through";
    GiveToHost(tree, std::move(reason));
    return tree;
}

TreeNode StretchExplainer::VisitTransition(const Node& transition, TimeSpan span) {
    const std::string& key = transition.AsTransition()->matchName;
    TreeNode tree = MakeNode("transition", key, key);
    for (const NodeInput& input : transition.inputs) {
        tree.inputs.push_back(Visit(input.node.get(), span.Minus(input.offset), nullptr));
    }
    if (!mDevice.HasNode(key)) {
        GiveToHost(tree, {Topic::kTransition, false, key, "no device version of the transition " + Quoted(key)});
    }
    return tree;
}

TreeNode StretchExplainer::VisitAdjustment(const Node& adjustment, TimeSpan span) {
    TreeNode tree = MakeNode("adjustment", "Adjustment layer", "AdjustmentNode");
    if (adjustment.inputs.size() > 1) {
        const NodeInput& clip = adjustment.inputs[1];
        tree.inputs.push_back(Visit(clip.node.get(), span.Minus(clip.offset), nullptr));
        if (const ItemDetail* item = clip.node ? clip.node->AsItem() : nullptr) tree.name = item->name;
        // Its effects go to the host together with the layer, not one by one.
        for (const NodePtr& effect : clip.node->operators) {
            if (!mDevice.HasNode(effect->AsEffect()->matchName)) MarkHost(tree);
        }
    }
    if (!mDevice.HasNode(tree.key)) {
        GiveToHost(tree, {Topic::kNode, false, tree.name, "no device version of adjustment layers"});
    }
    return tree;
}

TreeNode StretchExplainer::VisitPreview(const Node& preview) {
    TreeNode tree = MakeMedia(*preview.AsMedia());
    tree.kind = "preview";
    Note({Topic::kPreview, false, tree.name, "a rendered preview plays: " + tree.name});
    return tree;
}

TreeNode StretchExplainer::VisitMedia(const Node& media, TimeSpan span, const Node* clip) {
    const MediaDetail& detail = *media.AsMedia();
    TreeNode tree = MakeMedia(detail);
    const ItemDetail* item = clip ? clip->AsItem() : nullptr;
    const auto* nested = std::get_if<NestedSource>(&detail.clip->source);
    if (nested == nullptr) {
        CheckMedia(tree, media);
        return tree;
    }
    if (!nested->sequence->name.empty()) tree.name = nested->sequence->name;
    if (item && !item->name.empty()) tree.name = item->name;
    TimeSpan inner = span;
    if (clip && span.end > span.start) {
        const std::int64_t first = clip->TransformTime(span.start);
        const std::int64_t last = clip->TransformTime(span.end - 1);
        inner = {std::min(first, last), std::max(first, last) + 1};
    }
    if (media.FindProperty("MediaNode::ClipID") == nullptr) {
        VisitSequence(tree, *nested->sequence, inner, item);
        return tree;
    }
    const Reason reason{
        Topic::kSpeed, false, tree.name,
        "the nested sequence " + Quoted(tree.name) + " is frozen, backwards or remapped: the host makes its frames"};
    Note(reason);  // ahead of what lies inside
    VisitSequence(tree, *nested->sequence, inner, nullptr);
    GiveToHost(tree, reason);
    return tree;
}

void StretchExplainer::VisitSequence(TreeNode& media, const Sequence& sequence, TimeSpan span, const ItemDetail* item) {
    media.key = "NestedTimelineSource";
    if (item && item->time.ClipSpeed() != 1.0) {
        Note({Topic::kSpeed, false, media.name,
              "speed isn't 1.0: the nested sequence " + Quoted(media.name) + " plays at " +
                  TextOf(item->time.ClipSpeed())});
    }
    for (const Segment& segment : sequence.plain.segments) {
        const TimeSpan part{std::max(span.start, segment.start), std::min(span.end, segment.end)};
        if (part.start < part.end) media.inputs.push_back(Explain(segment, part, sequence.format));
    }
    if (media.inputs.empty()) media.inputs.push_back(MakeBlack());
}

void StretchExplainer::CheckMedia(TreeNode& tree, const Node& media) {
    const MediaDetail& detail = *media.AsMedia();
    const MediaInfo& info = detail.clip->info;
    if (const auto* offline = std::get_if<OfflineSource>(&detail.clip->source)) {
        const std::string& name = detail.name.empty() ? tree.name : detail.name;
        GiveToHost(tree, {Topic::kMedia, false, name,
                          "media offline: " + name + (offline->reason.empty() ? "" : " (" + offline->reason + ")")});
        return;
    }
    if (media.FindProperty("MediaNode::ClipID") == nullptr) {
        const std::string* code = media.FindProperty("MediaNode::MediaInstanceString");
        tree.key.clear();
        if (!code || !mDevice.HasNode(*code)) {
            GiveToHost(tree, {Topic::kMedia, false, tree.name,
                              "no device version of the generator " + Quoted(tree.name) + " (" + tree.kind + ")"});
        }
    } else if (mDevice.Exceeds(info.width, info.height)) {
        Reason reason{Topic::kLimit, false, tree.name,
                      "media larger than the device's memory allows: " + tree.name + ", " +
                          mDevice.TellExcess(info.width, info.height)};
        // Without scaling even the host's picture of it would be as large as the media.
        detail.scale == ScalePolicy::kNone ? RefuseSegment(tree, std::move(reason))
                                           : GiveToHost(tree, std::move(reason));
    }
    const auto code = static_cast<std::uint32_t>(NumberOf(media, "MediaNode::StreamFrameVidSubType"));
    if (code == kHostSubType) {
        GiveToHost(tree, {Topic::kMedia, false, tree.name, "media of a kind that the host reads: " + tree.name});
    } else if (code != mSnapshot.nativeSubType) {
        Note({Topic::kMedia, true, tree.name,
              "media " + Quoted(tree.name) + " isn't of the sequence's native codec: " + CodecText(code) + ", not " +
                  CodecText(mSnapshot.nativeSubType)});
    }
}

}  // namespace Vantrel::Host
