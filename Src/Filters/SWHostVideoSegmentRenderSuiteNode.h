// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/Nodes/RenderNodeBase.h"
#include "Vantrel/HostSuites.h"

namespace Vantrel {

/// The base of nodes whose picture the host's software renderer makes. A frame is requested, finishes on a thread of
/// the host, and lands in the frame store of RenderResults under the node's fingerprint; nothing here waits for it.
///
/// Such a node has no device side and doesn't walk its inputs: the host renders the whole subtree that it describes.
class SWHostVideoSegmentRenderSuiteNode : public RenderNodeBase {
public:
    /// Starts a host render unless the frame is in flight already or in the host's cache. A refused request leaves its
    /// asynchronous piece counted: who sees the negative status must not wait for the completion.
    Status RequestHostFrames(const RenderParams& params, const RenderResultsRef& results) override;
    Status CancelHostFrames(const RenderParams& params, const RenderResultsRef& results) override;
    Status BeginUpload(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                       bool blocking, VideoFrameRef& frame) override;
    /// The frame if it has arrived, else kStatus_Failure at once, whatever `blocking` says.
    Status FetchHostFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                          bool blocking, VideoFrameRef& frame) override;
    Status RenderFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                       VideoFrameRef& frame) override;
    Status EndFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                    std::uint32_t level) override;
    /// 0 only when the frame is to be had without a render.
    Status CollectHostFrames(const RenderParams& params, const RenderResultsRef& results,
                             const RenderResultsRef& previous) override;

    /// Hands a request to the host. On 0 the host calls `callback` with `context` exactly once.
    virtual Status RequestHostRender(const RenderParams& params, VantrelRenderCallback callback, void* context,
                                     std::uint32_t& requestID) = 0;
};

}  // namespace Vantrel
