// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Src/VideoNodes/VideoEffectNode.h"
#include "Src/VideoNodes/VideoMediaNode.h"
#include "Src/VideoNodes/VideoNode.h"
#include "Src/VideoNodes/VideoSegmentsHandle.h"

/// Makes views of host nodes. Each comes back empty when the host has no such node.
namespace Vantrel {

/// Takes over the id, which the host has counted.
[[nodiscard]] VideoNodeRef MakeVideoNode(std::uint32_t timelineID, std::uint32_t nodeID, std::int64_t offset);

[[nodiscard]] VideoNodeRef AcquireRootNode(const VideoSegmentsHandle& handle, std::int32_t segmentIndex);

/// Input `index` of a host node; its own offset is added to `baseOffset`. The caller sets a parent where one is needed.
[[nodiscard]] VideoNodeRef AcquireInput(std::uint32_t timelineID, std::uint32_t nodeID, std::int32_t index,
                                        std::int64_t baseOffset);
[[nodiscard]] VideoNodeRef AcquireOperator(std::uint32_t timelineID, std::uint32_t nodeID, std::int32_t index,
                                           std::int64_t offset);

/// Input 0 of a clip, whose parent the clip becomes; empty when that isn't media. An effect's:
/// GetClipMedia(GetParent()).
[[nodiscard]] VideoMediaNodeRef GetClipMedia(const VideoNodeRef& clip);
/// Operator `index` of a clip, whose parent the clip becomes; empty when that isn't an effect.
[[nodiscard]] VideoEffectNodeRef GetEffect(const VideoNodeRef& clip, std::int32_t index);

}  // namespace Vantrel
