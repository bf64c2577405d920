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
    suite.ReleaseVideoSegments = [](auto id) {
        const Call call("ReleaseVideoSegments");
        if (!call.host.FindList(id, "ReleaseVideoSegments")) return kFails;
        call.host.mLists.erase(id);
        return 0;
    };
    suite.GetSegmentsHash = [](auto id, auto* hashText) {
        const Call call("GetSegmentsHash");
        if (!call.host.FindList(id, "GetSegmentsHash")) return kFails;
        const FakeSequence& sequence = call.host.sequences[call.host.mLists[id].timelineID];
        if (sequence.hashFails) return kFails;
        WriteText(sequence.hash.ToString(), hashText);
        return 0;
    };
    suite.GetSegmentCount = [](auto id, auto* count) {
        const Call call("GetSegmentCount");
        const auto* list = call.host.FindList(id, "GetSegmentCount");
        if (!list) return kFails;
        *count = static_cast<std::int32_t>(list->size());
        return 0;
    };
    suite.GetSegmentInfo = [](auto id, auto index, auto* start, auto* end, auto* offset, auto* hashText) {
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
    suite.AcquireSegmentNode = [](auto id, auto* hashText, auto* node) {
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
    suite.GetSequenceInfo = [](auto timelineID, auto* left, auto* top, auto* right, auto* bottom, auto* numerator,
                               auto* denominator, auto* ticksPerFrame, auto* fieldType) {
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
    suite.AcquireVideoSegments = [](auto timelineID, auto*, auto* id) {
        const Call call("AcquireVideoSegments");
        return call.host.OpenSegments(timelineID, false, id);
    };
    suite.AcquireVideoSegmentsWithPreviews = [](auto timelineID, auto*, auto* id) {
        const Call call("AcquireVideoSegmentsWithPreviews");
        return call.host.OpenSegments(timelineID, true, id);
    };
    suite.AcquireNestedVideoSegmentsWithPreviews = [](auto timelineID, auto*, auto* id) {
        const Call call("AcquireNestedVideoSegmentsWithPreviews");
        return call.host.OpenSegments(timelineID, true, id);
    };
}

void FakeHostEntries::FillNodes(CorvaneVideoSegmentSuite& suite) {
    suite.ReleaseNode = [](auto id) {
        const Call call("ReleaseNode");
        int& references = call.host.mReferences[id];
        if (references <= 0) {
            ADD_FAILURE() << "node " << id << " is released more often than acquired";
            return kFails;
        }
        --references;
        return 0;
    };
    suite.GetNodeInfo = [](auto id, auto* kind, auto* hash, auto* flags) {
        const Call call("GetNodeInfo");
        const FakeNode* node = call.host.FindNode(id, "GetNodeInfo");
        if (!node || node->infoFails) return kFails;
        WriteText(KindText(node->kind), kind);
        WriteText(node->hash.ToString(), hash);
        *flags = node->flags;
        return 0;
    };
    suite.GetInputCount = [](auto id, auto* count) {
        const Call call("GetInputCount");
        const FakeNode* node = call.host.FindNode(id, "GetInputCount");
        if (!node) return kFails;
        *count = static_cast<std::int32_t>(node->inputs.size());
        return 0;
    };
    suite.AcquireInputNode = [](auto id, auto index, auto* offset, auto* input) {
        const Call call("AcquireInputNode");
        const FakeNode* node = call.host.FindNode(id, "AcquireInputNode");
        if (!node || index < 0 || static_cast<std::size_t>(index) >= node->inputs.size()) return kFails;
        const FakeNode::Input& scripted = node->inputs[static_cast<std::size_t>(index)];
        *offset = scripted.offset;
        *input = scripted.node == 0 ? 0 : call.host.Acquire(scripted.node, "AcquireInputNode");
        return 0;
    };
    suite.GetOperatorCount = [](auto id, auto* count) {
        const Call call("GetOperatorCount");
        const FakeNode* node = call.host.FindNode(id, "GetOperatorCount");
        if (!node) return kFails;
        *count = static_cast<std::int32_t>(node->operators.size());
        return 0;
    };
    suite.AcquireOperatorNode = [](auto id, auto index, auto* out) {
        const Call call("AcquireOperatorNode");
        const FakeNode* node = call.host.FindNode(id, "AcquireOperatorNode");
        if (!node || index < 0 || static_cast<std::size_t>(index) >= node->operators.size()) return kFails;
        *out = call.host.Acquire(node->operators[static_cast<std::size_t>(index)], "AcquireOperatorNode");
        return 0;
    };
    suite.GetProperty = [](auto id, auto* key, auto* text) {
        const Call call("GetProperty");
        const FakeNode* node = call.host.FindNode(id, "GetProperty");
        if (!node) return kFails;
        const auto found = node->properties.find(key);
        if (found == node->properties.end()) return kFails;
        *text = ::strdup(found->second.c_str());
        ++call.host.mLiveTexts;
        return 0;
    };
    suite.GetParam = [](auto id, auto index, auto ticks, auto* record) {
        const Call call("GetParam");
        return call.host.ReadParam(id, index, ticks, record);
    };
    suite.GetNextKeyframeTime = [](auto id, auto index, auto ticks, auto* next, auto* keyframe) {
        const Call call("GetNextKeyframeTime");
        *keyframe = 0;
        return call.host.FindKeyframe(id, index, ticks, next);
    };
    suite.TransformTime = [](auto id, auto ticks, auto* transformed) {
        const Call call("TransformTime");
        const FakeNode* node = call.host.FindNode(id, "TransformTime");
        if (!node) return kFails;
        if (node->transformTime) *transformed = node->transformTime(ticks);
        return 0;
    };
}

void FakeHostEntries::FillRenders(CorvaneVideoSegmentRenderSuite& suite) {
    using Kind = FakeRequest::Kind;
    suite.RenderNode = [](auto sequence, auto node, auto time, auto nodeTime, auto frameTicks, auto width, auto height,
                          auto numerator, auto denominator, auto* description, auto callback, auto* context,
                          auto* requestID) {
        Call call("RenderNode");
        call.host.FindNode(node, "RenderNode");
        const FakeRequest request = MakeRequest(Kind::kNode, sequence, node, 0, 0, time, nodeTime, frameTicks,
                                                {width, height}, {numerator, denominator}, description);
        call.lock.unlock();
        return call.host.Render(request, callback, context, requestID);
    };
    suite.GetNodeFrameHash = [](auto sequence, auto node, auto time, auto nodeTime, auto frameTicks, auto width,
                                auto height, auto numerator, auto denominator, auto* description, auto* text) {
        const Call call("GetNodeFrameHash");
        const FakeNode* scripted = call.host.FindNode(node, "GetNodeFrameHash");
        if (!scripted) return kFails;
        return call.host.AnswerHash(MakeRequest(Kind::kNode, sequence, node, 0, 0, time, nodeTime, frameTicks,
                                                {width, height}, {numerator, denominator}, description),
                                    scripted->frameHashText, scripted->frameHashStatus, text);
    };
    suite.RenderOperators = [](auto sequence, auto clip, auto first, auto end, auto time, auto rawTime, auto frameTicks,
                               auto width, auto height, auto numerator, auto denominator, auto, auto* description,
                               auto callback, auto* context, auto* requestID) {
        Call call("RenderOperators");
        call.host.FindNode(clip, "RenderOperators");
        const FakeRequest request = MakeRequest(Kind::kOperators, sequence, clip, first, end, time, rawTime, frameTicks,
                                                {width, height}, {numerator, denominator}, description);
        call.lock.unlock();
        return call.host.Render(request, callback, context, requestID);
    };
    suite.GetOperatorsFrameHash = [](auto sequence, auto clip, auto first, auto end, auto time, auto rawTime,
                                     auto frameTicks, auto width, auto height, auto numerator, auto denominator, auto,
                                     auto* description, auto* text) {
        const Call call("GetOperatorsFrameHash");
        const FakeNode* scripted = call.host.FindNode(clip, "GetOperatorsFrameHash");
        if (!scripted) return kFails;
        return call.host.AnswerHash(MakeRequest(Kind::kOperators, sequence, clip, first, end, time, rawTime, frameTicks,
                                                {width, height}, {numerator, denominator}, description),
                                    scripted->frameHashText, scripted->frameHashStatus, text);
    };
    suite.CancelRequest = [](auto requestID) {
        const Call call("CancelRequest");
        return call.host.Cancel(requestID);
    };
}

void FakeHostEntries::FillClips(CorvaneVideoSegmentRenderSuite& suite) {
    suite.GetClipFormat = [](auto clipID, auto, auto* wanted, auto* delivered) {
        const Call call("GetClipFormat");
        const auto found = call.host.clips.find(clipID);
        if (found == call.host.clips.end()) return kFails;
        *delivered = found->second.deliver ? found->second.deliver(*wanted) : *wanted;
        return 0;
    };
    suite.RenderClip = [](auto clipID, auto* record, auto time, auto callback, auto* context, auto* requestID) {
        Call call("RenderClip");
        if (call.host.clips.count(clipID) == 0) return kFails;
        call.lock.unlock();
        return call.host.Render(MakeClipRequest(clipID, *record, time), callback, context, requestID);
    };
    suite.GetClipFrameHash = [](auto clipID, auto* record, auto time, auto* text) {
        const Call call("GetClipFrameHash");
        const auto found = call.host.clips.find(clipID);
        if (found == call.host.clips.end()) return kFails;
        return call.host.AnswerHash(MakeClipRequest(clipID, *record, time), found->second.frameHashText,
                                    found->second.frameHashStatus, text);
    };
    suite.IsClipReady = [](auto clipID, auto* ready) {
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
    glaze.Dispose = [](auto* frame) {
        const Call call("Dispose");
        if (DisposeFakeGlaze(frame)) return 0;
        ADD_FAILURE() << "a picture is disposed of twice";
        return kFails;
    };
    cache.Find = [](auto* hashText, auto* frame) {
        const Call call("Find");
        const auto found = call.host.glazeCache.find(hashText);
        if (found == call.host.glazeCache.end()) return kFails;
        *frame = NewFakeGlaze(found->second);
        return 0;
    };
    opaque.Acquire = [](auto instance, auto* data) {
        const Call call("Acquire");
        const auto found = call.host.opaqueData.find(instance);
        if (found == call.host.opaqueData.end()) return kFails;
        ++call.host.mAcquiredOpaqueData[instance];
        *data = found->second;
        return 0;
    };
    opaque.Release = [](auto instance, auto* disposed) {
        const Call call("Release");
        if (--call.host.mAcquiredOpaqueData[instance] < 0) {
            ADD_FAILURE() << "opaque data of instance " << instance << " is released more often than acquired";
        }
        if (disposed) *disposed = 0;
        return 0;
    };
}

}  // namespace Vantrel::Testing
