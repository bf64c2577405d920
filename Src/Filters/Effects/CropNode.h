// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Ostrand/Allocated.h"
#include "Src/Nodes/FilterNode.h"

namespace Vantrel {

/// Cuts the picture's edges off by copying the rest into a frame of its own. Which pixels are cut:
/// Vantrel/Effects/Crop.h. With nothing to cut, the input is handed on.
class CropNode final : public FilterNode, public Ostrand::Allocated<CropNode> {
public:
    CropNode() : FilterNode(false, false) {}
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    /// The shares that are cut off, of the clip's frame or of the frame at hand.
    struct Cuts {
        float left, top, right, bottom;
    };

    void LearnClipFrame(const RenderParams& params);
    [[nodiscard]] Cuts OfFrameAtHand(const Cuts& ofClip, const RenderParams& params) const;
    [[nodiscard]] Status RenderCut(const Cuts& cuts, bool zoom, const RenderParams& params,
                                   const VideoFrameRef& source);

    /// In pixels of the sequence; all 0 until learnt.
    Vellum::Rect mClipRect;
    Vellum::PixelAspectRatio mClipAspect = Vellum::kPixelAspectRatio_Unknown;
};

}  // namespace Vantrel
