// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/RenderPipeline.h"

#include <algorithm>
#include <iomanip>
#include <sstream>

#include "Brae/Conversions.h"
#include "Src/Nodes/FilterNode.h"
#include "Src/Nodes/FinishedInputs.h"
#include "Src/Stopwatch.h"
#include "Vellum/FieldOrder.h"
#include "Vellum/Time.h"

namespace Vantrel {
namespace {

using Vellum::IsInterlaced;

constexpr std::uint32_t kLevel_EndOfFrame = 0;
constexpr std::uint32_t kLevel_BetweenFields = 3;

[[nodiscard]] bool IsOnFrameBoundary(std::int64_t time, std::int64_t frameTicks) {
    Vellum::TickTime aligned(time);
    aligned.AlignToFrame(Vellum::FrameRate::Create(frameTicks));
    return aligned.GetTicks() == time;
}

/// Moves a request from a frame's first field to its second.
void MoveHalfAFrame(RenderParams& params) {
    const std::int64_t half = Vellum::HalfFrameTicks(params.sequenceFrameTicks);
    params.time += half;
    params.clipTime += half;
}

/// One call of RenderFrames: the working copy of the params and what came out.
class FrameRender {
public:
    FrameRender(const RenderNodeRef& root, const RenderParams& callersParams, const RenderResultsRef& results,
                const Vellum::Rect& rect)
        : mRoot(root), mCallersParams(callersParams), mParams(callersParams), mResults(results) {
        mParams.quality = std::max<std::uint32_t>(mParams.quality, 1);
        if (HasInterface(mRoot.Get(), kMulticamNodeID)) {
            mParams.outputRect = rect;
            mParams.pixelAspectRatio = Vellum::kPixelAspectRatio_Square;
        }
        PlanFields();
    }

    void Run() {
        mStatus = mRoot->RenderFrame({}, mParams, mResults, mFirst);
        if (mFirst) {
            FinishFrame();
        } else if (!Ostrand::Query<FilterNode>(mRoot)) {
            // The tree is a single host render, which has nothing to do on the device.
            mStatus = mRoot->FetchHostFrame({}, mCallersParams, mResults, true, mFirst);
        }
    }

    /// Hands the frames over, the temporally first one first.
    Status TakeFrames(VideoFrameRef& first, VideoFrameRef& second) const {
        if (Ostrand::Failed(mStatus)) return mStatus;
        first = mFirst;
        if (mSecond) {
            second = mSecond;
            if (mParams.fieldType != Vellum::kFieldType_UpperFirst) first.Swap(second);
        }
        return mStatus;
    }

private:
    void PlanFields() {
        if (mParams.fieldSelection == Vellum::kFieldSelection_Frame) {
            mSecondPassFollows = IsInterlaced(mParams.fieldType) && mParams.quality >= 2;
            if (mSecondPassFollows) mParams.fieldSelection = Vellum::kFieldSelection_First;
        } else if (mParams.fieldSelection == Vellum::kFieldSelection_Second) {
            // A time off the frame grid has been placed on the field by the caller.
            if (IsOnFrameBoundary(mParams.time, mParams.frameTicks)) MoveHalfAFrame(mParams);
        }
    }

    void FinishFrame() {
        if (mSecondPassFollows) {
            End(kLevel_BetweenFields);
            if (!Ostrand::Failed(mStatus)) {
                mParams.fieldSelection = Vellum::kFieldSelection_Second;
                MoveHalfAFrame(mParams);
                mStatus = mRoot->RenderFrame({}, mParams, mResults, mSecond);
            }
        }
        const bool madeWhole = mParams.fieldSelection == Vellum::kFieldSelection_Frame;
        if (!Ostrand::Failed(mStatus) && IsInterlaced(mParams.fieldType) && madeWhole) {
            mFirst->SetFieldType(Brae::SDKToBEFieldType(mParams.fieldType));
        }
        End(kLevel_EndOfFrame);
    }

    void End(std::uint32_t level) {
        mRoot->EndFrame({}, mParams, mResults, level);
        FinishedInputs::Clear();
    }

    const RenderNodeRef& mRoot;
    const RenderParams& mCallersParams;
    RenderParams mParams;
    const RenderResultsRef& mResults;
    bool mSecondPassFollows = false;
    Status mStatus = Ostrand::kStatus_OK;
    VideoFrameRef mFirst;
    VideoFrameRef mSecond;
};

/// @param root null when nothing was rendered.
[[nodiscard]] std::string WriteReport(Kiln::Device& device, const RenderNodeRef& root, double totalMs,
                                      const std::string& oldText, const RenderResults& results) {
    constexpr int kMegabyteBits = 20;
    std::ostringstream stream;
    stream << std::fixed << std::setprecision(2);
    stream << (device.GetFramework() == Kiln::DeviceFramework::kCuda ? "CUDA" : "OpenCL") << " Render System\n\n";
    if (totalMs != 0.0) stream << "Total render time: " << totalMs << "ms\n";
    const bool timing = device.IsTimingEnabled();
    if (timing) {
        stream << "Memory: " << (device.GetDeviceMemory()->GetStatistics().peakBytesInUse >> kMegabyteBits)
               << "mb, Host: " << (device.GetHostMemory()->GetStatistics().peakBytesInUse >> kMegabyteBits) << "mb\n\n";
        if (const auto filter = Ostrand::Query<FilterNode>(root)) {
            filter->WriteTimings(stream);
            stream << '\n';
        }
    }
    stream << oldText;
    if (!timing) stream << results.GetLog();
    return stream.str();
}

}  // namespace

void PostPrepareRender(Halden::threads::AsyncExecutor& executor, const Kiln::DeviceRef& device,
                       const RenderNodeRef& root, const boost::shared_ptr<RenderParams>& params,
                       const RenderResultsRef& results) {
    executor.Post(
        [device, root, params, results] {
            const Kiln::ScopedDeviceAccess access(device);
            VideoFrameRef dropped;
            root->FetchHostFrame({}, *params, results, false, dropped);
            results->EndAsyncPiece();
        },
        0);
}

Status RenderTree(const Kiln::DeviceRef& device, const RenderNodeRef& root, const RenderParams& params,
                  const RenderResultsRef& results, VideoFrameRef& first, VideoFrameRef& second, std::string* text,
                  const Vellum::Rect& rect) {
    const auto filter = Ostrand::Query<FilterNode>(root);
    const bool isBlack = filter && filter->GetName() == u"BlackVideoSource";
    const RenderNodeRef rendered = isBlack ? RenderNodeRef() : root;
    Status status = Ostrand::kStatus_OK;
    double totalMs = 0.0;
    if (!isBlack) {
        Stopwatch stopwatch;
        device->GetDeviceMemory()->ResetStatistics();
        device->GetHostMemory()->ResetStatistics();
        FrameRender render(rendered, params, results, rect);
        render.Run();
        status = render.TakeFrames(first, second);
        totalMs = stopwatch.ReadSeconds() * 1000.0;
    }
    if (text) *text = WriteReport(*device, rendered, totalMs, *text, *results);
    return status;
}

}  // namespace Vantrel
