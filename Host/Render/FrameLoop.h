// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <deque>
#include <functional>
#include <mutex>
#include <string>

#include "Host/Media/HostPicture.h"
#include "Vantrel/RenderSystem.h"

namespace Vantrel::Host {

/// What is to be rendered of a sequence.
struct RenderJob {
    std::uint32_t timelineID = 1;
    std::int64_t firstFrame = 0;  ///< sequence frames, half open
    std::int64_t endFrame = 0;
    std::int32_t width = 0;  ///< of the output, pixels
    std::int32_t height = 0;
    std::uint32_t quality = 4;
    Vellum::PixelFormat format = Vellum::kPixelFormat_BGRA_4444_8u;
    bool alpha = false;
    bool report = false;  ///< ask the engine for its text with each frame
    int framesAhead = 4;  ///< frames in preparation while one renders
};

/// Where frames came from, and how long they took.
struct RenderSummary {
    std::int64_t frames = 0;
    std::int64_t deviceFrames = 0;      ///< wholly the device's, black stretches among them
    std::int64_t partlyHostFrames = 0;  ///< the device's, with pictures that the host's renderer made
    std::int64_t hostFrames = 0;        ///< the host's renderer made them
    std::int64_t failedFrames = 0;      ///< of the host's frames those that the device gave up
    double seconds = 0;
    double waitSeconds = 0;  ///< of these the render thread waited for media
    std::uint64_t peakDeviceBytes = 0;
    bool stopped = false;
};

/// A frame that is done.
struct RenderedFrame {
    std::int64_t number = 0;
    std::shared_ptr<HostPicture> picture;
    std::string report;
};

/// Renders a stretch of a sequence frame by frame, several frames ahead: while one renders on the device, the next ones
/// are decoded, staged and prepared. Used by one thread.
class FrameLoop {
public:
    /// Renders a frame of the sequence with the host's own renderer, where the device can't; empty when that fails too.
    using HostRenderer = std::function<HostPictureRef(const RenderParams& params)>;
    /// Gets frames in order. What it throws ends the loop and goes to the caller of Run.
    using Sink = std::function<void(RenderedFrame)>;

    FrameLoop(boost::shared_ptr<RenderSystem> system, std::shared_ptr<PixelBufferPool> pool, HostRenderer hostRenderer);
    ~FrameLoop();
    FrameLoop(const FrameLoop&) = delete;
    FrameLoop& operator=(const FrameLoop&) = delete;

    /// @param stop  ends the loop between two frames when it becomes true.
    /// Throws std::runtime_error when a frame can be had neither from the device nor from the host.
    RenderSummary Run(const RenderJob& job, const Sink& sink, const std::atomic<bool>& stop);

private:
    struct Readiness;
    struct Request;

    void Prepare(const RenderJob& job, std::int64_t number);
    /// Has a frame whose pictures have come copied for the device. On whatever thread brought the last one.
    static void Stage(RenderSystem& system, const std::shared_ptr<Request>& request);
    [[nodiscard]] RenderParams MakeParams(const RenderJob& job, std::int64_t time, const SegmentInfo& info) const;
    RenderedFrame RenderNext(const RenderJob& job, RenderSummary& summary);
    [[nodiscard]] std::shared_ptr<HostPicture> RenderOnDevice(const RenderJob& job, Request& request,
                                                              std::string& report);
    void WaitUntilPrepared(Request& request, RenderSummary& summary);
    void Abandon();

    boost::shared_ptr<RenderSystem> mSystem;
    std::shared_ptr<PixelBufferPool> mPool;
    HostRenderer mHostRenderer;
    Vellum::Rect mSequenceRect;
    Vellum::PixelAspectRatio mAspect;
    Vellum::FrameRate mRate;
    std::uint32_t mFieldType = 0;
    std::deque<std::shared_ptr<Request>> mAhead;
    RenderResultsRef mPrevious;
};

}  // namespace Vantrel::Host
