// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/VideoNodes/VideoNode.h"

#include <cstring>
#include <locale>
#include <sstream>

#include "Src/Outside/Suites.h"
#include "Src/VideoNodes/VideoClipNode.h"

namespace Vantrel {
namespace {

constexpr std::size_t kParamValueOffset = 4;
/// One is 0xFF00: the words hold 8.8 fixed point.
constexpr float kColorParamOne = 65280.0F;

}  // namespace

bool VideoNode::IsStill() const { return (mRecord.flags & kNodeFlag_Still) != 0; }

std::int32_t VideoNode::GetInputCount() const {
    std::int32_t count = 0;
    VideoSegmentSuite().GetInputCount(GetNodeID(), &count);
    return count;
}

std::int32_t VideoNode::GetOperatorCount() const {
    std::int32_t count = 0;
    VideoSegmentSuite().GetOperatorCount(GetNodeID(), &count);
    return count;
}

template <class T>
T VideoNode::ReadParam(std::int32_t index, std::int64_t ticks) const {
    static_assert(kParamValueOffset + sizeof(T) <= sizeof(VantrelParamRecord));
    VantrelParamRecord record{};
    VideoSegmentSuite().GetParam(GetNodeID(), index, ticks, &record);
    T value;
    std::memcpy(&value, record.bytes + kParamValueOffset, sizeof value);
    return value;
}

bool VideoNode::GetBoolParam(std::int32_t index, std::int64_t ticks) const {
    return ReadParam<std::uint8_t>(index, ticks) != 0;
}

std::uint8_t VideoNode::GetByteParam(std::int32_t index, std::int64_t ticks) const {
    return ReadParam<std::uint8_t>(index, ticks);
}

std::uint16_t VideoNode::GetShortParam(std::int32_t index, std::int64_t ticks) const {
    return ReadParam<std::uint16_t>(index, ticks);
}

std::int32_t VideoNode::GetIntParam(std::int32_t index, std::int64_t ticks) const {
    return ReadParam<std::int32_t>(index, ticks);
}

std::int64_t VideoNode::GetInt64Param(std::int32_t index, std::int64_t ticks) const {
    return ReadParam<std::int64_t>(index, ticks);
}

float VideoNode::GetFloatParam(std::int32_t index, std::int64_t ticks) const { return ReadParam<float>(index, ticks); }

double VideoNode::GetDoubleParam(std::int32_t index, std::int64_t ticks) const {
    return ReadParam<double>(index, ticks);
}

void VideoNode::GetColorParam(std::int32_t index, std::int64_t ticks, float& first, float& second, float& third,
                              float& fourth) const {
    const auto words = ReadParam<std::uint64_t>(index, ticks);
    const auto word = [words](int place) {
        return static_cast<float>(static_cast<std::uint16_t>(words >> (16 * place))) / kColorParamOne;
    };
    first = word(0);
    second = word(1);
    third = word(2);
    fourth = word(3);
}

void VideoNode::GetPointParam(std::int32_t index, std::int64_t ticks, double& x, double& y) const {
    struct Point {
        double x;
        double y;
    };
    const auto point = ReadParam<Point>(index, ticks);
    x = point.x;
    y = point.y;
}

Status VideoNode::GetNextKeyframeTime(std::int32_t index, std::int64_t ticks, std::int64_t& keyframeTicks,
                                      std::int32_t& keyframe) const {
    const VantrelHostStatus status =
        VideoSegmentSuite().GetNextKeyframeTime(GetNodeID(), index, ticks, &keyframeTicks, &keyframe);
    return status < 0 ? Ostrand::kStatus_Failure : Ostrand::kStatus_OK;
}

std::int64_t VideoNode::ToNodeTime(std::int64_t ticks, bool askHost) const {
    std::int64_t time = ticks - mRecord.timeOffset;
    if (mParent) {
        const auto* clip = dynamic_cast<const VideoClipNode*>(mParent.get());
        const NodeType type = GetNodeType();
        if (clip && clip->HasFrameHold() &&
            (type == NodeType::kMedia || (type == NodeType::kEffect && clip->GetFrameHoldFilters()))) {
            return clip->GetFrameHoldAtTime();
        }
    }
    // The host maps times by clip, so a clip's media and effects are asked about under the clip's id.
    if (askHost) VideoSegmentSuite().TransformTime(mParent ? mParent->GetNodeID() : GetNodeID(), time, &time);
    return time;
}

Status VideoNode::GetTextProperty(const char* key, std::string& out) const {
    char* text = nullptr;
    if (VideoSegmentSuite().GetProperty(GetNodeID(), key, &text) != 0 || !text) return Ostrand::kStatus_Failure;
    const boost::shared_ptr<char> owner(text, [](char* owned) {
        if (const LarkspurMemoryManagerSuite* memory = FindMemoryManagerSuite()) memory->FreeText(owned);
    });
    out = text;
    return Ostrand::kStatus_OK;
}

template <class T>
Status VideoNode::ReadNumber(const char* key, T& out) const {
    std::string text;
    const Status status = GetTextProperty(key, text);
    if (Ostrand::Failed(status)) return status;
    std::istringstream stream(text);
    stream.imbue(std::locale::classic());
    T value{};
    out = stream >> value ? value : T{};
    return Ostrand::kStatus_OK;
}

Status VideoNode::GetBoolProperty(const char* key, bool& out) const {
    std::int32_t number = 0;
    const Status status = ReadNumber(key, number);
    out = number != 0;
    return status;
}

Status VideoNode::GetIntProperty(const char* key, std::int32_t& out) const { return ReadNumber(key, out); }

Status VideoNode::GetInt64Property(const char* key, std::int64_t& out) const { return ReadNumber(key, out); }

Status VideoNode::GetDoubleProperty(const char* key, double& out) const { return ReadNumber(key, out); }

Status VideoNode::GetColorProperty(const char* key, std::uint32_t& out) const {
    std::uint32_t number = 0;
    const Status status = ReadNumber(key, number);
    if (!Ostrand::Failed(status)) out = number & 0x00FFFFFFU;
    return status;
}

Status VideoNode::GetBinaryProperty(const char* key, Marl::BinaryData& out) const {
    std::string text;
    const Status status = GetTextProperty(key, text);
    return Ostrand::Failed(status) ? status : Marl::DecodeBinaryDataFromUTF8String(text, out);
}

bool VideoNode::ReadBool(const char* key) const {
    bool value = false;
    static_cast<void>(GetBoolProperty(key, value));
    return value;
}

std::int32_t VideoNode::ReadInt(const char* key, std::int32_t preset) const {
    static_cast<void>(GetIntProperty(key, preset));
    return preset;
}

std::int64_t VideoNode::ReadInt64(const char* key, std::int64_t preset) const {
    static_cast<void>(GetInt64Property(key, preset));
    return preset;
}

double VideoNode::ReadDouble(const char* key, double preset) const {
    static_cast<void>(GetDoubleProperty(key, preset));
    return preset;
}

WideString VideoNode::ReadWideText(const char* key) const {
    std::string text;
    static_cast<void>(GetTextProperty(key, text));
    return Halden::ToWide(text);
}

Marl::BinaryData VideoNode::ReadBinary(const char* key) const {
    Marl::BinaryData data;
    static_cast<void>(GetBinaryProperty(key, data));
    return data;
}

}  // namespace Vantrel
