// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tests/Support/FakeHostEntries.h"

#include <cstdlib>

#include <gtest/gtest.h>

namespace Vantrel::Testing {
namespace {

constexpr VantrelHostStatus kFails = -1;

void WriteText(const std::string& text, char* out) { std::memcpy(out, text.c_str(), text.size() + 1); }

std::string KindText(const std::string& kind) {
    if (kind == "Adjustment") return "RenderableNode_AdjustmentImpl";
    static const char* const kKinds[] = {"Clip",    "Compositor", "Transition", "Effect",  "Media",
                                         "Preview", "SolidColor", "Disabled",   "Multicam"};
    for (const char* known : kKinds) {
        if (kind == known) return "RenderableNode" + kind + "Impl";
    }
    return kind;
}

FakeRequest MakeRequest(FakeRequest::Kind kind, std::uint32_t sequenceID, std::uint32_t id, std::int32_t first,
                        std::int32_t end, std::int64_t time, std::int64_t nodeTime, std::int64_t frameTicks,
                        Vellum::Point size, Vellum::PixelAspectRatio aspect,
                        const VantrelRenderDescription* description) {
    FakeRequest request{};
    request.kind = kind;
    request.sequenceID = sequenceID;
    request.id = id;
    request.firstOperator = first;
    request.endOperator = end;
    request.time = time;
    request.nodeTime = nodeTime;
    request.frameTicks = frameTicks;
    request.sequenceSize = size;
    request.aspect = aspect;
    request.description = *description;
    request.pixelFormats.assign(description->pixelFormats, description->pixelFormats + description->pixelFormatCount);
    request.description.pixelFormats = nullptr;
    return request;
}

FakeRequest MakeClipRequest(std::uint32_t clipID, const VantrelClipRecord& record, std::int64_t time) {
    FakeRequest request{};
    request.kind = FakeRequest::Kind::kClip;
    request.id = clipID;
    request.time = time;
    request.clip = record;
    return request;
}

}  // namespace

void FakeHostEntries::FillSegmentLists(CorvaneVideoSegmentSuite& suite) {
    suite.ReleaseVideoSegments = [](std::uint32_t id) -> VantrelHostStatus {
        const Call call("ReleaseVideoSegments");
        if (!call.host.FindList(id, "ReleaseVideoSegments")) return kFails;
        call.host.mLists.erase(id);
        return 0;
    };
    suite.GetSegmentsHash = [](std::uint32_t id, char* hashText) -> VantrelHostStatus {
        const Call call("GetSegmentsHash");
        if (!call.host.FindList(id, "GetSegmentsHash")) return kFails;
        const FakeSequence& sequence = call.host.sequences[call.host.mLists[id].timelineID];
        if (sequence.hashFails) return kFails;
        WriteText(sequence.hash.ToString(), hashText);
        return 0;
    };
    suite.GetSegmentCount = [](std::uint32_t id, std::int32_t* count) -> VantrelHostStatus {
        const Call call("GetSegmentCount");
        const auto* list = call.host.FindList(id, "GetSegmentCount");
        if (!list) return kFails;
        *count = static_cast<std::int32_t>(list->size());
        return 0;
    };
    suite.GetSegmentInfo = [](std::uint32_t id, std::int32_t index, std::int64_t* start, std::int64_t* end,
                              std::int64_t* offset, char* hashText) -> VantrelHostStatus {
        const Call call("GetSegmentInfo");
        const auto* list = call.host.FindList(id, "GetSegmentInfo");
        if (!list || index < 0 || static_cast<std::size_t>(index) >= list->size()) return kFails;
        const FakeSegment& segment = (*list)[static_cast<std::size_t>(index)];
        *start = segment.start;
        *end = segment.end;
        *offset = segment.offset;
        WriteText(segment.hash.ToString(), hashText);
        return 0;
    };
    suite.AcquireSegmentNode = [](std::uint32_t id, const char* hashText, std::uint32_t* node) -> VantrelHostStatus {
        const Call call("AcquireSegmentNode");
        const auto* list = call.host.FindList(id, "AcquireSegmentNode");
        if (!list) return kFails;
        for (const FakeSegment& segment : *list) {
            if (segment.hash != Guid(std::string(hashText))) continue;
            *node = call.host.Acquire(segment.node, "AcquireSegmentNode");
            return 0;
        }
        return kFails;
    };
    suite.GetSequenceInfo = [](std::uint32_t timelineID, std::int32_t* left, std::int32_t* top, std::int32_t* right,
                               std::int32_t* bottom, std::int32_t* numerator, std::int32_t* denominator,
                               std::int64_t* ticksPerFrame, std::uint32_t* fieldType) -> VantrelHostStatus {
        const Call call("GetSequenceInfo");
        const auto found = call.host.sequences.find(timelineID);
        if (found == call.host.sequences.end() || found->second.infoFails) return kFails;
        const FakeSequence& sequence = found->second;
        *left = sequence.rect.left;
        *top = sequence.rect.top;
        *right = sequence.rect.right;
        *bottom = sequence.rect.bottom;
        *numerator = sequence.aspect.numerator;
        *denominator = sequence.aspect.denominator;
        *ticksPerFrame = sequence.ticksPerFrame;
        *fieldType = sequence.fieldType;
        return 0;
    };
    suite.AcquireVideoSegments = [](std::uint32_t timelineID, const char*, std::uint32_t* id) -> VantrelHostStatus {
        const Call call("AcquireVideoSegments");
        return call.host.OpenSegments(timelineID, false, id);
    };
    suite.AcquireVideoSegmentsWithPreviews = [](std::uint32_t timelineID, const char*,
                                                std::uint32_t* id) -> VantrelHostStatus {
        const Call call("AcquireVideoSegmentsWithPreviews");
        return call.host.OpenSegments(timelineID, true, id);
    };
    suite.AcquireNestedVideoSegmentsWithPreviews = [](std::uint32_t timelineID, const char*,
                                                      std::uint32_t* id) -> VantrelHostStatus {
        const Call call("AcquireNestedVideoSegmentsWithPreviews");
        return call.host.OpenSegments(timelineID, true, id);
    };
}

void FakeHostEntries::FillNodes(CorvaneVideoSegmentSuite& suite) {
    suite.ReleaseNode = [](std::uint32_t id) -> VantrelHostStatus {
        const Call call("ReleaseNode");
        int& references = call.host.mReferences[id];
        if (references <= 0) {
            ADD_FAILURE() << "node " << id << " is released more often than acquired";
            return kFails;
        }
        --references;
        return 0;
    };
    suite.GetNodeInfo = [](std::uint32_t id, char* kind, char* hash, std::uint32_t* flags) -> VantrelHostStatus {
        const Call call("GetNodeInfo");
        const FakeNode* node = call.host.FindNode(id, "GetNodeInfo");
        if (!node || node->infoFails) return kFails;
        WriteText(KindText(node->kind), kind);
        WriteText(node->hash.ToString(), hash);
        *flags = node->flags;
        return 0;
    };
    suite.GetInputCount = [](std::uint32_t id, std::int32_t* count) -> VantrelHostStatus {
        const Call call("GetInputCount");
        const FakeNode* node = call.host.FindNode(id, "GetInputCount");
        if (!node) return kFails;
        *count = static_cast<std::int32_t>(node->inputs.size());
        return 0;
    };
    suite.AcquireInputNode = [](std::uint32_t id, std::int32_t index, std::int64_t* offset,
                                std::uint32_t* input) -> VantrelHostStatus {
        const Call call("AcquireInputNode");
        const FakeNode* node = call.host.FindNode(id, "AcquireInputNode");
        if (!node || index < 0 || static_cast<std::size_t>(index) >= node->inputs.size()) return kFails;
        const FakeNode::Input& scripted = node->inputs[static_cast<std::size_t>(index)];
        *offset = scripted.offset;
        *input = scripted.node == 0 ? 0 : call.host.Acquire(scripted.node, "AcquireInputNode");
        return 0;
    };
    suite.GetOperatorCount = [](std::uint32_t id, std::int32_t* count) -> VantrelHostStatus {
        const Call call("GetOperatorCount");
        const FakeNode* node = call.host.FindNode(id, "GetOperatorCount");
        if (!node) return kFails;
        *count = static_cast<std::int32_t>(node->operators.size());
        return 0;
    };
    suite.AcquireOperatorNode = [](std::uint32_t id, std::int32_t index, std::uint32_t* out) -> VantrelHostStatus {
        const Call call("AcquireOperatorNode");
        const FakeNode* node = call.host.FindNode(id, "AcquireOperatorNode");
        if (!node || index < 0 || static_cast<std::size_t>(index) >= node->operators.size()) return kFails;
        *out = call.host.Acquire(node->operators[static_cast<std::size_t>(index)], "AcquireOperatorNode");
        return 0;
    };
    suite.GetProperty = [](std::uint32_t id, const char* key, char** text) -> VantrelHostStatus {
        const Call call("GetProperty");
        const FakeNode* node = call.host.FindNode(id, "GetProperty");
        if (!node) return kFails;
        const auto found = node->properties.find(key);
        if (found == node->properties.end()) return kFails;
        *text = ::strdup(found->second.c_str());
        ++call.host.mLiveTexts;
        return 0;
    };
    suite.GetParam = [](std::uint32_t id, std::int32_t index, std::int64_t ticks,
                        VantrelParamRecord* record) -> VantrelHostStatus {
        const Call call("GetParam");
        return call.host.ReadParam(id, index, ticks, record);
    };
    suite.GetNextKeyframeTime = [](std::uint32_t id, std::int32_t index, std::int64_t ticks, std::int64_t* next,
                                   std::int32_t* keyframe) -> VantrelHostStatus {
        const Call call("GetNextKeyframeTime");
        *keyframe = 0;
        return call.host.FindKeyframe(id, index, ticks, next);
    };
    suite.TransformTime = [](std::uint32_t id, std::int64_t ticks, std::int64_t* transformed) -> VantrelHostStatus {
        const Call call("TransformTime");
        const FakeNode* node = call.host.FindNode(id, "TransformTime");
        if (!node) return kFails;
        if (node->transformTime) *transformed = node->transformTime(ticks);
        return 0;
    };
}

void FakeHostEntries::FillRenders(CorvaneVideoSegmentRenderSuite& suite) {
    using Kind = FakeRequest::Kind;
    suite.RenderNode = [](std::uint32_t sequence, std::uint32_t node, std::int64_t time, std::int64_t nodeTime,
                          std::int64_t frameTicks, std::int32_t width, std::int32_t height, std::int32_t numerator,
                          std::int32_t denominator, const VantrelRenderDescription* description,
                          VantrelRenderCallback callback, void* context,
                          std::uint32_t* requestID) -> VantrelHostStatus {
        Call call("RenderNode");
        call.host.FindNode(node, "RenderNode");
        const FakeRequest request = MakeRequest(Kind::kNode, sequence, node, 0, 0, time, nodeTime, frameTicks,
                                                {width, height}, {numerator, denominator}, description);
        call.lock.unlock();
        return call.host.Render(request, callback, context, requestID);
    };
    suite.GetNodeFrameHash = [](std::uint32_t sequence, std::uint32_t node, std::int64_t time, std::int64_t nodeTime,
                                std::int64_t frameTicks, std::int32_t width, std::int32_t height,
                                std::int32_t numerator, std::int32_t denominator,
                                const VantrelRenderDescription* description, char* text) -> VantrelHostStatus {
        const Call call("GetNodeFrameHash");
        const FakeNode* scripted = call.host.FindNode(node, "GetNodeFrameHash");
        if (!scripted) return kFails;
        return call.host.AnswerHash(MakeRequest(Kind::kNode, sequence, node, 0, 0, time, nodeTime, frameTicks,
                                                {width, height}, {numerator, denominator}, description),
                                    scripted->frameHashText, scripted->frameHashStatus, text);
    };
    suite.RenderOperators = [](std::uint32_t sequence, std::uint32_t clip, std::int32_t first, std::int32_t end,
                               std::int64_t time, std::int64_t rawTime, std::int64_t frameTicks, std::int32_t width,
                               std::int32_t height, std::int32_t numerator, std::int32_t denominator, std::uint32_t,
                               const VantrelRenderDescription* description, VantrelRenderCallback callback,
                               void* context, std::uint32_t* requestID) -> VantrelHostStatus {
        Call call("RenderOperators");
        call.host.FindNode(clip, "RenderOperators");
        const FakeRequest request = MakeRequest(Kind::kOperators, sequence, clip, first, end, time, rawTime, frameTicks,
                                                {width, height}, {numerator, denominator}, description);
        call.lock.unlock();
        return call.host.Render(request, callback, context, requestID);
    };
    suite.GetOperatorsFrameHash = [](std::uint32_t sequence, std::uint32_t clip, std::int32_t first, std::int32_t end,
                                     std::int64_t time, std::int64_t rawTime, std::int64_t frameTicks,
                                     std::int32_t width, std::int32_t height, std::int32_t numerator,
                                     std::int32_t denominator, std::uint32_t,
                                     const VantrelRenderDescription* description, char* text) -> VantrelHostStatus {
        const Call call("GetOperatorsFrameHash");
        const FakeNode* scripted = call.host.FindNode(clip, "GetOperatorsFrameHash");
        if (!scripted) return kFails;
        return call.host.AnswerHash(MakeRequest(Kind::kOperators, sequence, clip, first, end, time, rawTime, frameTicks,
                                                {width, height}, {numerator, denominator}, description),
                                    scripted->frameHashText, scripted->frameHashStatus, text);
    };
    suite.CancelRequest = [](std::uint32_t requestID) -> VantrelHostStatus {
        const Call call("CancelRequest");
        return call.host.Cancel(requestID);
    };
}

void FakeHostEntries::FillClips(CorvaneVideoSegmentRenderSuite& suite) {
    suite.GetClipFormat = [](std::uint32_t clipID, std::int64_t, const VantrelClipRecord* wanted,
                             VantrelClipRecord* delivered) -> VantrelHostStatus {
        const Call call("GetClipFormat");
        const auto found = call.host.clips.find(clipID);
        if (found == call.host.clips.end()) return kFails;
        *delivered = found->second.deliver ? found->second.deliver(*wanted) : *wanted;
        return 0;
    };
    suite.RenderClip = [](std::uint32_t clipID, const VantrelClipRecord* record, std::int64_t time,
                          VantrelRenderCallback callback, void* context,
                          std::uint32_t* requestID) -> VantrelHostStatus {
        Call call("RenderClip");
        if (call.host.clips.count(clipID) == 0) return kFails;
        call.lock.unlock();
        return call.host.Render(MakeClipRequest(clipID, *record, time), callback, context, requestID);
    };
    suite.GetClipFrameHash = [](std::uint32_t clipID, const VantrelClipRecord* record, std::int64_t time,
                                char* text) -> VantrelHostStatus {
        const Call call("GetClipFrameHash");
        const auto found = call.host.clips.find(clipID);
        if (found == call.host.clips.end()) return kFails;
        return call.host.AnswerHash(MakeClipRequest(clipID, *record, time), found->second.frameHashText,
                                    found->second.frameHashStatus, text);
    };
    suite.IsClipReady = [](std::uint32_t clipID, std::uint8_t* ready) -> VantrelHostStatus {
        const Call call("IsClipReady");
        const auto found = call.host.clips.find(clipID);
        if (found == call.host.clips.end()) return kFails;
        *ready = found->second.ready;
        return 0;
    };
}

void FakeHostEntries::FillSmallSuites(LarkspurMemoryManagerSuite& memory, LarkspurGlazeSuite& glaze,
                                      LarkspurGlazeCacheSuite& cache, OpaqueEffectDataSuite& opaque) {
    memory.FreeText = [](char* text) {
        const Call call("FreeText");
        if (--call.host.mLiveTexts < 0) ADD_FAILURE() << "more texts are freed than were given out";
        std::free(text);
    };
    glaze.Dispose = [](Glaze* frame) -> VantrelHostStatus {
        const Call call("Dispose");
        if (DisposeFakeGlaze(frame)) return 0;
        ADD_FAILURE() << "a picture is disposed of twice";
        return kFails;
    };
    cache.Find = [](const char* hashText, Glaze** frame) -> VantrelHostStatus {
        const Call call("Find");
        const auto found = call.host.glazeCache.find(hashText);
        if (found == call.host.glazeCache.end()) return kFails;
        *frame = NewFakeGlaze(found->second);
        return 0;
    };
    opaque.Acquire = [](std::int32_t instance, void** data) -> VantrelHostStatus {
        const Call call("Acquire");
        const auto found = call.host.opaqueData.find(instance);
        if (found == call.host.opaqueData.end()) return kFails;
        ++call.host.mAcquiredOpaqueData[instance];
        *data = found->second;
        return 0;
    };
    opaque.Release = [](std::int32_t instance, std::uint8_t* disposed) -> VantrelHostStatus {
        const Call call("Release");
        if (--call.host.mAcquiredOpaqueData[instance] < 0) {
            ADD_FAILURE() << "opaque data of instance " << instance << " is released more often than acquired";
        }
        if (disposed) *disposed = 0;
        return 0;
    };
}

}  // namespace Vantrel::Testing
