// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <array>
#include <cstring>
#include <deque>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "Halden/Guid.h"
#include "Tests/Support/FakeGlaze.h"
#include "Vantrel/HostSuites.h"
#include "Vellum/Geometry.h"
#include "Vellum/PixelFormat.h"

namespace Vantrel::Testing {

using Halden::utility::Guid;

/// A parameter: its value holds from each keyframe to the next, and the first one's before it.
class FakeParam {
public:
    FakeParam() = default;
    template <class T>
    FakeParam(const T& value) {  // a constant reads like one in a script
        At(0, value);
    }
    template <class T>
    FakeParam& At(std::int64_t ticks, const T& value) {
        static_assert(sizeof(T) <= sizeof(Value));
        std::memcpy(mKeyframes[ticks].data(), &value, sizeof value);
        return *this;
    }

private:
    friend class FakeHost;
    using Value = std::array<unsigned char, 28>;
    std::map<std::int64_t, Value> mKeyframes;
};

struct FakePoint {
    double x;
    double y;
};

/// A scripted host node. Ids are those that the script gives.
struct FakeNode {
    struct Input {
        std::uint32_t node;
        std::int64_t offset = 0;
    };

    FakeNode() = default;
    FakeNode(std::string nodeKind) : kind(std::move(nodeKind)) {}

    std::string kind;  ///< "Clip", "Media", ...: made into the host's text; any other text goes out as it is
    Guid hash{};
    std::uint32_t flags = 0;
    std::vector<Input> inputs;
    std::vector<std::uint32_t> operators;
    std::map<std::string, std::string> properties;
    std::map<std::int32_t, FakeParam> params;
    std::function<std::int64_t(std::int64_t)> transformTime;  ///< the node's own time; none is the same time
    bool infoFails = false;
    std::string frameHashText;  ///< the fingerprint, whatever is asked; else one is made of the question
    VantrelHostStatus frameHashStatus = 0;
};

struct FakeSegment {
    std::int64_t start;
    std::int64_t end;
    std::int64_t offset;
    Guid hash;
    std::uint32_t node;
};

struct FakeSequence {
    Vellum::Rect rect{0, 0, 64, 36};
    Vellum::PixelAspectRatio aspect{1, 1};
    std::int64_t ticksPerFrame = 10160640000;  // 25 frames a second
    std::uint32_t fieldType = 0;
    Guid hash;
    std::vector<FakeSegment> segments;         ///< the plain list
    std::vector<FakeSegment> previewSegments;  ///< with previews, as top or nested sequence
    bool infoFails = false;
    bool hashFails = false;
    bool acquireFails = false;
};

/// What the engine asked the software renderer for.
struct FakeRequest {
    enum class Kind { kNode, kOperators, kClip } kind;
    std::uint32_t sequenceID;  ///< 0 for a clip
    std::uint32_t id;          ///< of the node or clip
    std::int32_t firstOperator;
    std::int32_t endOperator;
    std::int64_t time;
    std::int64_t nodeTime;
    std::int64_t frameTicks;
    Vellum::Point sequenceSize;
    Vellum::PixelAspectRatio aspect;
    VantrelRenderDescription description;  ///< its list of formats is copied into the next field
    std::vector<std::uint32_t> pixelFormats;
    VantrelClipRecord clip;
};

/// How the software renderer behaves.
struct FakeRenderer {
    enum class Delivery { kWithinTheCall, kOnAThread, kWhenTold } delivery = Delivery::kWithinTheCall;
    int delayMs = 0;                      ///< on a thread
    VantrelHostStatus requestStatus = 0;  ///< negative: the request is refused
    VantrelHostStatus callbackStatus = 0;
    bool deliversNothing = false;
    /// The picture for a request; a grey one of the size asked for where this is empty.
    std::function<FakePicture(const FakeRequest&)> paint;
};

struct FakeClip {
    std::uint8_t ready = 1;
    std::function<VantrelClipRecord(const VantrelClipRecord&)> deliver;  ///< what it really delivers; none: as wanted
    std::string frameHashText;
    VantrelHostStatus frameHashStatus = 0;
};

/// A host in memory with all six suites, scripted by its public fields. It counts the calls, and fails the test when it
/// is called wrongly: unknown or released ids, text or pictures that aren't given back, releases too many. One lives at
/// a time. The script may be changed while no render runs.
class FakeHost {
public:
    FakeHost();
    /// Waits for deliveries on threads, drops those never told, and fails the test for what wasn't given back.
    ~FakeHost();
    FakeHost(const FakeHost&) = delete;
    FakeHost& operator=(const FakeHost&) = delete;

