// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Halden/Executor.h"
#include "Src/Filters/StreamGeometry.h"
#include "Src/Nodes/TransformRenderParamsBaseNode.h"

namespace Vantrel {

/// The border between host memory and the device; its input is a host node. A host frame passes three stages, each with
/// a fingerprint of its own so that it can be found again: staged in memory that the device reads fast, on the device
/// in the host's layout, and on the device in the working format. Always the outer half of a ProxyNode.
///
/// FetchHostFrame runs on the device's executor or on the render thread, and the staged copy on a thread of the node's
/// executor; they use only what Configure wrote, the request's results and the frames they were given.
class UploadNode : public TransformRenderParamsBaseNode {
public:
    UploadNode();

    Status Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) override;
    [[nodiscard]] WideString GetName() override { return u"Upload Node"; }
    Status RequestHostFrames(const RenderParams& params, const RenderResultsRef& results) override;
    Status CollectHostFrames(const RenderParams& params, const RenderResultsRef& results,
                             const RenderResultsRef& previous) override;
    /// Without `blocking` the copy is queued, and `frame` isn't filled yet.
    Status FetchHostFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                          bool blocking, VideoFrameRef& frame) override;
    /// The frame on the device, in the host's layout. Always waits for the host frame's copy.
    Status BeginUpload(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                       bool blocking, VideoFrameRef& frame) override;
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;
    Status EndFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                    std::uint32_t level) override;
    Guid GetFrameHash(const RenderParams& params, const RenderResultsRef& results) override;
    void WriteTimings(std::ostream& stream) override;
    void TransformParams(RenderParams& out, const RenderParams& params) override;

private:
    /// The picture and everything about it that changes how it is staged; nil when the input has no fingerprint. For
    /// params that have been transformed.
    [[nodiscard]] Guid GetInputFrameHash(const RenderParams& transformed, const RenderResultsRef& results);
    [[nodiscard]] Guid GetHostFrameHash(const RenderParams& transformed, const RenderResultsRef& results);
    [[nodiscard]] Guid GetUnconvertedFrameHash(const RenderParams& transformed, const RenderResultsRef& results);

    /// The picture as the producer has it, asked for with params that have been transformed.
    Status FetchInput(const RenderToken& token, const RenderParams& transformed, const RenderResultsRef& results,
                      VideoFrameRef& hostFrame);
    /// Copies the host frame into upload memory and tells everybody who waits for it.
    Status CopyToUploadFrame(const Guid& hash, const VideoFrameRef& uploadFrame, const RenderParams& transformed,
                             const RenderResultsRef& results);
    void ApplyClipAttributes(const VideoFrameRef& uploadFrame, const VideoFrameRef& hostFrame) const;
    /// Is the input a clip's raw picture, rather than one that the host has finished?
    [[nodiscard]] bool HasClipInput() const;
    [[nodiscard]] VideoFrameRef FindUploaded(const Guid& hash, const RenderResultsRef& results) const;
    Status Upload(const Guid& hash, const VideoFrameRef& hostFrame, const RenderResultsRef& results,
                  VideoFrameRef& frame);
    Status Convert(const VideoFrameRef& uploaded, const RenderParams& params);
    void FinishQueueWhenTiming() const;

    float mUploadTime = 0.0F;
    float mDeinterlaceTime = 0.0F;
    float mConvertTime = 0.0F;
    StreamGeometry mStream{{}, Vellum::kPixelAspectRatio_Unknown, 0};
    std::uint32_t mStreamFieldType = Vellum::kFieldType_Unknown;
    std::uint32_t mAlphaType = Vellum::kAlphaType_Straight;
    /// Blue, green and red in the lower three bytes; 0: none.
    std::uint32_t mAlphaMatteColor = 0;
    std::int32_t mScanlineOffset = 0;
    /// Of the last host frame, for the report.
    Vellum::PixelFormat mSourcePixelFormat = Marl::kPixelFormat_Invalid;
    boost::shared_ptr<Halden::threads::AsyncExecutor> mExecutor;
};

}  // namespace Vantrel
