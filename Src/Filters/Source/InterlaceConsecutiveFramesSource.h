// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Filters/FieldTime.h"
#include "Src/Nodes/SourceBaseNode.h"
#include "Src/Nodes/TransformRenderParamsBaseNode.h"

namespace Vantrel {

/// Makes one interlaced frame of two frames of the stream, which thereby plays at twice its rate.
class InterlaceConsecutiveFramesSource final : public SourceBaseNode<TransformRenderParamsBaseNode>,
                                               public Ostrand::Allocated<InterlaceConsecutiveFramesSource> {
public:
    InterlaceConsecutiveFramesSource() : SourceBaseNode(false, false) {}

    [[nodiscard]] WideString GetName() override { return u"InterlaceConsecutiveFramesSource"; }
    [[nodiscard]] Vellum::FrameRate GetFrameRate() override;
    [[nodiscard]] Vellum::FrameRate GetFieldRate() override;
    void TransformParams(RenderParams& out, const RenderParams& params) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }
};

}  // namespace Vantrel
