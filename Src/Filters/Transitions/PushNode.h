// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Kiln/FrameOperations.h"
#include "Ostrand/Allocated.h"
#include "Src/Filters/Transitions/TransitionBaseNode.h"

namespace Vantrel {

/// What a push is at one instant.
struct PushSettings {
    float fraction = 0.0F;  ///< counts down when played backwards
    float borderWidth = 0.0F;
    Kiln::float4 color{0.0F, 0.0F, 0.0F, 1.0F};
    std::int32_t direction = 0;
    bool reverse = false;
};

/// "XQVE Push": the incoming picture slides in and shoves the outgoing one out, by whole pixels, with a border of one
/// colour between them. Direction, border and reverse are those of Vantrel/TransitionTable.h. The band is twice the
/// truncated half of the border's width and lies centred on the shift; what a picture would lose to a border wider than
/// itself is nothing.
class PushNode final : public TransitionBaseNode, public Ostrand::Allocated<PushNode> {
public:
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    [[nodiscard]] PushSettings ReadSettings(const RenderParams& params) const;
    /// Lays border and pictures into the frame slot.
    Status Compose(const PushSettings& settings, const VideoFrameRef& outgoing, const VideoFrameRef& incoming);
};

}  // namespace Vantrel
