// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// A clip's motion and opacity, where its picture doesn't go straight to a compositor. Whichever of the two effects is
/// the upper one does the work of both; the lower one passes its picture on for that frame. Nodes that need placed
/// pictures also put one before a bare input.
///
/// Parameters: of motion position 0, scale (height) 1, scale width 2, uniform scale 3, rotation 4, anchor 5; of opacity
/// percent 0, blend mode 1.
class IntrinsicNode final : public FilterNode, public Ostrand::Allocated<IntrinsicNode> {
public:
    IntrinsicNode();

    [[nodiscard]] WideString GetName() override;
    /// The host's fingerprint doesn't tell what the motion is at this time: it is mixed in.
    Guid GetFrameHash(const RenderParams& params, const RenderResultsRef& results) override;
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
