// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/Effects/CorrectorNode.h"

namespace Vantrel {

/// Puts luma through a curve and keeps the colour differences. What a curve is: Vantrel/Effects/Curves.h.
class LumaCurveNode final : public CorrectorNode, public Ostrand::Allocated<LumaCurveNode> {
public:
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
