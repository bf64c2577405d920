// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// Stands where the description marks a node as switched off: the input's frame passes through.
class DisabledNode final : public FilterNode, public Ostrand::Allocated<DisabledNode> {
public:
    DisabledNode() : FilterNode(false, false) {}

    [[nodiscard]] WideString GetName() override { return u"DisabledNode"; }
    Status Render(const RenderToken& /*token*/, const RenderParams& /*params*/,
                  const RenderResultsRef& /*results*/) override {
        return Ostrand::kStatus_OK;
    }

protected:
    std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
