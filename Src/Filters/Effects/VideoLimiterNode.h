// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/Effects/OneKernelEffect.h"

namespace Vantrel {

/// Brings luma, chroma or the composite signal within limits. Formulas: Vantrel/Effects/VideoLimiter.h. Works in place,
/// over the part that a split view leaves.
class VideoLimiterNode final : public OneKernelEffect, public Ostrand::Allocated<VideoLimiterNode> {
public:
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
