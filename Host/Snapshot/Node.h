// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <unordered_map>
#include <utility>
#include <variant>
#include <vector>

#include "Halden/Guid.h"
#include "Host/Media/MediaInfo.h"
#include "Host/Time/TimeMap.h"
#include "Host/Timeline/Model.h"

/// The description of sequences as the engine reads it: immutable graphs that are shared by everybody who holds them,
/// so that nodes outlive the edit that replaces them. Nothing here is locked, as nothing changes.
namespace Vantrel::Host {

struct Node;
struct Sequence;
using NodePtr = std::shared_ptr<const Node>;
using SequencePtr = std::shared_ptr<const Sequence>;
using Halden::utility::Guid;

struct NodeInput {
    /// The input's time 0 in this node's time.
    std::int64_t offset = 0;
    /// Null where a transition has nothing on one side.
    NodePtr node;
};

struct SequenceFormat {
    std::int32_t width = 1920;
    std::int32_t height = 1080;
    std::int32_t aspectNumerator = 1;
    std::int32_t aspectDenominator = 1;
    std::int64_t frameTicks = 0;
    FieldType fieldType = FieldType::kProgressive;
};

struct FileSource {
    std::string path;
};
struct ImageSequenceSource {
    ImageSequence images;
};
/// Black, one colour or nothing; components in 0..1, straight.
struct SolidSource {
    std::array<double, 4> color{};
};
struct BarsSource {};
struct TitleSource {
    Title title;
};
/// A source filter of libavfilter with its options.
struct FilterSource {
    std::string filter;
};
/// Pictures of a sequence. Media of which the engine renders the inner sequence itself have it as well as virtual
/// clips, whose frames only the host makes.
struct NestedSource {
    SequencePtr sequence;
};
/// A slate with the clip's name.
struct OfflineSource {
    std::string reason;
};
using MediaSource = std::variant<OfflineSource, FileSource, ImageSequenceSource, SolidSource, BarsSource, TitleSource,
                                 FilterSource, NestedSource>;

/// What a clip id stands for: frames by number, at the media's own size and rate.
struct MediaClip {
    /// The same for the same media as long as the program runs; 0 for media of which the engine asks no frames.
    std::uint32_t id = 0;
    /// Sizes and rates are never open here: a still has the rate of its sequence.
    MediaInfo info;
    MediaSource source;
    /// Equal for clips whose frames are equal.
    Guid identity;
};
using MediaClipPtr = std::shared_ptr<const MediaClip>;

/// A clip, nested sequence or adjustment layer on its track.
struct ItemDetail {
    std::string path;
    std::string name;
    TimeMap time;
};

struct MediaDetail {
    MediaClipPtr clip;
    /// The clip's name, for a slate.
    std::string name;
    ScalePolicy scale = ScalePolicy::kFit;
    AlphaChoice alpha = AlphaChoice::kAsMedia;
    bool frameBlend = false;
    bool deinterlace = false;
    bool reverseFieldDominance = false;
    /// Seconds of media a second, without its sign.
    double speed = 1.0;
    bool backwards = false;
    /// One moment is shown all the time.
    bool held = false;
    /// Frames don't map one to one, so the exact media time counts rather than a frame number.
    bool samplesTime = false;

    /// How the fields of the media lie; a still has none.
    [[nodiscard]] FieldType GetFieldType() const {
        return clip->info.still ? FieldType::kProgressive : clip->info.fieldType;
    }
};

struct EffectDetail {
    std::string matchName;
    std::string filterGraph;
    /// Decoded.
    std::vector<std::uint8_t> opaqueData;
    std::uint32_t instanceID = 0;
    /// By rising index, keys in parameter time.
    std::vector<Parameter> parameters;
    bool timeDependent = false;
    /// Of a track matte: the layer that it takes its matte from, at its offset in the clip's own time; null if the
    /// segment has no such layer.
    NodeInput matte;
    /// Of all that the effect does when no parameter moves; nil if one does.
    Guid constantHash;
};

struct TransitionDetail {
    std::string matchName;
    std::int64_t duration = 0;
    std::vector<Parameter> parameters;
};

struct MulticamDetail {
    Multicam options;
};

enum class NodeKind {
    kClip,
    kCompositor,
    kTransition,
    kEffect,
    kMedia,
    kPreview,
    kSolidColor,
    kDisabled,
    kMulticam,
    kAdjustment,
};

/// The name by which the engine knows a kind ("RenderableNodeClipImpl").
[[nodiscard]] const char* GetKindText(NodeKind kind);

using Properties = std::vector<std::pair<std::string, std::string>>;

/// One node of a segment's tree. It doesn't know where it stands: the same node serves every segment that shows it.
struct Node {
    NodeKind kind = NodeKind::kCompositor;
    /// Of all that the picture over all times depends on.
    Guid hash;
    std::uint32_t flags = 0;
    std::vector<NodeInput> inputs;
    /// kClip: effects, nearest to the media first.
    std::vector<NodePtr> operators;
    /// Sorted by key. A key that isn't here doesn't apply and must fail.
    Properties properties;
    std::variant<std::monostate, ItemDetail, MediaDetail, EffectDetail, TransitionDetail, MulticamDetail> detail;

    /// Null if the key doesn't apply.
    [[nodiscard]] const std::string* FindProperty(const char* key) const;
    [[nodiscard]] const ItemDetail* AsItem() const { return std::get_if<ItemDetail>(&detail); }
    [[nodiscard]] const MediaDetail* AsMedia() const { return std::get_if<MediaDetail>(&detail); }
    [[nodiscard]] const EffectDetail* AsEffect() const { return std::get_if<EffectDetail>(&detail); }
    [[nodiscard]] const TransitionDetail* AsTransition() const { return std::get_if<TransitionDetail>(&detail); }
    /// Of an effect or a transition; null if there is none with that index.
    [[nodiscard]] const Parameter* FindParameter(std::int32_t index) const;
    /// The answer to the question for the node's own time: only items map.
    [[nodiscard]] std::int64_t TransformTime(std::int64_t argument) const;
    /// What the time of a request for this node's picture (media time for media; for items what TransformTime gave for
    /// their own time; else the node's own) becomes `ticks` later on the sequence.
    [[nodiscard]] std::int64_t LaterTime(std::int64_t nodeTime, std::int64_t ticks) const;
};

/// A stretch of time in which one tree holds.
struct Segment {
    std::int64_t start = 0;
    std::int64_t end = 0;
    /// Content time (the tree's own) at `start`.
    std::int64_t offset = 0;
    NodePtr root;
};

struct SegmentList {
    /// By rising time; what lies between them is empty.
    std::vector<Segment> segments;
    /// Of the format and of every segment's place and content.
    Guid hash;
    /// The segments' roots by their hash: made once, as the engine opens a list for every update and nesting.
    std::unordered_map<Guid, NodePtr> roots;

    /// The segment that covers a time, or null.
    [[nodiscard]] const Segment* Find(std::int64_t time) const;
};

struct Sequence {
    std::uint32_t timelineID = 0;
    std::string path;
    std::string name;
    SequenceFormat format;
    /// The greatest end of a track.
    std::int64_t length = 0;
    SegmentList plain;
    /// The same with rendered previews in place of the segments that have one.
    SegmentList withPreviews;
};

}  // namespace Vantrel::Host
