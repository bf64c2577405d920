// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

/// The host's services: six versioned tables of plain functions, reached through a QuillBasicSuite. An entry's place in
/// its table is its number; places that the engine doesn't use are named `reservedN` and may hold anything, also null.
/// A status of 0 is success; functions may be called from several threads at once, also while a frame renders, and must
/// not call back into the engine. Times are 64-bit ticks, texts end with a zero byte, hash texts are Guid texts of 36
/// characters in buffers of at least 37 bytes.
extern "C" {

struct Glaze;

using VantrelHostStatus = std::int32_t;

struct QuillBasicSuite {
    VantrelHostStatus (*AcquireSuite)(const char* name, std::int32_t version, const void** suite);
    VantrelHostStatus (*ReleaseSuite)(const char* name, std::int32_t version);
};

/// The record in which a parameter's value comes back. Packed: the value begins at byte 4, whatever its type.
struct VantrelParamRecord {
    unsigned char bytes[32];
};

/// "Corvane Video Segment Suite", version 5: what a sequence is made of.
struct CorvaneVideoSegmentSuite {
    void* reserved0;
    void* reserved1;
    void* reserved2;
    VantrelHostStatus (*ReleaseVideoSegments)(std::uint32_t segmentsID);
    VantrelHostStatus (*GetSegmentsHash)(std::uint32_t segmentsID, char* hashText);
    VantrelHostStatus (*GetSegmentCount)(std::uint32_t segmentsID, std::int32_t* count);
    VantrelHostStatus (*GetSegmentInfo)(std::uint32_t segmentsID, std::int32_t index, std::int64_t* start,
                                        std::int64_t* end, std::int64_t* offset, char* hashText);
    VantrelHostStatus (*AcquireSegmentNode)(std::uint32_t segmentsID, const char* hashText, std::uint32_t* nodeID);
    VantrelHostStatus (*ReleaseNode)(std::uint32_t nodeID);
    /// `kindText` has room for 272 bytes, `hashText` for 40. Bit 3 of the flags marks a still.
    VantrelHostStatus (*GetNodeInfo)(std::uint32_t nodeID, char* kindText, char* hashText, std::uint32_t* flags);
    VantrelHostStatus (*GetInputCount)(std::uint32_t nodeID, std::int32_t* count);
    VantrelHostStatus (*AcquireInputNode)(std::uint32_t nodeID, std::int32_t index, std::int64_t* offset,
                                          std::uint32_t* inputID);
    VantrelHostStatus (*GetOperatorCount)(std::uint32_t nodeID, std::int32_t* count);
    VantrelHostStatus (*AcquireOperatorNode)(std::uint32_t nodeID, std::int32_t index, std::uint32_t* operatorID);
    void* reserved14;
    /// The text belongs to the host's allocator and is freed with entry 11 of the memory suite.
    VantrelHostStatus (*GetProperty)(std::uint32_t nodeID, const char* key, char** text);
    void* reserved16;
    VantrelHostStatus (*GetParam)(std::uint32_t nodeID, std::int32_t index, std::int64_t ticks,
                                  VantrelParamRecord* record);
    /// The first keyframe strictly later than `ticks`; a negative status when there is none.
    VantrelHostStatus (*GetNextKeyframeTime)(std::uint32_t nodeID, std::int32_t index, std::int64_t ticks,
                                             std::int64_t* keyframeTicks, std::int32_t* keyframe);
    VantrelHostStatus (*TransformTime)(std::uint32_t nodeID, std::int64_t ticks, std::int64_t* transformed);
    VantrelHostStatus (*GetSequenceInfo)(std::uint32_t timelineID, std::int32_t* left, std::int32_t* top,
                                         std::int32_t* right, std::int32_t* bottom, std::int32_t* aspectNumerator,
                                         std::int32_t* aspectDenominator, std::int64_t* ticksPerFrame,
                                         std::uint32_t* fieldType);
    void* reserved21;
    /// The plain list, the list with previews of a top sequence, and of a nested one.
    VantrelHostStatus (*AcquireVideoSegments)(std::uint32_t timelineID, const char* previewSpec,
                                              std::uint32_t* segmentsID);
    VantrelHostStatus (*AcquireVideoSegmentsWithPreviews)(std::uint32_t timelineID, const char* previewSpec,
                                                          std::uint32_t* segmentsID);
    VantrelHostStatus (*AcquireNestedVideoSegmentsWithPreviews)(std::uint32_t timelineID, const char* previewSpec,
                                                                std::uint32_t* segmentsID);
};

/// What a host render shall produce. `pixelFormats` lists four-character codes in order of preference; a count of 2
/// whose second entry is 0 means the first one only.
struct VantrelRenderDescription {
    const std::uint32_t* pixelFormats;
    std::int32_t pixelFormatCount;
    std::int32_t width;
    std::int32_t height;
    std::int32_t aspectNumerator;
    std::int32_t aspectDenominator;
    std::uint32_t quality;
    std::uint32_t fieldType;
    std::uint32_t deinterlace;
    std::uint32_t deinterlaceQuality;
    std::uint32_t compositeOnBlack;
};

struct VantrelClipRecord {
    std::uint32_t pixelFormat;
    std::int32_t width;
    std::int32_t height;
    std::int32_t aspectNumerator;
    std::int32_t aspectDenominator;
    std::uint32_t fieldType;
    std::uint32_t quality;
};

/// Called exactly once for each accepted request, from any thread, perhaps before the request has returned. `frame` may
/// be null; with a status that isn't 0 the request delivered nothing.
using VantrelRenderCallback = void (*)(struct Glaze* frame, void* context, std::int32_t status);

/// "Corvane Video Segment Render Suite", version 3: the host's software renderer.
struct CorvaneVideoSegmentRenderSuite {
    /// Renders the picture of a node.
    VantrelHostStatus (*RenderNode)(std::uint32_t sequenceID, std::uint32_t nodeID, std::int64_t time,
                                    std::int64_t nodeTime, std::int64_t frameTicks, std::int32_t sequenceWidth,
                                    std::int32_t sequenceHeight, std::int32_t aspectNumerator,
                                    std::int32_t aspectDenominator, const VantrelRenderDescription* description,
                                    VantrelRenderCallback callback, void* context, std::uint32_t* requestID);
    VantrelHostStatus (*GetNodeFrameHash)(std::uint32_t sequenceID, std::uint32_t nodeID, std::int64_t time,
                                          std::int64_t nodeTime, std::int64_t frameTicks, std::int32_t sequenceWidth,
                                          std::int32_t sequenceHeight, std::int32_t aspectNumerator,
                                          std::int32_t aspectDenominator, const VantrelRenderDescription* description,
                                          char* hashText);
    /// Renders a clip with its operators from `firstOperator` up to but not including `endOperator`.
    VantrelHostStatus (*RenderOperators)(std::uint32_t sequenceID, std::uint32_t clipNodeID, std::int32_t firstOperator,
                                         std::int32_t endOperator, std::int64_t time, std::int64_t rawTime,
                                         std::int64_t frameTicks, std::int32_t sequenceWidth,
                                         std::int32_t sequenceHeight, std::int32_t aspectNumerator,
                                         std::int32_t aspectDenominator, std::uint32_t reserved,
                                         const VantrelRenderDescription* description, VantrelRenderCallback callback,
                                         void* context, std::uint32_t* requestID);
    VantrelHostStatus (*GetOperatorsFrameHash)(std::uint32_t sequenceID, std::uint32_t clipNodeID,
                                               std::int32_t firstOperator, std::int32_t endOperator, std::int64_t time,
                                               std::int64_t rawTime, std::int64_t frameTicks,
                                               std::int32_t sequenceWidth, std::int32_t sequenceHeight,
                                               std::int32_t aspectNumerator, std::int32_t aspectDenominator,
                                               std::uint32_t reserved, const VantrelRenderDescription* description,
                                               char* hashText);
    void* reserved4;
    void* reserved5;
    /// What a clip can really deliver, given what is wanted.
    VantrelHostStatus (*GetClipFormat)(std::uint32_t clipID, std::int64_t time, const VantrelClipRecord* wanted,
                                       VantrelClipRecord* delivered);
    VantrelHostStatus (*RenderClip)(std::uint32_t clipID, const VantrelClipRecord* record, std::int64_t time,
                                    VantrelRenderCallback callback, void* context, std::uint32_t* requestID);
    VantrelHostStatus (*GetClipFrameHash)(std::uint32_t clipID, const VantrelClipRecord* record, std::int64_t time,
                                          char* hashText);
    VantrelHostStatus (*CancelRequest)(std::uint32_t requestID);
    VantrelHostStatus (*IsClipReady)(std::uint32_t clipID, std::uint8_t* ready);
};

/// "Larkspur Memory Manager Suite", version 4.
struct LarkspurMemoryManagerSuite {
    void* reserved[11];
    void (*FreeText)(char* text);
};

/// "Larkspur Glaze Suite", version 1.
struct LarkspurGlazeSuite {
    VantrelHostStatus (*Dispose)(struct Glaze* frame);
};

/// "Larkspur Glaze Cache Suite", version 5.
struct LarkspurGlazeCacheSuite {
    void* reserved[5];
    /// A finished picture by the text of its fingerprint. Status 0 and a non-null frame is a hit; the frame is then
    /// disposed of by the caller.
    VantrelHostStatus (*Find)(const char* hashText, struct Glaze** frame);
};

/// "Opaque Effect Data Suite", version 1.
struct OpaqueEffectDataSuite {
    VantrelHostStatus (*Acquire)(std::int32_t instanceID, void** data);
    void* reserved1;
    VantrelHostStatus (*Release)(std::int32_t instanceID, std::uint8_t* disposed);
};

}  // extern "C"

