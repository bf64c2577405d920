// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/Effects/OneKernelEffect.h"

namespace Vantrel {

/// Sharpens by five points; the formula: Vantrel/Effects/Sharpen.h.
class SharpenNode final : public OneKernelEffect, public Ostrand::Allocated<SharpenNode> {
public:
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
