// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Ostrand/QueryTable.h"
#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

constexpr Guid kProxyNodeID{0xC4D1B7A2, 0x5E0F, 0x4C63, {0x8A, 0x19, 0x2F, 0x7D, 0x90, 0x6B, 0xE3, 0x54}};

/// One object out of an outer node and the inner node that it wraps: the inner one is made and configured with the
/// outer one, becomes its input 0, and gets the inputs that the proxy is given. Outer doesn't derive from
/// Ostrand::Allocated.
template <class Outer, class Inner>
class ProxyNode final : public Outer, public Ostrand::Allocated<ProxyNode<Outer, Inner>> {
public:
    static constexpr Guid kInterfaceID = kProxyNodeID;

    Status QueryInterface(const Guid& iid, void** out) override {
        // All proxies share the identifier, so it answers with what they have in common.
        return Ostrand::QueryTable(this, iid, out)
            .template Answer<IRenderNode>(kInterfaceID)
            .template Otherwise<Outer>();
    }

    Status Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) override {
        mInner = Ostrand::Demand<IRenderNode>(InterfaceRef<Inner>(new Inner));
        const Status status = mInner->Configure(description, requirements, host);
        if (Ostrand::Failed(status)) return status;
        FilterNode::SetInput(0, mInner);
        return Outer::Configure(description, requirements, host);
    }

    /// Only after Configure.
    void SetInput(std::size_t index, const RenderNodeRef& node) override { mInner->SetInput(index, node); }

protected:
    std::atomic<std::int32_t>& GetRef() override { return this->mRefCount; }

private:
    RenderNodeRef mInner;
};

}  // namespace Vantrel
