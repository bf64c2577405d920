// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Host/Render/FrameLoop.h"

#include <numeric>
#include <stdexcept>

#include <boost/make_shared.hpp>

#include "Host/Render/FinishedFrame.h"

namespace Vantrel::Host {

namespace {

using Clock = std::chrono::steady_clock;

double SecondsSince(Clock::time_point start) { return std::chrono::duration<double>(Clock::now() - start).count(); }

/// The aspect of output pixels that show a sequence's picture in another size.
Vellum::PixelAspectRatio ScaleAspect(Vellum::PixelAspectRatio aspect, const Vellum::Rect& sequence, std::int32_t width,
                                     std::int32_t height) {
    const std::int64_t numerator = std::int64_t{aspect.numerator} * sequence.Width() * height;
    const std::int64_t denominator = std::int64_t{aspect.denominator} * sequence.Height() * width;
    const std::int64_t divisor = std::gcd(numerator, denominator);
    if (divisor == 0 || numerator / divisor > INT32_MAX || denominator / divisor > INT32_MAX) return aspect;
    return {static_cast<std::int32_t>(numerator / divisor), static_cast<std::int32_t>(denominator / divisor)};
}

}  // namespace

/// The sign that a frame is ready to render. The engine's threads hold it and nothing else of the frame's, so that no
/// tree ends on one of them, within whatever lock the engine holds while it tells.
struct FrameLoop::Readiness {
    std::mutex mutex;
    std::condition_variable changed;
    bool prepared = false;

