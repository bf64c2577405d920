// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Halden/Executor.h"
#include "Vantrel/IRenderNode.h"

/// The top of a frame's road: what RenderSystem's two render operations do with a tree. Nothing is kept between frames.
namespace Vantrel {

/// Posts the staging of a frame's host pictures on the executor. Its failures show later, as what a render doesn't
/// find.
void PostPrepareRender(Halden::threads::AsyncExecutor& executor, const Kiln::DeviceRef& device,
                       const RenderNodeRef& root, const boost::shared_ptr<RenderParams>& params,
                       const RenderResultsRef& results);

/// As RenderSystem::RenderFrames.
Status RenderTree(const Kiln::DeviceRef& device, const RenderNodeRef& root, const RenderParams& params,
                  const RenderResultsRef& results, VideoFrameRef& first, VideoFrameRef& second, std::string* text,
                  const Vellum::Rect& rect);

}  // namespace Vantrel
