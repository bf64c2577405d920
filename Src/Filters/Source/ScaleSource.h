// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Nodes/SourceBaseNode.h"

namespace Vantrel {

/// Brings a picture to the size of the request.
class ScaleSource final : public SourceBaseNode<FilterNode>, public Ostrand::Allocated<ScaleSource> {
public:
    ScaleSource() : SourceBaseNode(false, false) {}

    [[nodiscard]] WideString GetName() override { return u"ScaleSource"; }
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
