// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/Effects/CorrectorNode.h"

namespace Vantrel {

/// Puts colours through a curve for all channels and one for each. What a curve is: Vantrel/Effects/Curves.h.
class RGBCurvesNode final : public CorrectorNode, public Ostrand::Allocated<RGBCurvesNode> {
public:
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