namespace Vantrel {

constexpr const char* kVideoSegmentSuiteName = "Corvane Video Segment Suite";
constexpr const char* kVideoSegmentRenderSuiteName = "Corvane Video Segment Render Suite";
constexpr const char* kMemoryManagerSuiteName = "Larkspur Memory Manager Suite";
constexpr const char* kGlazeSuiteName = "Larkspur Glaze Suite";
constexpr const char* kGlazeCacheSuiteName = "Larkspur Glaze Cache Suite";
constexpr const char* kOpaqueEffectDataSuiteName = "Opaque Effect Data Suite";

constexpr std::int32_t kVideoSegmentSuiteVersion = 5;
constexpr std::int32_t kVideoSegmentRenderSuiteVersion = 3;
constexpr std::int32_t kMemoryManagerSuiteVersion = 4;
constexpr std::int32_t kGlazeSuiteVersion = 1;
constexpr std::int32_t kGlazeCacheSuiteVersion = 5;
constexpr std::int32_t kOpaqueEffectDataSuiteVersion = 1;

/// What an entry answers that a host doesn't offer.
constexpr VantrelHostStatus kHostStatus_NotImplemented = static_cast<VantrelHostStatus>(0x80004001);

/// Bit 3 of a node's flags.
constexpr std::uint32_t kNodeFlag_Still = 1U << 3;

}  // namespace Vantrel
