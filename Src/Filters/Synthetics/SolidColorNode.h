// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Kiln/FrameOperations.h"
#include "Ostrand/Allocated.h"
#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// A leaf that makes a whole frame of one colour: the host's colour, black and transparent mattes, and empty time.
///
/// A colour matte's opaque data is 8 bytes, of which the first three are red, green and blue; data of any other size
/// leave it transparent. The fingerprint has no time in it, so a matte renders once for a size, quality and colour.
class SolidColorNode final : public FilterNode, public Ostrand::Allocated<SolidColorNode> {
public:
    SolidColorNode() : FilterNode(false, false) {}

    Status Configure(const VideoNodeRef& description, const RenderRequirements& requirements, bool& host) override;
    Guid GetFrameHash(const RenderParams& params, const RenderResultsRef& results) override;
    /// "BlackVideoSource", "ColorMatte", "BlackMatte" or "TransparentMatte".
    [[nodiscard]] WideString GetName() override { return mMatteName; }
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    WideString mMatteName;
    Kiln::float4 mColor;
};

}  // namespace Vantrel
