// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/Effects/OneKernelEffect.h"
#include "Src/Filters/Effects/UltraKeySetup.h"

namespace Vantrel {

/// Keys out a screen's colour: one kernel makes colours and matte, up to two filters work on the matte, and one kernel
/// shows it where that is wanted. What each control does: Vantrel/Effects/UltraKey.h.
class UltraKeyNode final : public OneKernelEffect, public Ostrand::Allocated<UltraKeyNode> {
public:
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    [[nodiscard]] Status RunPipeline(const RenderParams& params, const KernelFrame& out, const KernelFrame& in) const;
    [[nodiscard]] Status RunStages(const UltraKeySetup& setup, const KernelFrame& frame, DeviceValue record) const;
};

}  // namespace Vantrel
