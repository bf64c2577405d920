// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <boost/shared_ptr.hpp>

#include "Kiln/Device.h"
#include "Marl/IVideoFrame.h"
#include "Ostrand/InterfaceRef.h"
#include "Vantrel/RenderParams.h"
#include "Vantrel/RenderResults.h"

namespace Vantrel {

class VideoNode;
using VideoNodeRef = boost::shared_ptr<VideoNode>;

/// What a node gets once, when it is configured.
struct RenderRequirements {
    Vellum::Rect frameRect;
    std::int64_t frameTicks = 0;
    Vellum::PixelAspectRatio pixelAspectRatio;
    /// 0 progressive, 1 and 2 the two field orders.
    std::uint32_t fieldType = Vellum::kFieldType_Progressive;
    Kiln::DeviceRef device;
};

class IRenderNode;
using RenderNodeRef = Ostrand::InterfaceRef<IRenderNode>;
/// Handed down unchanged by most nodes; a compositor hands itself down to its layers.
using RenderToken = RenderNodeRef;

/// A node of a segment's render tree. A frame is made by walking the tree in phases:
///
/// 1. CollectHostFrames (host's thread): takes over frames at hand; 0 means that nothing is missing.
/// 2. RequestHostFrames (host's thread): starts the host renders that are missing.
/// 3. FetchHostFrame (device's executor): stages finished host frames for upload.
/// 4. RenderFrame (render thread, which holds the device): renders, the root first, inputs on demand.
/// 5. EndFrame (render thread): lets go of the frame's intermediate pictures.
/// CancelHostFrames (host's thread) may come at any moment after the second.
class IRenderNode : public Ostrand::OstrandUnknown {
public:
    static constexpr Guid kInterfaceID{0x8E990F9B, 0x6311, 0x470D, {0x9C, 0xCA, 0x42, 0x3B, 0x21, 0x0D, 0x60, 0xC2}};

    /// Makes inputs[index] hold the node, growing the list with null entries.
    virtual void SetInput(std::size_t index, const RenderNodeRef& node) = 0;
    virtual Status RequestHostFrames(const RenderParams& params, const RenderResultsRef& results) = 0;
    virtual Status CancelHostFrames(const RenderParams& params, const RenderResultsRef& results) = 0;
    /// Makes the device copy of a host frame.
    virtual Status BeginUpload(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                               bool blocking, VideoFrameRef& frame) = 0;
    /// Takes description and requirements once, after construction. Sets `host` when this part of the tree renders
    /// through the host.
    virtual Status Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) = 0;
    /// Yields this node's host-memory frame; without `blocking` it may only be staged for later.
    virtual Status FetchHostFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                                  bool blocking, VideoFrameRef& frame) = 0;
    /// Yields this node's finished device frame.
    virtual Status RenderFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                               VideoFrameRef& frame) = 0;
    /// Levels: 0 end of the frame; 2 memory pressure, host frames stay; 3 memory pressure or between two fields, host
    /// frames and unconverted device frames stay. Its status is read by nobody.
    virtual Status EndFrame(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                            std::uint32_t level) = 0;
    /// Takes over frames of an earlier request (`previous` may be empty) or of the host's caches.
    virtual Status CollectHostFrames(const RenderParams& params, const RenderResultsRef& results,
                                     const RenderResultsRef& previous) = 0;
    /// The fingerprint of what this node would output; nil: it has none, and nothing may be cached under it.
    virtual Guid GetFrameHash(const RenderParams& params, const RenderResultsRef& results) = 0;
};

}  // namespace Vantrel
