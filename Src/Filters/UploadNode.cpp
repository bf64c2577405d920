// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/UploadNode.h"

#include <chrono>

#include "Kiln/Frames.h"
#include "Marl/PixelAspect.h"
#include "Ostrand/MixHash.h"
#include "Src/Filters/FieldTime.h"
#include "Src/Filters/PendingHostMemoryCopyManager.h"
#include "Src/Nodes/WorkingFormat.h"

namespace Vantrel {

namespace {

/// Stands for "the host's YUV with alpha", whose matrix follows from the size of the sequence.
constexpr std::uint32_t kPixelFormat_AnyVUYA = 0x41444340;
constexpr std::int32_t kLastStandardDefinitionHeight = 576;

class Stopwatch {
public:
    [[nodiscard]] float GetMilliseconds() const {
        return std::chrono::duration<float, std::milli>(std::chrono::steady_clock::now() - mStart).count();
    }

private:
    std::chrono::steady_clock::time_point mStart = std::chrono::steady_clock::now();
};

template <std::size_t N>
Guid HashStage(const char (&stage)[N], const Guid& inputFrameHash) {
    if (inputFrameHash.IsNil()) return inputFrameHash;
    return Ostrand::NodeHasher().Text(stage).Identifier(inputFrameHash).Finish();
}

/// A colour format in whole elements, whose alpha type is free to choose.
bool TakesAlphaType(Vellum::PixelFormat format) {
    namespace Bits = Vellum::PixelFormatBits;
    return (format.GetUpper() & Bits::kClassMask) == Bits::kClassRGB && (format.GetUpper() & Bits::kWidthMask) == 0;
}

}  // namespace

UploadNode::UploadNode()
    : TransformRenderParamsBaseNode(false, false), mExecutor(Halden::threads::CreateCPUBoundExecutor()) {}

Status UploadNode::Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) {
    if (const auto media = boost::dynamic_pointer_cast<VideoMediaNode>(description)) {
        mStream = StreamGeometry::Read(*media);
        mStreamFieldType =
            media->IsStill() ? Vellum::kFieldType_Progressive : static_cast<std::uint32_t>(media->GetStreamFieldType());
        mAlphaType = media->GetStreamAlphaType();
        if (mAlphaType == 0 || media->GetStreamIgnoreAlpha()) mAlphaType = Vellum::kAlphaType_None;
        if (mAlphaType == Vellum::kAlphaType_Premultiplied) mAlphaMatteColor = media->GetStreamAlphaMatteColor();
        mScanlineOffset = media->GetScanlineOffsetToImproveVerticalCentering();
    }
    return FilterNode::Configure(description, requirements, host);
}

void UploadNode::TransformParams(RenderParams& out, const RenderParams& params) {
    out = params;
    out.clipTime = AlignToFrame(params.clipTime, params.frameTicks);
    out.time = AlignToFrame(params.time, params.frameTicks);
    if (mStream.scalePolicy == 0 && mStream.aspect != Vellum::kPixelAspectRatio_Unknown) {
        out.pixelAspectRatio = mStream.aspect;
    }
    if (params.pixelFormat == kPixelFormat_AnyVUYA) {
        const bool highDefinition = params.sequenceRect.Height() > kLastStandardDefinitionHeight;
        out.pixelFormat = highDefinition ? Vellum::FourCC("VUYA") : Vellum::FourCC("vuya");
    }
}

Guid UploadNode::GetInputFrameHash(const RenderParams& transformed, const RenderResultsRef& results) {
    const Guid inputHash = GetInput(0)->GetFrameHash(transformed, results);
    if (inputHash.IsNil()) return inputHash;
    return Ostrand::NodeHasher()
        .Text("InputFrame")
        .Identifier(inputHash)
        .Value(mStream.aspect)
        .Value(mStreamFieldType)
        .Value(mAlphaType)
        .Value(mAlphaMatteColor)
        .Value(mStream.scalePolicy)
        .Value(mStream.rect)
        .Value(mScanlineOffset)
        .Finish();
}

