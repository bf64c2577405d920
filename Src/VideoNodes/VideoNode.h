// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

#include <boost/shared_ptr.hpp>

#include "Halden/Guid.h"
#include "Halden/Strings.h"
#include "Marl/BinaryData.h"
#include "Ostrand/Status.h"
#include "Src/VideoNodes/NodeType.h"
#include "Src/VideoNodes/VideoNodeIDOwner.h"
#include "Vantrel/IRenderNode.h"

namespace Vantrel {

using Halden::WideString;

/// What a view is made of: the host's answers and its place in the segment.
struct VideoNodeRecord {
    VideoNodeIDOwnerRef owner;
    std::int64_t timeOffset = 0;
    std::uint32_t timelineID = 0;
    Guid hash;
    std::uint32_t flags = 0;
};

/// A live view of a host node: it holds an id and reads the host on demand. A property that is missing or malformed has
/// a default, nothing throws. After its parent is set a view doesn't change, and any thread may read it.
class VideoNode {
public:
    explicit VideoNode(VideoNodeRecord record) : mRecord(std::move(record)) {}
    virtual ~VideoNode() = default;
    [[nodiscard]] virtual NodeType GetNodeType() const { return NodeType::kUnknown; }
    VideoNode(const VideoNode&) = delete;
    VideoNode& operator=(const VideoNode&) = delete;

    /// The enclosing clip or adjustment view; empty for a segment's root.
    [[nodiscard]] const VideoNodeRef& GetParent() const { return mParent; }
    void SetParent(const VideoNodeRef& parent) { mParent = parent; }
    [[nodiscard]] std::uint32_t GetNodeID() const { return mRecord.owner->GetNodeID(); }
    /// The sum of the input offsets from the segment's root down to here, in ticks.
    [[nodiscard]] std::int64_t GetTimeOffset() const { return mRecord.timeOffset; }
    [[nodiscard]] std::uint32_t GetTimelineID() const { return mRecord.timelineID; }
    [[nodiscard]] const Guid& GetHash() const { return mRecord.hash; }
    [[nodiscard]] bool IsStill() const;

    [[nodiscard]] std::int32_t GetInputCount() const;
    [[nodiscard]] std::int32_t GetOperatorCount() const;

    /// A parameter's value at a time of the node (see ToNodeTime). When the host fails, the value is what its record
    /// holds.
    [[nodiscard]] bool GetBoolParam(std::int32_t index, std::int64_t ticks) const;
    [[nodiscard]] std::uint8_t GetByteParam(std::int32_t index, std::int64_t ticks) const;
    [[nodiscard]] std::uint16_t GetShortParam(std::int32_t index, std::int64_t ticks) const;
    [[nodiscard]] std::int32_t GetIntParam(std::int32_t index, std::int64_t ticks) const;
    [[nodiscard]] std::int64_t GetInt64Param(std::int32_t index, std::int64_t ticks) const;
    [[nodiscard]] float GetFloatParam(std::int32_t index, std::int64_t ticks) const;
    [[nodiscard]] double GetDoubleParam(std::int32_t index, std::int64_t ticks) const;
    /// Four 16-bit words, the least significant first, each over 65280: 1.0 is 0xFF00, and nothing is clamped.
    void GetColorParam(std::int32_t index, std::int64_t ticks, float& first, float& second, float& third,
                       float& fourth) const;
    void GetPointParam(std::int32_t index, std::int64_t ticks, double& x, double& y) const;

    /// The first keyframe after a time; kStatus_Failure when there is none.
    Status GetNextKeyframeTime(std::int32_t index, std::int64_t ticks, std::int64_t& keyframeTicks,
                               std::int32_t& keyframe) const;

    /// A time of the segment as the node's own time; with `askHost` through the host's mapping of the clip.
    [[nodiscard]] std::int64_t ToNodeTime(std::int64_t ticks, bool askHost) const;

    // Properties. When the host has none, kStatus_Failure comes back and `out` stays, but for GetBoolProperty, which
    // then sets it to false. Text that isn't a number reads as 0.
    Status GetBoolProperty(const char* key, bool& out) const;
    Status GetIntProperty(const char* key, std::int32_t& out) const;
    Status GetInt64Property(const char* key, std::int64_t& out) const;
    Status GetDoubleProperty(const char* key, double& out) const;
    /// The lower three bytes of a number.
    Status GetColorProperty(const char* key, std::uint32_t& out) const;
    Status GetTextProperty(const char* key, std::string& out) const;
    Status GetBinaryProperty(const char* key, Marl::BinaryData& out) const;

protected:
    // For the named accessors, which are called "Get" and the key without its family.
    [[nodiscard]] bool ReadBool(const char* key) const;
    [[nodiscard]] std::int32_t ReadInt(const char* key, std::int32_t preset = 0) const;
    [[nodiscard]] std::int64_t ReadInt64(const char* key, std::int64_t preset = 0) const;
    [[nodiscard]] double ReadDouble(const char* key, double preset) const;
    [[nodiscard]] WideString ReadWideText(const char* key) const;
    [[nodiscard]] Marl::BinaryData ReadBinary(const char* key) const;

private:
    template <class T>
    [[nodiscard]] T ReadParam(std::int32_t index, std::int64_t ticks) const;
    template <class T>
    Status ReadNumber(const char* key, T& out) const;

    VideoNodeRef mParent;
    VideoNodeRecord mRecord;
};

}  // namespace Vantrel
