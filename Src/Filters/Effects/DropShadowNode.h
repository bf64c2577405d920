// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Nodes/FilterNode.h"
#include "Vantrel/Effects/DropShadow.h"

namespace Vantrel {

/// Lays a shadow of the picture's alpha behind it; what it looks like: Vantrel/Effects/DropShadow.h.
class DropShadowNode final : public FilterNode, public Ostrand::Allocated<DropShadowNode> {
public:
    DropShadowNode() : FilterNode(false, false) {}
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    [[nodiscard]] Status DrawShadow(const ShadowPlace& place, float opacity, std::int64_t time,
                                    const VideoFrameRef& input);
};

}  // namespace Vantrel