Guid UploadNode::GetHostFrameHash(const RenderParams& transformed, const RenderResultsRef& results) {
    return HashStage("HostFrame", GetInputFrameHash(transformed, results));
}

Guid UploadNode::GetUnconvertedFrameHash(const RenderParams& transformed, const RenderResultsRef& results) {
    return HashStage("UnconvertedFrame", GetInputFrameHash(transformed, results));
}

Guid UploadNode::GetFrameHash(const RenderParams& params, const RenderResultsRef& results) {
    RenderParams transformed;
    TransformParams(transformed, params);
    if (params.fieldSelection == Vellum::kFieldSelection_Second && IsInterlaced(mStreamFieldType)) {
        // The second field is a picture of its own on the host's time line.
        const std::int64_t fieldTicks = Vellum::HalfFrameTicks(params.frameTicks);
        transformed.time += fieldTicks;
        transformed.clipTime += fieldTicks;
    }
    const Guid inputFrameHash = GetInputFrameHash(transformed, results);
    if (inputFrameHash.IsNil()) return inputFrameHash;
    return Ostrand::NodeHasher().Text("ConvertedFrame").Identifier(inputFrameHash).Value(params.quality).Finish();
}

Status UploadNode::RequestHostFrames(const RenderParams& params, const RenderResultsRef& results) {
    RenderParams transformed;
    TransformParams(transformed, params);
    const Guid hash = GetHostFrameHash(transformed, results);
    if (!hash.IsNil()) {
        if (const VideoFrameRef staged = mDevice->GetHostMemory()->GetFrameCache().FindFrame(hash)) {
            results->StoreFrame(hash, staged);
        }
    }
    return WalkInputs([&](IRenderNode& input, std::size_t) { return input.RequestHostFrames(transformed, results); });
}

Status UploadNode::CollectHostFrames(const RenderParams& params, const RenderResultsRef& results,
                                     const RenderResultsRef& previous) {
    RenderParams transformed;
    TransformParams(transformed, params);
    const Guid hash = GetHostFrameHash(transformed, results);
    if (previous && !hash.IsNil()) {
        if (const VideoFrameRef staged = previous->FindFrame(hash)) results->StoreFrame(hash, staged);
    }
    return WalkInputs(
        [&](IRenderNode& input, std::size_t) { return input.CollectHostFrames(transformed, results, previous); });
}

bool UploadNode::HasClipInput() const { return HasInterface(GetInput(0).Get(), kHostRenderClipPrefetchID); }

Status UploadNode::FetchInput(const RenderToken& token, const RenderParams& transformed,
                              const RenderResultsRef& results, VideoFrameRef& hostFrame) {
    return WalkInputs([&](IRenderNode& input, std::size_t) {
        return input.FetchHostFrame(token, transformed, results, true, hostFrame);
    });
}

Status UploadNode::FetchHostFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                                  bool blocking, VideoFrameRef& frame) {
    RenderParams transformed;
    TransformParams(transformed, params);
    frame.Reset();
    const Guid hash = GetHostFrameHash(transformed, results);
    // A picture without a fingerprint can't be told from another one: it is made where it is needed and shared with
    // nobody.
    const bool shared = !hash.IsNil();
    if (!shared && !blocking) return Ostrand::kStatus_OK;
    PendingHostMemoryCopyManager& copies = PendingHostMemoryCopyManager::Instance();
    if (shared && copies.GetOrClaim(mDevice, hash, blocking, results, frame)) return Ostrand::kStatus_OK;

    VideoFrameRef hostFrame;
    const Status status = FetchInput(token, transformed, results, hostFrame);
    if (!Ostrand::Failed(status) && hostFrame) {
        const Vellum::Rect rect = HasClipInput() ? Vellum::Rect() : params.outputRect;
        frame = Kiln::AllocateHostFrameForUpload(mDevice, hostFrame, Vellum::ToRenderQuality(params.quality), rect);
    }
    if (!frame) {
        if (shared) copies.Complete(mDevice, hash, {});
        return status;
    }

    if (blocking) {
        const Stopwatch copyTime;
        const Status copied = CopyToUploadFrame(hash, frame, transformed, results);
        if (mDevice->IsTimingEnabled()) mRenderTime += copyTime.GetMilliseconds();
        return copied;
    }
    const InterfaceRef<UploadNode> self(this);
    copies.QueueCopy(mExecutor, hash, [self, hash, frame, transformed, results] {
        static_cast<void>(self->CopyToUploadFrame(hash, frame, transformed, results));
    });
    return Ostrand::kStatus_OK;
}

