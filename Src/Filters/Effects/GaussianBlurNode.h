// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// Both blurs that a user knows; what they mean: Vantrel/Effects/GaussianBlur.h. The picture grows by what the blur
/// reaches, unless its size is kept. A blur whose grown picture would not fit on the device at one of its keyframes is
/// refused at Configure.
class GaussianBlurNode final : public FilterNode, public Ostrand::Allocated<GaussianBlurNode> {
public:
    GaussianBlurNode() : FilterNode(false, false) {}
    Status Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) override;
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
