// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Tests/Support/FakeHost.h"

#include <algorithm>
#include <chrono>
#include <numeric>
#include <sstream>

#include <gtest/gtest.h>

#include "Ostrand/MixHash.h"
#include "Tests/Support/FakeHostEntries.h"

namespace Vantrel::Testing {
namespace {

constexpr VantrelHostStatus kFails = -1;

FakeHost* gCurrent = nullptr;

/// The tables, made once: suites outlive the hosts that answer them.
struct Suites {
    Suites() {
        FakeHostEntries::FillSegmentLists(segments);
        FakeHostEntries::FillNodes(segments);
        FakeHostEntries::FillRenders(renders);
        FakeHostEntries::FillClips(renders);
        FakeHostEntries::FillSmallSuites(memory, glaze, cache, opaque);
    }
    [[nodiscard]] const void* Find(const std::string& name, std::int32_t version) const {
        if (name == kVideoSegmentSuiteName && version == kVideoSegmentSuiteVersion) return &segments;
        if (name == kVideoSegmentRenderSuiteName && version == kVideoSegmentRenderSuiteVersion) return &renders;
        if (name == kMemoryManagerSuiteName && version == kMemoryManagerSuiteVersion) return &memory;
        if (name == kGlazeSuiteName && version == kGlazeSuiteVersion) return &glaze;
        if (name == kGlazeCacheSuiteName && version == kGlazeCacheSuiteVersion) return &cache;
        if (name == kOpaqueEffectDataSuiteName && version == kOpaqueEffectDataSuiteVersion) return &opaque;
        return nullptr;
    }