Status UploadNode::CopyToUploadFrame(const Guid& hash, const VideoFrameRef& uploadFrame,
                                     const RenderParams& transformed, const RenderResultsRef& results) {
    VideoFrameRef hostFrame;
    Status status = FetchInput({}, transformed, results, hostFrame);
    if (!Ostrand::Failed(status)) {
        status = Kiln::CopyToHostFrame(uploadFrame, hostFrame, Vellum::ToRenderQuality(transformed.quality));
    }
    const bool copied = !Ostrand::Failed(status);
    if (copied && HasClipInput()) ApplyClipAttributes(uploadFrame, hostFrame);
    if (copied && mScanlineOffset != 0) {
        Vellum::Point origin = uploadFrame->GetOrigin();
        origin.y += mScanlineOffset;
        uploadFrame->SetOrigin(origin);
    }
    if (!hash.IsNil()) {
        PendingHostMemoryCopyManager::Instance().Complete(mDevice, hash, copied ? uploadFrame : VideoFrameRef());
    }
    return status;
}

void UploadNode::ApplyClipAttributes(const VideoFrameRef& uploadFrame, const VideoFrameRef& hostFrame) const {
    if (mStream.aspect != Vellum::kPixelAspectRatio_Unknown && mStream.aspect != Vellum::kPixelAspectRatio_Any) {
        uploadFrame->SetPixelAspectRatio(
            Marl::AdjustPixelAspectRatioForNonUniformDownsample(mStream.aspect, mStream.rect, hostFrame->GetBounds()));
    }
    if (mStreamFieldType != Vellum::kFieldType_Any && mStreamFieldType != Vellum::kFieldType_SeparateFields &&
        mStreamFieldType != Vellum::kFieldType_Unknown) {
        uploadFrame->SetFieldType(mStreamFieldType);
    }
    // Colour that was blended with a matte isn't scaled by alpha; it is taken apart on the device.
    if (TakesAlphaType(uploadFrame->GetPixelFormat())) {
        uploadFrame->SetAlphaType(mAlphaMatteColor != 0 ? Vellum::kAlphaType_Straight : mAlphaType);
    }
}

VideoFrameRef UploadNode::FindUploaded(const Guid& hash, const RenderResultsRef& results) const {
    VideoFrameRef frame = results->FindFrame(hash);
    if (frame) return frame;
    frame = mDevice->GetDeviceMemory()->GetFrameCache().FindFrame(hash);
    if (frame) results->StoreFrame(hash, frame);
    return frame;
}

Status UploadNode::BeginUpload(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                               bool, VideoFrameRef& frame) {
    RenderParams transformed;
    TransformParams(transformed, params);
    Kiln::FrameCache& hostCache = mDevice->GetHostMemory()->GetFrameCache();
    const Guid hash = GetUnconvertedFrameHash(transformed, results);
    const Guid hostHash = GetHostFrameHash(transformed, results);
    frame.Reset();
    if (!hash.IsNil()) frame = FindUploaded(hash, results);
    if (frame) {
        // Keeps the staged frame recent, in case the device lets this one go.
        static_cast<void>(hostCache.FindFrame(hostHash));
        return Ostrand::kStatus_OK;
    }

    VideoFrameRef hostFrame;
    const Status status = FetchHostFrame(token, params, results, true, hostFrame);
    if (Ostrand::Failed(status) || !hostFrame) return status;
    mSourcePixelFormat = hostFrame->GetPixelFormat();
    const Status uploaded = Upload(hash, hostFrame, results, frame);
    if (!Ostrand::Failed(uploaded) && !hostHash.IsNil()) hostCache.CacheFrame(hostHash, hostFrame);
    return uploaded;
}

