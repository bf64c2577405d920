// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/SWHostRenderSubtree.h"

namespace Vantrel {

/// A host render inside a tree, behind an upload: what has no node of its own on the device.
class HostRenderSubtreeNode final : public SWHostRenderSubtree, public Ostrand::Allocated<HostRenderSubtreeNode> {
public:
    /// Says that clips, transitions and effects come from the host. kStatus_Failure for media that is uploaded at full
    /// size and that the device has no room for.
    Status Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
