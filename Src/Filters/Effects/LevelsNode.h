// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/Effects/OneKernelEffect.h"

namespace Vantrel {

/// Moves black, white and the middle of all channels and of each. Formula: Vantrel/Effects/Levels.h. Works in place.
class LevelsNode final : public OneKernelEffect, public Ostrand::Allocated<LevelsNode> {
public:
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