Status UploadNode::Upload(const Guid& hash, const VideoFrameRef& hostFrame, const RenderResultsRef& results,
                          VideoFrameRef& frame) {
    FinishQueueWhenTiming();
    const Stopwatch uploadTime;
    frame = Kiln::CopyToDevice(hostFrame);
    if (!frame) return Ostrand::kStatus_OutOfMemory;
    FinishQueueWhenTiming();
    mUploadTime = uploadTime.GetMilliseconds();

    Ostrand::Demand<Marl::IFrameIdentity>(frame)->SetHash(hash);
    if (hash.IsNil()) return Ostrand::kStatus_OK;
    results->StoreFrame(hash, frame);
    if (mDescription && mDescription->IsStill()) {
        mDevice->GetDeviceMemory()->GetFrameCache().CacheFrame(hash, frame);
    }
    return Ostrand::kStatus_OK;
}

void UploadNode::FinishQueueWhenTiming() const {
    // Elsewhere the copy itself is timed by the driver's own order; here the figure would hold earlier work.
    if (mDevice->IsTimingEnabled() && mDevice->GetFramework() == Kiln::DeviceFramework::kOpenCL) {
        static_cast<void>(mDevice->Synchronize());
    }
}

Status UploadNode::Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) {
    VideoFrameRef uploaded;
    const Status status = BeginUpload(token, params, results, true, uploaded);
    if (Ostrand::Failed(status) || !uploaded) return status;

    const Vellum::PixelFormat format = GetWorkingPixelFormat(params, *mDevice);
    const Vellum::Rect bounds = uploaded->GetBounds();
    if (Ostrand::Failed(Kiln::CreateGPUVideoFrame(mFrameSlot, mDevice, format, bounds.Width(), bounds.Height(),
                                                  uploaded->GetPixelAspectRatio(), uploaded->GetFieldType(),
                                                  uploaded->GetOrigin()))) {
        return Ostrand::kStatus_OutOfMemory;
    }
    const Status converted = Convert(uploaded, params);
    if (Ostrand::Failed(converted)) return converted;
    return mFrameSlot->GetPixelFormat() == format ? Ostrand::kStatus_OK : Ostrand::kStatus_Failure;
}

Status UploadNode::Convert(const VideoFrameRef& uploaded, const RenderParams& params) {
    const Stopwatch convertTime;
    Status status = Kiln::ConvertFrame(uploaded, mFrameSlot);
    mConvertTime = convertTime.GetMilliseconds();
    if (Ostrand::Failed(status)) return status;

    if ((mAlphaMatteColor & 0xFFFFFFU) != 0) {
        status = Kiln::UnpremultiplyFrame(mFrameSlot, mAlphaMatteColor);
        if (Ostrand::Failed(status)) return status;
    }
    const std::uint32_t fieldType = mFrameSlot->GetFieldType();
    if (!IsInterlaced(fieldType) || params.fieldSelection == Vellum::kFieldSelection_Frame) return status;

    const bool keepsOddLines =
        (fieldType == Vellum::kFieldType_LowerFirst) == (params.fieldSelection == Vellum::kFieldSelection_First);
    const Stopwatch deinterlaceTime;
    status = Kiln::DeinterlaceFrame(mFrameSlot, keepsOddLines ? 1 : 0);
    mDeinterlaceTime = deinterlaceTime.GetMilliseconds();
    return status;
}

Status UploadNode::EndFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                            std::uint32_t level) {
    RenderParams transformed;
    TransformParams(transformed, params);
    if (level < 3) results->RemoveFrame(GetUnconvertedFrameHash(transformed, results));
    if (level < 2) results->RemoveFrame(GetHostFrameHash(transformed, results));
    return FilterNode::EndFrame(token, transformed, results, level);
}

void UploadNode::WriteTimings(std::ostream& stream) {
    FilterNode::WriteTimings(stream);
    stream << "  Source Pixel Format: " << Vellum::ToText(mSourcePixelFormat) << "\n  Upload: " << mUploadTime
           << "ms, Deinterlace: " << mDeinterlaceTime << "ms, Convert: " << mConvertTime << "ms\n";
}

}  // namespace Vantrel
