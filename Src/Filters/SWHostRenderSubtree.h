// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/SWHostVideoSegmentRenderSuiteNode.h"

namespace Vantrel {

/// Asks the host for the finished picture of the description at this node: a clip with its operators up to an effect,
/// or any other node with all that lies below it.
class SWHostRenderSubtree : public SWHostVideoSegmentRenderSuiteNode {
public:
    static constexpr Guid kInterfaceID = kHostRenderSubtreeID;

    Status QueryInterface(const Guid& iid, void** out) override;
    Status RequestHostRender(const RenderParams& params, VantrelRenderCallback callback, void* context,
                             std::uint32_t& requestID) override;
};

/// The same as a whole tree: its frame goes to the host as it came.
class HostRenderSourceNode final : public SWHostRenderSubtree, public Ostrand::Allocated<HostRenderSourceNode> {
protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