    CorvaneVideoSegmentSuite segments{};
    CorvaneVideoSegmentRenderSuite renders{};
    LarkspurMemoryManagerSuite memory{};
    LarkspurGlazeSuite glaze{};
    LarkspurGlazeCacheSuite cache{};
    OpaqueEffectDataSuite opaque{};
};

const Suites& AllSuites() {
    static const Suites suites;
    return suites;
}

/// A fingerprint that two questions share only when they ask for the same picture.
std::string MakeHashText(const FakeRequest& request) {
    Ostrand::NodeHasher hasher;
    hasher.Value(request.kind).Value(request.sequenceID).Value(request.id).Value(request.endOperator);
    hasher.Value(request.time).Value(request.nodeTime).Value(request.sequenceSize).Value(request.aspect);
    hasher.Value(request.description.width).Value(request.description.height).Value(request.description.quality);
    hasher.Value(request.description.fieldType).Value(request.clip);
    for (const std::uint32_t format : request.pixelFormats) hasher.Value(format);
    return hasher.Finish().ToString();
}

FakePicture PaintGrey(const FakeRequest& request) {
    FakePicture picture;
    if (request.kind == FakeRequest::Kind::kClip) {
        picture.pixelFormat = request.clip.pixelFormat;
        picture.width = request.clip.width;
        picture.height = request.clip.height;
    } else {
        picture.pixelFormat = request.pixelFormats.front();
        picture.width = request.description.width;
        picture.height = request.description.height;
    }
    return picture;
}

}  // namespace

VantrelHostStatus FakeHostEntries::AcquireSuite(const char* name, std::int32_t version, const void** suite) {
    const Call call("AcquireSuite");
    const auto& missing = call.host.missingSuites;
    *suite = nullptr;
    if (std::find(missing.begin(), missing.end(), name) != missing.end()) return kFails;
    *suite = AllSuites().Find(name, version);
    if (!*suite) return kFails;
    ++call.host.mAcquiredSuites[name];
    return 0;
}

VantrelHostStatus FakeHostEntries::ReleaseSuite(const char* name, std::int32_t /*version*/) {
    const Call call("ReleaseSuite");
    --call.host.mAcquiredSuites[name];
    return 0;
}

FakeHost::FakeHost() {
    EXPECT_EQ(gCurrent, nullptr) << "one fake host at a time";
    mBasicSuite = {FakeHostEntries::AcquireSuite, FakeHostEntries::ReleaseSuite};
    gCurrent = this;
}

FakeHost::~FakeHost() {
    for (std::thread& thread : mThreads) thread.join();
    renderer.deliversNothing = true;
    DeliverPending();
    for (const auto& [id, references] : mReferences) EXPECT_EQ(references, 0) << "node " << id << " is still held";
    for (const auto& [instance, count] : mAcquiredOpaqueData) {
        EXPECT_EQ(count, 0) << "opaque data of instance " << instance << " is still held";
    }
    EXPECT_TRUE(mLists.empty()) << "a segment list is still held";
    EXPECT_EQ(mLiveTexts, 0) << "a property's text was never freed";
    EXPECT_EQ(CountLiveGlazes(), 0) << "a picture was never disposed of";
    gCurrent = nullptr;
}

FakeHost& FakeHost::Current() {
    if (!gCurrent) throw std::logic_error("a suite is used after its host has gone");
    return *gCurrent;
}

void FakeHost::Called(const char* entry) { ++mCounts[entry]; }

int FakeHost::Count(const std::string& entry) const {
    const std::lock_guard<std::recursive_mutex> lock(mMutex);
    const auto found = mCounts.find(entry);
    return found == mCounts.end() ? 0 : found->second;
}

int FakeHost::CountAll() const {
    const std::lock_guard<std::recursive_mutex> lock(mMutex);
    return std::accumulate(mCounts.begin(), mCounts.end(), 0,
                           [](int sum, const auto& entry) { return sum + entry.second; });
}

void FakeHost::ResetCounts() {
    const std::lock_guard<std::recursive_mutex> lock(mMutex);
    mCounts.clear();
}

std::vector<FakeRequest> FakeHost::GetRenders() const {
    const std::lock_guard<std::recursive_mutex> lock(mMutex);
    return mRenders;
}

std::vector<FakeRequest> FakeHost::GetHashQuestions() const {
    const std::lock_guard<std::recursive_mutex> lock(mMutex);
    return mHashQuestions;
}

int FakeHost::GetReferences(std::uint32_t node) const {
    const std::lock_guard<std::recursive_mutex> lock(mMutex);
    const auto found = mReferences.find(node);
    return found == mReferences.end() ? 0 : found->second;
}

FakeNode* FakeHost::FindNode(std::uint32_t id, const char* entry) {
    const auto found = nodes.find(id);
    if (found == nodes.end() || mReferences[id] <= 0) {
        ADD_FAILURE() << entry << " is called for node " << id << ", which the engine doesn't hold";
        return nullptr;
    }
    return &found->second;
}

std::uint32_t FakeHost::Acquire(std::uint32_t id, const char* entry) {
    if (nodes.count(id) == 0) {
        ADD_FAILURE() << entry << " leads to node " << id << ", which isn't in the script";
        return 0;
    }
    ++mReferences[id];
    return id;
}

const std::vector<FakeSegment>* FakeHost::FindList(std::uint32_t segmentsID, const char* entry) {
    const auto found = mLists.find(segmentsID);
    if (found == mLists.end()) {
        ADD_FAILURE() << entry << " is called for segment list " << segmentsID << ", which isn't open";
        return nullptr;
    }
    const FakeSequence& sequence = sequences[found->second.timelineID];
    return found->second.withPreviews ? &sequence.previewSegments : &sequence.segments;
}

VantrelHostStatus FakeHost::OpenSegments(std::uint32_t timelineID, bool withPreviews, std::uint32_t* segmentsID) {
    const auto found = sequences.find(timelineID);
    if (found == sequences.end() || found->second.acquireFails) return kFails;
    *segmentsID = ++mLastListID;
    mLists[*segmentsID] = {timelineID, withPreviews};
    return 0;
}

VantrelHostStatus FakeHost::ReadParam(std::uint32_t id, std::int32_t index, std::int64_t ticks,
                                      VantrelParamRecord* record) {
    const FakeNode* node = FindNode(id, "GetParam");
    const auto param = node ? node->params.find(index) : std::map<std::int32_t, FakeParam>::const_iterator();
    if (!node || param == node->params.end()) return kFails;
    const auto& keyframes = param->second.mKeyframes;
    auto keyframe = keyframes.upper_bound(ticks);
    if (keyframe != keyframes.begin()) --keyframe;
    std::memcpy(record->bytes + 4, keyframe->second.data(), keyframe->second.size());
    return 0;
}

VantrelHostStatus FakeHost::FindKeyframe(std::uint32_t id, std::int32_t index, std::int64_t ticks, std::int64_t* next) {
    const FakeNode* node = FindNode(id, "GetNextKeyframeTime");
    const auto param = node ? node->params.find(index) : std::map<std::int32_t, FakeParam>::const_iterator();
    if (!node || param == node->params.end()) return kFails;
    const auto keyframe = param->second.mKeyframes.upper_bound(ticks);
    if (keyframe == param->second.mKeyframes.end()) return kFails;
    *next = keyframe->first;
    return 0;
}

VantrelHostStatus FakeHost::AnswerHash(const FakeRequest& request, const std::string& text, VantrelHostStatus status,
                                       char* out) {
    mHashQuestions.push_back(request);
    if (status != 0) return status;
    const std::string answer = text.empty() ? MakeHashText(request) : text;
    std::memcpy(out, answer.c_str(), answer.size() + 1);
    return 0;
}

VantrelHostStatus FakeHost::Render(const FakeRequest& request, VantrelRenderCallback callback, void* context,
                                   std::uint32_t* requestID) {
    using Delivery = FakeRenderer::Delivery;
    std::unique_lock<std::recursive_mutex> lock(mMutex);
    mRenders.push_back(request);
    if (renderer.requestStatus < 0) return renderer.requestStatus;
    *requestID = ++mLastRequestID;
    const Pending pending{*requestID, callback, context, request};
    if (renderer.delivery == Delivery::kWhenTold) mPending.push_back(pending);
    if (renderer.delivery == Delivery::kOnAThread) {
        mThreads.emplace_back([this, pending, delay = renderer.delayMs] {
            std::this_thread::sleep_for(std::chrono::milliseconds(delay));
            Deliver(pending);
        });
    }
    lock.unlock();
    if (renderer.delivery == Delivery::kWithinTheCall) Deliver(pending);
    return 0;
}

void FakeHost::Deliver(const Pending& pending) {
    Glaze* glaze = nullptr;
    if (!renderer.deliversNothing) {
        glaze = NewFakeGlaze(renderer.paint ? renderer.paint(pending.request) : PaintGrey(pending.request));
    }
    // Without the lock: the engine disposes of the picture from within.
    pending.callback(glaze, pending.context, renderer.callbackStatus);
}

VantrelHostStatus FakeHost::Cancel(std::uint32_t requestID) {
    const auto found = std::find_if(mPending.begin(), mPending.end(),
                                    [requestID](const Pending& each) { return each.requestID == requestID; });
    if (found == mPending.end()) return kFails;
    const Pending cancelled = *found;
    mPending.erase(found);
    cancelled.callback(nullptr, cancelled.context, kFails);
    return 0;
}

int FakeHost::DeliverPending() {
    int delivered = 0;
    for (;; ++delivered) {
        std::unique_lock<std::recursive_mutex> lock(mMutex);
        if (mPending.empty()) return delivered;
        const Pending next = mPending.front();
        mPending.pop_front();
        lock.unlock();
        Deliver(next);
    }
}

}  // namespace Vantrel::Testing
