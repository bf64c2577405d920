// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Suites/DescriptionSuites.h"

#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <cstring>
#include <memory>

#include "Host/Suites/HandleTables.h"
#include "Host/Suites/HostServices.h"

namespace Vantrel::Host {
namespace {

constexpr VantrelHostStatus kOk = 0;
constexpr VantrelHostStatus kFailed = static_cast<VantrelHostStatus>(0x80004005);

std::atomic<std::int64_t> theTextCount{0};

HostServices& Services() { return HostServices::Instance(); }

VantrelHostStatus Unserved() { return kHostStatus_NotImplemented; }

void PutGuid(const Guid& guid, char* text) {
    const std::string digits = guid.ToString();
    std::memcpy(text, digits.c_str(), digits.size() + 1);
}

VantrelHostStatus AcquireList(std::uint32_t timelineID, bool previews, std::uint32_t* segmentsID) {
    const SnapshotPtr snapshot = Services().GetSnapshot();
    const SequencePtr sequence = snapshot ? snapshot->Find(timelineID) : nullptr;
    if (!sequence) return kFailed;
    *segmentsID = Services().GetSegmentLists().Acquire(sequence, previews);
    return kOk;
}

VantrelHostStatus AcquirePlain(std::uint32_t timelineID, const char*, std::uint32_t* segmentsID) {
    return AcquireList(timelineID, false, segmentsID);
}

VantrelHostStatus AcquireWithPreviews(std::uint32_t timelineID, const char*, std::uint32_t* segmentsID) {
    return AcquireList(timelineID, true, segmentsID);
}

VantrelHostStatus ReleaseVideoSegments(std::uint32_t segmentsID) {
    return Services().GetSegmentLists().Release(segmentsID) ? kOk : kFailed;
}

VantrelHostStatus GetSegmentsHash(std::uint32_t segmentsID, char* hashText) {
    const auto held = Services().GetSegmentLists().Find(segmentsID);
    if (!held) return kFailed;
    PutGuid(held->list->hash, hashText);
    return kOk;
}

VantrelHostStatus GetSegmentCount(std::uint32_t segmentsID, std::int32_t* count) {
    const auto held = Services().GetSegmentLists().Find(segmentsID);
    if (!held) return kFailed;
    *count = static_cast<std::int32_t>(held->list->segments.size());
    return kOk;
}

VantrelHostStatus GetSegmentInfo(std::uint32_t segmentsID, std::int32_t index, std::int64_t* start, std::int64_t* end,
                                 std::int64_t* offset, char* hashText) {
    const auto held = Services().GetSegmentLists().Find(segmentsID);
    if (!held || index < 0 || static_cast<std::size_t>(index) >= held->list->segments.size()) return kFailed;
    const Segment& segment = held->list->segments[static_cast<std::size_t>(index)];
    *start = segment.start;
    *end = segment.end;
    *offset = segment.offset;
    PutGuid(segment.root->hash, hashText);
    return kOk;
}

VantrelHostStatus AcquireSegmentNode(std::uint32_t segmentsID, const char* hashText, std::uint32_t* nodeID) {
    const auto held = Services().GetSegmentLists().Find(segmentsID);
    if (!held) return kFailed;
    const auto root = held->list->roots.find(Guid(std::string(hashText)));
    if (root == held->list->roots.end()) return kFailed;
    *nodeID = Services().GetNodes().Acquire(root->second);
    return kOk;
}

VantrelHostStatus ReleaseNode(std::uint32_t nodeID) { return Services().GetNodes().Release(nodeID) ? kOk : kFailed; }

VantrelHostStatus GetNodeInfo(std::uint32_t nodeID, char* kindText, char* hashText, std::uint32_t* flags) {
    const NodePtr node = Services().FindNode(nodeID);
    if (!node) return kFailed;
    const char* const kind = GetKindText(node->kind);
    std::memcpy(kindText, kind, std::strlen(kind) + 1);
    PutGuid(node->hash, hashText);
    *flags = node->flags;
    return kOk;
}

VantrelHostStatus GetInputCount(std::uint32_t nodeID, std::int32_t* count) {
    const NodePtr node = Services().FindNode(nodeID);
    if (!node) return kFailed;
    *count = static_cast<std::int32_t>(node->inputs.size());
    return kOk;
}

VantrelHostStatus AcquireInputNode(std::uint32_t nodeID, std::int32_t index, std::int64_t* offset,
                                   std::uint32_t* inputID) {
    const NodePtr node = Services().FindNode(nodeID);
    if (!node || index < 0 || static_cast<std::size_t>(index) >= node->inputs.size()) return kFailed;
    const NodeInput& input = node->inputs[static_cast<std::size_t>(index)];
    *offset = input.offset;
    *inputID = Services().GetNodes().Acquire(input.node);
    return kOk;
}

VantrelHostStatus GetOperatorCount(std::uint32_t nodeID, std::int32_t* count) {
    const NodePtr node = Services().FindNode(nodeID);
    if (!node) return kFailed;
    *count = static_cast<std::int32_t>(node->operators.size());
    return kOk;
}

VantrelHostStatus AcquireOperatorNode(std::uint32_t nodeID, std::int32_t index, std::uint32_t* operatorID) {
    const NodePtr node = Services().FindNode(nodeID);
    if (!node || index < 0 || static_cast<std::size_t>(index) >= node->operators.size()) return kFailed;
    *operatorID = Services().GetNodes().Acquire(node->operators[static_cast<std::size_t>(index)]);
    return kOk;
}

VantrelHostStatus GetProperty(std::uint32_t nodeID, const char* key, char** text) {
    const NodePtr node = Services().FindNode(nodeID);
    const std::string* value = node ? node->FindProperty(key) : nullptr;
    if (value == nullptr) return kFailed;
    // It leaves as plain memory: the receiver frees it through the memory suite.
    std::unique_ptr<char, decltype(&std::free)> copy(static_cast<char*>(std::malloc(value->size() + 1)), &std::free);
    if (!copy) return kFailed;
    std::memcpy(copy.get(), value->c_str(), value->size() + 1);
    ++theTextCount;
    *text = copy.release();
    return kOk;
}

VantrelHostStatus GetParam(std::uint32_t nodeID, std::int32_t index, std::int64_t ticks, VantrelParamRecord* record) {
    *record = {};
    const NodePtr node = Services().FindNode(nodeID);
    const Parameter* parameter = node ? node->FindParameter(index) : nullptr;
    if (parameter == nullptr) return kFailed;
    WriteRecord(parameter->type, parameter->At(ticks), *record);
    return kOk;
}

VantrelHostStatus GetNextKeyframeTime(std::uint32_t nodeID, std::int32_t index, std::int64_t ticks,
                                      std::int64_t* keyframeTicks, std::int32_t* keyframe) {
    const NodePtr node = Services().FindNode(nodeID);
    const Parameter* parameter = node ? node->FindParameter(index) : nullptr;
    const auto next = parameter != nullptr ? parameter->KeyAfter(ticks) : std::nullopt;
    if (!next) return kFailed;
    *keyframeTicks = parameter->keys[static_cast<std::size_t>(*next)].time;
    *keyframe = *next;
    return kOk;
}

VantrelHostStatus TransformTime(std::uint32_t nodeID, std::int64_t ticks, std::int64_t* transformed) {
    const NodePtr node = Services().FindNode(nodeID);
    if (!node) return kFailed;
    *transformed = node->TransformTime(ticks);
    return kOk;
}

VantrelHostStatus GetSequenceInfo(std::uint32_t timelineID, std::int32_t* left, std::int32_t* top, std::int32_t* right,
                                  std::int32_t* bottom, std::int32_t* aspectNumerator, std::int32_t* aspectDenominator,
                                  std::int64_t* ticksPerFrame, std::uint32_t* fieldType) {
    const SnapshotPtr snapshot = Services().GetSnapshot();
    const SequencePtr sequence = snapshot ? snapshot->Find(timelineID) : nullptr;
    if (!sequence) return kFailed;
    const SequenceFormat& format = sequence->format;
    *left = 0;
    *top = 0;
    *right = format.width;
    *bottom = format.height;
    *aspectNumerator = format.aspectNumerator;
    *aspectDenominator = format.aspectDenominator;
    *ticksPerFrame = format.frameTicks;
    *fieldType = static_cast<std::uint32_t>(format.fieldType);
    return kOk;
}

void FreeText(char* text) {
    if (text == nullptr) return;
    --theTextCount;
    std::free(text);
}

VantrelHostStatus AcquireOpaqueData(std::int32_t instanceID, void** data) {
    const std::uint8_t* bytes = Services().GetOpaqueData().Acquire(static_cast<std::uint32_t>(instanceID));
    // The record is const in all but the suite's signature.
    *data = const_cast<std::uint8_t*>(bytes);
    return bytes != nullptr ? kOk : kFailed;
}

VantrelHostStatus ReleaseOpaqueData(std::int32_t instanceID, std::uint8_t* disposed) {
    const bool last = Services().GetOpaqueData().Release(static_cast<std::uint32_t>(instanceID));
    if (disposed != nullptr) *disposed = last ? 1 : 0;
    return kOk;
}

CorvaneVideoSegmentSuite MakeSegmentSuite() {
    CorvaneVideoSegmentSuite suite{};
    for (void** place : {&suite.reserved0, &suite.reserved1, &suite.reserved2, &suite.reserved14, &suite.reserved16,
                         &suite.reserved21}) {
        *place = UnservedEntry();
    }
    suite.ReleaseVideoSegments = &ReleaseVideoSegments;
    suite.GetSegmentsHash = &GetSegmentsHash;
    suite.GetSegmentCount = &GetSegmentCount;
    suite.GetSegmentInfo = &GetSegmentInfo;
    suite.AcquireSegmentNode = &AcquireSegmentNode;
    suite.ReleaseNode = &ReleaseNode;
    suite.GetNodeInfo = &GetNodeInfo;
    suite.GetInputCount = &GetInputCount;
    suite.AcquireInputNode = &AcquireInputNode;
    suite.GetOperatorCount = &GetOperatorCount;
    suite.AcquireOperatorNode = &AcquireOperatorNode;
    suite.GetProperty = &GetProperty;
    suite.GetParam = &GetParam;
    suite.GetNextKeyframeTime = &GetNextKeyframeTime;
    suite.TransformTime = &TransformTime;
    suite.GetSequenceInfo = &GetSequenceInfo;
    suite.AcquireVideoSegments = &AcquirePlain;
    suite.AcquireVideoSegmentsWithPreviews = &AcquireWithPreviews;
    suite.AcquireNestedVideoSegmentsWithPreviews = &AcquireWithPreviews;
    return suite;
}

LarkspurMemoryManagerSuite MakeMemorySuite() {
    LarkspurMemoryManagerSuite suite{};
    std::fill(std::begin(suite.reserved), std::end(suite.reserved), UnservedEntry());
    suite.FreeText = &FreeText;
    return suite;
}

}  // namespace

void* UnservedEntry() { return reinterpret_cast<void*>(&Unserved); }

std::int64_t CountTexts() { return theTextCount; }

void OfferDescriptionSuites(HostServices& services) {
    static const CorvaneVideoSegmentSuite kSegments = MakeSegmentSuite();
    static const LarkspurMemoryManagerSuite kMemory = MakeMemorySuite();
    static const OpaqueEffectDataSuite kOpaque = {&AcquireOpaqueData, UnservedEntry(), &ReleaseOpaqueData};
    services.OfferSuite(kVideoSegmentSuiteName, kVideoSegmentSuiteVersion, &kSegments);
    services.OfferSuite(kMemoryManagerSuiteName, kMemoryManagerSuiteVersion, &kMemory);
    services.OfferSuite(kOpaqueEffectDataSuiteName, kOpaqueEffectDataSuiteVersion, &kOpaque);
}

}  // namespace Vantrel::Host
