// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/Transitions/TransitionBaseNode.h"

namespace Vantrel {

/// "XQVE Additive Dissolve": the incoming clip is added to the outgoing one up to the middle, then the outgoing one is
/// taken away. With f the elapsed fraction and the shares p = min(1, 2 (1 - f)) and q = min(1, 2 f), both at least 0:
///
///     a = min(1, p a1 + q a2),   c = (p a1 c1 + q a2 c2) / a
///
/// Two opaque clips thus simply add up, c = p c1 + q c2, and nothing but coverage is clamped. At 0 and below the result
/// is the outgoing picture, at 1 and above the incoming one, to the bit. It is written over the outgoing clip's frame.
class AdditiveDissolveNode final : public TransitionBaseNode, public Ostrand::Allocated<AdditiveDissolveNode> {
public:
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    Status Mix(const VideoFrameRef& outgoing, const VideoFrameRef& incoming, float elapsed);
};

}  // namespace Vantrel
