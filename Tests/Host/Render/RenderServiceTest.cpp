// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <condition_variable>
#include <mutex>
#include <thread>

#include "Host/Render/RenderService.h"
#include "Tests/Host/TimelineText.h"

namespace Vantrel::Testing {
namespace {

using namespace Vantrel::Host::Test;
using Host::HostPictureRef;
using Host::RenderService;

/// Makes pictures of one colour, when it is let.
class ScriptedRenderer : public Host::ISoftwareRenderer {
public:
    HostPictureRef RenderClip(const Host::MediaClip& clip, std::int64_t frame, Vellum::PixelFormat format) override {
        Pass();
        if (frame == failingFrame) throw std::runtime_error("frame " + std::to_string(frame) + " is damaged");
        return Host::MakeHostPicture(*mPool, format, clip.info.width, clip.info.height);
    }
    HostPictureRef RenderNode(const Host::Node&, std::int64_t, const Host::SequenceSize&,
                              const VantrelRenderDescription& description) override {
        Pass();
        formats += description.pixelFormats[0] == Vellum::FourCC("bgra") ? "a" : "?";
        return Host::MakeHostPicture(*mPool, Vellum::kPixelFormat_BGRA_4444_8u, description.width, description.height);
    }
    HostPictureRef RenderOperators(const Host::Node& clip, std::int32_t, std::int64_t time,
                                   const Host::SequenceSize& sequence,
                                   const VantrelRenderDescription& description) override {
        return RenderNode(clip, time, sequence, description);
    }
    [[nodiscard]] std::vector<std::string> GetPassedThrough() const override { return {}; }

    void Close() {
        const std::lock_guard<std::mutex> hold(mMutex);
        mOpen = false;
    }
    void Open() {
        const std::lock_guard<std::mutex> hold(mMutex);
        mOpen = true;
        mChanged.notify_all();
    }
    std::atomic<int> renders{0};
    std::int64_t failingFrame = -1;
    std::string formats;

private:
    void Pass() {
        ++renders;
        std::unique_lock<std::mutex> lock(mMutex);
        mChanged.wait(lock, [this] { return mOpen; });
    }

    std::shared_ptr<Host::PixelBufferPool> mPool = Host::PixelBufferPool::Create();
    std::mutex mMutex;
    std::condition_variable mChanged;
    bool mOpen = true;
};

/// What a request's callback brought.
struct Answer {
    static void Receive(Glaze* frame, void* context, std::int32_t status) {
        auto* answer = static_cast<Answer*>(context);
        answer->hadFrame = frame != nullptr;
        answer->status = status;
        if (frame) {
            answer->width = frame->width;
            Host::DisposeGlaze(frame);
        }
        ++answer->calls;
    }
    std::atomic<int> calls{0};
    bool hadFrame = false;
    std::int32_t status = -77;
    std::int32_t width = 0;
};

class RenderServiceTest : public testing::Test {
protected:
    void Start(unsigned threads = 2) {
        mService = std::make_unique<RenderService>(Host::HostServices::Instance(), mRenderer, threads);
    }

    [[nodiscard]] static const CorvaneVideoSegmentRenderSuite& Suite() {
        return Acquire<CorvaneVideoSegmentRenderSuite>(kVideoSegmentRenderSuiteName, kVideoSegmentRenderSuiteVersion);
    }
    [[nodiscard]] std::uint32_t ClipID() const {
        return mTimeline.Segments()[0].root->inputs[0].node->inputs[0].node->AsMedia()->clip->id;
    }
    [[nodiscard]] VantrelHostStatus RequestClip(std::int64_t frame, Answer& answer, std::uint32_t* id = nullptr) const {
        const VantrelClipRecord record{Vellum::FourCC("bgra"), 1280, 720, 1, 1, 0, 5};
        std::uint32_t requestID = 0;
        return Suite().RenderClip(ClipID(), &record, frame * kFrame, Answer::Receive, &answer, id ? id : &requestID);
    }
    /// Requests the root's picture while the format list that came with it goes out of scope.
    [[nodiscard]] VantrelHostStatus RequestRoot(Answer& answer, char* hash = nullptr) const {
        const RootHold hold;
        std::uint32_t formats[] = {Vellum::FourCC("bgra"), 0};
        VantrelRenderDescription description{};
        description.pixelFormats = formats;
        description.pixelFormatCount = 2;
        description.width = 320;
        description.height = 180;
        description.aspectNumerator = description.aspectDenominator = 1;
        description.quality = 4;
        if (hash) {
            EXPECT_EQ(Suite().GetNodeFrameHash(1, hold.root, 0, 0, kFrame, 1280, 720, 1, 1, &description, hash), 0);
        }
        std::uint32_t requestID = 0;
        const VantrelHostStatus status = Suite().RenderNode(1, hold.root, 0, 0, kFrame, 1280, 720, 1, 1, &description,
                                                            Answer::Receive, &answer, &requestID);
        formats[0] = 0xDEADBEEF;
        Segments().ReleaseNode(hold.root);
        Segments().ReleaseVideoSegments(hold.list);
        return status;
    }

