// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/Effects/GarbageMatteTable.h"
#include "Src/Filters/Effects/OneKernelEffect.h"

namespace Vantrel {

/// Masks its input, in place, with a polygon of 4, 8 or 16 corners; see Vantrel/Effects/GarbageMatte.h. The polygon
/// goes to a module's global on CUDA and to a buffer on OpenCL, where each number of corners has a kernel of its own.
class GarbageMatteNode final : public OneKernelEffect, public Ostrand::Allocated<GarbageMatteNode> {
public:
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    [[nodiscard]] std::int32_t CountCorners();
    [[nodiscard]] PolyTable MakeTable(std::int32_t count, std::int64_t time, const KernelFrame& frame) const;
};

}  // namespace Vantrel