    void Set() {
        const std::lock_guard<std::mutex> hold(mutex);
        prepared = true;
        changed.notify_all();
    }
};

/// A frame on its way: everything that the engine was given for it.
///
/// The engine's preparation takes only pictures that are there, so a frame goes through two sets of results: the first
/// gathers the host's pictures, and when the last one has come the second takes them over and is staged.
struct FrameLoop::Request {
    std::int64_t number = 0;
    SegmentInfo info;
    boost::shared_ptr<RenderParams> params;
    RenderResultsRef gathered;
    RenderResultsRef results;  ///< what the frame is rendered with; settled once it is prepared
    bool refused = false;      ///< the host refused a picture: nothing will complete
    std::shared_ptr<Readiness> readiness = std::make_shared<Readiness>();
};

FrameLoop::FrameLoop(boost::shared_ptr<RenderSystem> system, std::shared_ptr<PixelBufferPool> pool,
                     HostRenderer hostRenderer)
    : mSystem(std::move(system)), mPool(std::move(pool)), mHostRenderer(std::move(hostRenderer)) {
    if (mSystem->GetSequenceFormat(mSequenceRect, mAspect, mRate, mFieldType) != 0) {
        throw std::runtime_error("the engine could not read the sequence");
    }
}

FrameLoop::~FrameLoop() { Abandon(); }

RenderParams FrameLoop::MakeParams(const RenderJob& job, std::int64_t time, const SegmentInfo& info) const {
    RenderParams params;
    params.time = time;
    params.clipTime = time - info.in + info.offset;
    params.outputRect = {0, 0, job.width, job.height};
    params.pixelAspectRatio = ScaleAspect(mAspect, mSequenceRect, job.width, job.height);
    params.pixelFormat = Vellum::FourCC("bgra");
    params.fieldType = mFieldType;
    params.fieldSelection = Vellum::kFieldSelection_Frame;
    params.quality = job.quality;
    params.frameTicks = mRate.GetTicksPerFrame();
    params.collectInformation = job.report ? 1 : 0;
    params.sequenceID = job.timelineID;
    params.sequenceFieldType = mFieldType;
    params.sequenceFrameTicks = mRate.GetTicksPerFrame();
    params.sequenceRect = mSequenceRect;
    params.scaleX = static_cast<float>(mSequenceRect.Width()) / static_cast<float>(job.width);
    params.scaleY = static_cast<float>(mSequenceRect.Height()) / static_cast<float>(job.height);
    return params;
}

void FrameLoop::Prepare(const RenderJob& job, std::int64_t number) {
    auto request = std::make_shared<Request>();
    request->number = number;
    const std::int64_t time = number * mRate.GetTicksPerFrame();
    if (mSystem->GetSegmentInfo(time, request->info, false) != 0) request->info = SegmentInfo();
    request->params = boost::make_shared<RenderParams>(MakeParams(job, time, request->info));
    const std::weak_ptr<Request> weak = request;
    request->gathered = boost::make_shared<RenderResults>([weak, system = mSystem] {
        if (const std::shared_ptr<Request> complete = weak.lock()) Stage(*system, complete);
    });
    request->results = request->gathered;
    mAhead.push_back(request);
    const RenderNodeRef& root = request->info.tree;
    if (!root) {
        request->readiness->Set();
        return;
    }
    if (root->CollectHostFrames(*request->params, request->gathered, mPrevious) != 0 &&
        Ostrand::Failed(root->RequestHostFrames(*request->params, request->gathered))) {
        request->refused = true;
        return;
    }
    // The piece that was counted from the start, so that nothing completes while there is more to ask for.
    request->gathered->EndAsyncPiece();
}

void FrameLoop::Stage(RenderSystem& system, const std::shared_ptr<Request>& request) {
    const auto results = boost::make_shared<RenderResults>([readiness = request->readiness] { readiness->Set(); });
    try {
        const bool complete = !request->gathered->HasFailed() &&
                              request->info.tree->CollectHostFrames(*request->params, results, request->gathered) == 0;
        if (complete) {
            request->results = results;
            system.PrepareRender(request->info.tree, request->params, results);
            return;
        }
    } catch (const std::exception&) {
        // What keeps the pictures from being handed over will show in the render.
    }
    // With a picture missing the frame is rendered as far as it goes, and nothing is copied ahead.
    request->readiness->Set();
}

void FrameLoop::WaitUntilPrepared(Request& request, RenderSummary& summary) {
    Readiness& readiness = *request.readiness;
    std::unique_lock<std::mutex> lock(readiness.mutex);
    if (readiness.prepared || request.refused) return;
    const Clock::time_point start = Clock::now();
    readiness.changed.wait(lock, [&readiness] { return readiness.prepared; });
    summary.waitSeconds += SecondsSince(start);
}

std::shared_ptr<HostPicture> FrameLoop::RenderOnDevice(const RenderJob& job, Request& request, std::string& report) {
    const Kiln::ScopedDeviceAccess hold(mSystem->GetDevice());
    VideoFrameRef first;
    VideoFrameRef second;
    Status status = Ostrand::kStatus_Failure;
    try {
        status = mSystem->RenderFrames(request.info.tree, request.params, request.results, first, second,
                                       job.report ? &report : nullptr, request.params->outputRect);
    } catch (const Ostrand::NullInterfaceException&) {
        // Without memory for a picture a node is left without a frame, which the engine reports by this exception. The
        // frame is then the host's to make, like any other that the device can't.
        return nullptr;
    }
    if (Ostrand::Failed(status)) return nullptr;
    if (!first) return MakeTransparentPicture(*mPool, job.format, job.width, job.height);
    const auto take = [&](const VideoFrameRef& frame) {
        std::shared_ptr<HostPicture> taken = TakeFinishedFrame(*mPool, frame, job.format);
        return taken ? PlaceOnOutput(*mPool, std::move(taken), job.width, job.height) : nullptr;
    };
    std::shared_ptr<HostPicture> picture = take(first);
    if (!picture || !second) return picture;
    const std::shared_ptr<HostPicture> other = take(second);
    if (!other) return nullptr;
    // Whatever their order in time, the engine hands the upper field's frame out first.
    WeaveFields(*picture, *other);
    picture->fieldType = mFieldType;
    return picture;
}

RenderedFrame FrameLoop::RenderNext(const RenderJob& job, RenderSummary& summary) {
    const std::shared_ptr<Request> request = mAhead.front();
    mAhead.pop_front();
    RenderedFrame frame;
    frame.number = request->number;
    WaitUntilPrepared(*request, summary);
    const bool onDevice = request->info.tree && !request->refused;
    if (onDevice) frame.picture = RenderOnDevice(job, *request, frame.report);
    ++summary.frames;
    if (frame.picture) {
        ++(request->info.hostWhole  ? summary.hostFrames
           : request->info.hostPart ? summary.partlyHostFrames
                                    : summary.deviceFrames);
    } else {
        // What the device can't give, the host's own renderer gives.
        const HostPictureRef picture = mHostRenderer(*request->params);
        if (!picture) {
            throw std::runtime_error("frame " + std::to_string(request->number) +
                                     " could be rendered neither on the device nor by the host");
        }
        frame.picture = std::make_shared<HostPicture>(*ConvertPicture(*mPool, picture, job.format));
        ++summary.hostFrames;
        ++summary.failedFrames;
    }
    mPrevious = request->results;
    return frame;
}

void FrameLoop::Abandon() {
    for (const std::shared_ptr<Request>& request : mAhead) {
        if (request->info.tree) request->info.tree->CancelHostFrames(*request->params, request->gathered);
    }
    RenderSummary unused;
    for (const std::shared_ptr<Request>& request : mAhead) WaitUntilPrepared(*request, unused);
    mAhead.clear();
    mPrevious.reset();
    mSystem->GetDevice()->GetExecutor()->Drain();
}

RenderSummary FrameLoop::Run(const RenderJob& job, const Sink& sink, const std::atomic<bool>& stop) {
    RenderSummary summary;
    const Clock::time_point start = Clock::now();
    std::int64_t next = job.firstFrame;
    while (next < job.endFrame || !mAhead.empty()) {
        if (stop) {
            summary.stopped = true;
            Abandon();
            break;
        }
        while (next < job.endFrame && mAhead.size() <= static_cast<std::size_t>(job.framesAhead)) Prepare(job, next++);
        RenderedFrame frame = RenderNext(job, summary);
        summary.peakDeviceBytes =
            std::max(summary.peakDeviceBytes, mSystem->GetDevice()->GetDeviceMemory()->GetStatistics().peakBytesInUse);
        if (!job.alpha) LayOverBlack(*frame.picture);
        sink(std::move(frame));
    }
    summary.seconds = SecondsSince(start);
    return summary;
}

}  // namespace Vantrel::Host