    Published mTimeline{Timeline({Track({Clip("a", 0, 48)})})};
    ScriptedRenderer mRenderer;
    std::unique_ptr<RenderService> mService;
};

TEST_F(RenderServiceTest, AClipFrameIsDeliveredOnceAndCached) {
    Start();
    VantrelClipRecord wanted{0, 1, 1, 1, 1, 4, 1};
    VantrelClipRecord delivered{};
    ASSERT_EQ(Suite().GetClipFormat(ClipID(), 0, &wanted, &delivered), 0);
    EXPECT_EQ(delivered.width, 1280);
    EXPECT_EQ(delivered.height, 720);
    EXPECT_EQ(delivered.pixelFormat, Vellum::FourCC("bgra"));
    Answer first;
    Answer second;
    ASSERT_EQ(RequestClip(3, first), 0);
    mService->Drain();
    ASSERT_EQ(RequestClip(3, second), 0);
    mService->Drain();
    EXPECT_EQ(first.calls, 1);
    EXPECT_EQ(second.calls, 1);
    EXPECT_TRUE(first.hadFrame && second.hadFrame);
    EXPECT_EQ(first.status, 0);
    EXPECT_EQ(first.width, 1280);
    EXPECT_EQ(mRenderer.renders, 1) << "the second one comes from the cache";
    EXPECT_EQ(mService->GetRenderedClips(), 2);
}

TEST_F(RenderServiceTest, FailuresComeBackWithoutAFrameAndAreTold) {
    Start();
    mRenderer.failingFrame = 5;
    Answer answers[3];
    for (int i = 0; i < 3; ++i) ASSERT_EQ(RequestClip(i == 1 ? 4 : 5, answers[i]), 0);
    mService->Drain();
    for (const Answer& answer : answers) EXPECT_EQ(answer.calls, 1);
    EXPECT_NE(answers[0].status, 0);
    EXPECT_FALSE(answers[0].hadFrame);
    EXPECT_EQ(answers[1].status, 0);
    EXPECT_THAT(mService->GetFailures(), testing::ElementsAre("frame 5 is damaged"));
}

TEST_F(RenderServiceTest, CancelledAndLateRequestsGetTheirCallbackOnce) {
    Start(1);
    mRenderer.Close();
    Answer running;
    Answer cancelled;
    Answer waiting[4];
    std::uint32_t runningID = 0;
    std::uint32_t cancelledID = 0;
    ASSERT_EQ(RequestClip(1, running, &runningID), 0);
    while (mRenderer.renders == 0) std::this_thread::yield();
    ASSERT_EQ(RequestClip(2, cancelled, &cancelledID), 0);
    for (int i = 0; i < 4; ++i) ASSERT_EQ(RequestClip(10 + i, waiting[i]), 0);
    EXPECT_NE(runningID, cancelledID);
    EXPECT_EQ(Suite().CancelRequest(cancelledID), 0);
    EXPECT_EQ(Suite().CancelRequest(runningID), 0);
    EXPECT_EQ(Suite().CancelRequest(4242), 0);
    // The end of the service answers everybody: who runs may still deliver, who waits doesn't.
    std::thread end([this] { mService.reset(); });
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
    mRenderer.Open();
    end.join();
    EXPECT_EQ(running.calls, 1);
    EXPECT_EQ(running.status, 0);
    EXPECT_EQ(cancelled.calls, 1);
    EXPECT_NE(cancelled.status, 0);
    EXPECT_FALSE(cancelled.hadFrame);
    for (const Answer& answer : waiting) {
        EXPECT_EQ(answer.calls, 1);
        EXPECT_NE(answer.status, 0);
    }
    EXPECT_EQ(mRenderer.renders, 1);
}

TEST_F(RenderServiceTest, RefusalsGetNoCallback) {
    Start();
    Answer answer;
    const VantrelClipRecord record{};
    std::uint32_t id = 0;
    EXPECT_LT(Suite().RenderClip(987654, &record, 0, Answer::Receive, &answer, &id), 0);
    EXPECT_LT(Suite().RenderNode(1, 987654, 0, 0, kFrame, 8, 8, 1, 1, nullptr, Answer::Receive, &answer, &id), 0);
    std::uint8_t ready = 1;
    EXPECT_EQ(Suite().IsClipReady(987654, &ready), 0);
    EXPECT_EQ(ready, 0);
    EXPECT_EQ(Suite().IsClipReady(ClipID(), &ready), 0);
    EXPECT_EQ(ready, 1);
    mService->Drain();
    mService.reset();
    EXPECT_LT(RequestClip(0, answer), 0) << "without a service everything is refused";
    EXPECT_EQ(answer.calls, 0);
}

TEST_F(RenderServiceTest, ASubtreeIsFoundUnderTheTextThatTheEngineMixes) {
    Start();
    Answer answer;
    char hash[40] = {};
    ASSERT_EQ(RequestRoot(answer, hash), 0);
    mService->Drain();
    EXPECT_EQ(answer.calls, 1);
    EXPECT_EQ(answer.width, 320);
    EXPECT_EQ(mRenderer.formats, "a") << "the description outlives the call that brought it";
    const auto& cache = Acquire<LarkspurGlazeCacheSuite>(kGlazeCacheSuiteName, kGlazeCacheSuiteVersion);
    Glaze* frame = nullptr;
    EXPECT_LT(cache.Find(hash, &frame), 0) << "the engine looks under its own text, not the host's";
    EXPECT_EQ(frame, nullptr);
}

}  // namespace
}  // namespace Vantrel::Testing
