// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// Turns the frame in space and draws it in perspective; what it means: Vantrel/Effects/Basic3D.h. The plane's geometry
/// is worked out once a frame. One kernel makes the frame fit to be sampled, another draws the plane. The frame grows
/// to hold the whole plane.
class Basic3DNode final : public FilterNode, public Ostrand::Allocated<Basic3DNode> {
public:
    Basic3DNode() : FilterNode(false, false) {}
    /// An empty frame slot raises NullInterfaceException. After a failure the input's frame is in the slot again.
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
