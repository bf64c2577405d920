// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "Host/Snapshot/Node.h"
#include "Vantrel/SegmentInfo.h"

/// What the engine makes of a whole sequence, for people and programs. Holds nothing of the engine: it outlives the
/// session that it was made with.
namespace Vantrel::Host {

/// Who makes a stretch's picture.
enum class Rendering {
    kGap,         ///< nobody: black
    kDevice,      ///< the device alone; the host only reads media
    kPartlyHost,  ///< the device, from pictures or by rules that are the host's
    kHost,        ///< the host: the device shows what it rendered
};

/// Why a stretch isn't accelerated, or isn't expected to play in real time.
struct Reason {
    enum class Topic { kEffect, kTransition, kMedia, kLimit, kSpeed, kNode, kPreview, kEngine };

    Topic topic = Topic::kEngine;
    /// It costs real time only; the device renders it all the same.
    bool realTimeOnly = false;
    /// Name of the effect, transition, clip or sequence.
    std::string subject;
    /// One sentence without a stop.
    std::string text;
    /// The host has no version of the effect either: its picture shows as if the effect weren't there.
    bool passedThrough = false;
};

/// One node of what renders a stretch, the root first; a clip stands as its effects over its media.
struct TreeNode {
    enum class Side { kDevice, kHost };

    /// "layers", "transition", "effect", "motion", "opacity", "media", "images", "offline", "colour", "bars", "title",
    /// "generator", "sequence", "multicam", "disabled", "preview" or "black".
    std::string kind;
    std::string name;
    /// The name under which the engine reports the node's time; empty if it has none.
    std::string key;
    /// The effect's match name, the media's file, size and rate; may be empty.
    std::string detail;
    Side side = Side::kDevice;
    /// Why it is the host's; empty for the device's, and for what is the host's because of a node above.
    std::string reason;
    /// As measured; of media and of what the host renders, that of the upload. Absent where it wasn't measured or the
    /// report can't be told apart by name.
    std::optional<double> milliseconds;
    std::vector<TreeNode> inputs;
};

struct NodeTiming {
    std::string name;
    double milliseconds = 0;
};

/// One frame of a stretch, rendered and measured.
struct StretchFrame {
    std::int64_t frame = 0;
    /// PNG.
    std::string picture;
    std::int32_t width = 0;
    std::int32_t height = 0;
    double totalMilliseconds = 0;
    double deviceMegabytes = 0;
    /// As the engine reports them, the root first; what took next to no time isn't there.
    std::vector<NodeTiming> timings;
};

/// A stretch of time in which one tree renders and the statistics are the same. Frames are those that start in it.
struct Stretch {
    std::int64_t start = 0;  ///< ticks, half open
    std::int64_t end = 0;
    std::int64_t firstFrame = 0;  ///< half open
    std::int64_t endFrame = 0;
    Rendering rendering = Rendering::kGap;
    /// Counters and flags across all nesting levels; without a tree.
    SegmentInfo info;
    std::vector<Reason> reasons;
    TreeNode tree;
    std::optional<StretchFrame> rendered;

    [[nodiscard]] std::int64_t CountFrames() const { return endFrame - firstFrame; }
};

struct Inspection {
    std::string file;
    std::string name;
    std::string framework;  ///< "CUDA" or "OpenCL"
    std::string deviceName;
    std::uint64_t deviceMemory = 0;  ///< bytes that frames may take
    SequenceFormat format;
    std::int64_t globalStart = 0;  ///< ticks; shifts timecodes
    std::int64_t length = 0;       ///< ticks
    std::vector<Stretch> stretches;
    std::vector<std::string> warnings;
    std::vector<std::string> offline;

    /// Of a frame of the sequence, as it is shown.
    [[nodiscard]] std::string GetTimecode(std::int64_t frame) const;
    [[nodiscard]] std::int64_t GetFrameCount() const;
    [[nodiscard]] std::int64_t CountFrames(Rendering rendering) const;
    /// Nothing is offline, nothing passes through.
    [[nodiscard]] bool IsComplete() const;
};

/// "gap", "device", "partly host", "host".
[[nodiscard]] const char* GetName(Rendering rendering);

}  // namespace Vantrel::Host