    [[nodiscard]] QuillBasicSuite* GetBasicSuite() { return &mBasicSuite; }

    std::map<std::uint32_t, FakeNode> nodes;
    std::map<std::uint32_t, FakeSequence> sequences;
    std::map<std::uint32_t, FakeClip> clips;
    FakeRenderer renderer;
    std::map<std::string, FakePicture> glazeCache;  ///< by the text of the fingerprint
    std::map<std::int32_t, void*> opaqueData;       ///< by effect instance
    std::vector<std::string> missingSuites;         ///< names that the host doesn't offer

    /// Calls of an entry by its name in HostSuites.h.
    [[nodiscard]] int Count(const std::string& entry) const;
    /// Calls of all entries.
    [[nodiscard]] int CountAll() const;
    void ResetCounts();
    /// Requests for renders and for their fingerprints, in order.
    [[nodiscard]] std::vector<FakeRequest> GetRenders() const;
    [[nodiscard]] std::vector<FakeRequest> GetHashQuestions() const;
    /// Delivers what was requested with kWhenTold, on this thread. Returns how many.
    int DeliverPending();
    /// References that the engine holds on a node.
    [[nodiscard]] int GetReferences(std::uint32_t node) const;

private:
    friend struct FakeHostEntries;
    struct Pending {
        std::uint32_t requestID;
        VantrelRenderCallback callback;
        void* context;
        FakeRequest request;
    };
    struct OpenList {
        std::uint32_t timelineID;
        bool withPreviews;
    };

    static FakeHost& Current();
    void Called(const char* entry);
    FakeNode* FindNode(std::uint32_t id, const char* entry);
    std::uint32_t Acquire(std::uint32_t id, const char* entry);
    const std::vector<FakeSegment>* FindList(std::uint32_t segmentsID, const char* entry);
    VantrelHostStatus OpenSegments(std::uint32_t timelineID, bool withPreviews, std::uint32_t* segmentsID);
    VantrelHostStatus ReadParam(std::uint32_t id, std::int32_t index, std::int64_t ticks, VantrelParamRecord* record);
    VantrelHostStatus FindKeyframe(std::uint32_t id, std::int32_t index, std::int64_t ticks, std::int64_t* next);
    VantrelHostStatus Render(const FakeRequest& request, VantrelRenderCallback callback, void* context,
                             std::uint32_t* requestID);
    VantrelHostStatus AnswerHash(const FakeRequest& request, const std::string& text, VantrelHostStatus status,
                                 char* out);
    void Deliver(const Pending& pending);
    VantrelHostStatus Cancel(std::uint32_t requestID);

    mutable std::recursive_mutex mMutex;
    QuillBasicSuite mBasicSuite{};
    std::map<std::string, int> mCounts;
    std::map<std::uint32_t, int> mReferences;
    std::map<std::uint32_t, OpenList> mLists;
    std::map<std::string, int> mAcquiredSuites;
    std::map<std::int32_t, int> mAcquiredOpaqueData;
    std::uint32_t mLastListID = 0;
    std::uint32_t mLastRequestID = 0;
    int mLiveTexts = 0;
    std::vector<FakeRequest> mRenders;
    std::vector<FakeRequest> mHashQuestions;
    std::deque<Pending> mPending;
    std::vector<std::thread> mThreads;
};

}  // namespace Vantrel::Testing
