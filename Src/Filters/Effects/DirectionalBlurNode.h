// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Nodes/FilterNode.h"
#include "Vantrel/Effects/DirectionalBlur.h"

namespace Vantrel {

/// Blurs along a line; how: Vantrel/Effects/DirectionalBlur.h. A blur whose grown picture would not fit on the device
/// at one of its length's keyframes is refused at Configure.
class DirectionalBlurNode final : public FilterNode, public Ostrand::Allocated<DirectionalBlurNode> {
public:
    DirectionalBlurNode() : FilterNode(false, false) {}
    Status Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) override;
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    [[nodiscard]] ShearPlan ComputeShearPlan(std::int64_t time, float scaleX, float scaleY, float aspect,
                                             bool asNodeTime) const;
    [[nodiscard]] Status Blur(const ShearPlan& plan, const VideoFrameRef& input);
};

}  // namespace Vantrel
