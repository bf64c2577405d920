// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <memory>
#include <string>

#include "Kiln/Scratch.h"
#include "Ostrand/Allocated.h"
#include "Src/Filters/Effects/OneKernelEffect.h"
#include "Vantrel/Effects/Timecode.h"

namespace Vantrel {

/// Burns a timecode into its input; see Vantrel/Effects/Timecode.h. The text is drawn on the processor for each frame,
/// goes to the device as a picture of its own size, and one kernel lays it over the frame: in place, but for a picture
/// smaller than the output that the text leaves.
class TimeCodeNode final : public FilterNode, public Ostrand::Allocated<TimeCodeNode> {
public:
    TimeCodeNode() : FilterNode(false, false) {}
    Status Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) override;

protected:
    [[nodiscard]] std::atomic<std::int32_t>& GetRef() override { return mRefCount; }

private:
    /// Where the drawn text goes; lengths in pixels of the target.
    struct Placing {
        std::int32_t x, y, skipX, skipY, width, height;
    };

    void ReadParameters(std::int64_t time);
    void LearnTimes();
    [[nodiscard]] std::int64_t GetShownTime(const RenderParams& params) const;
    [[nodiscard]] Status PrepareText(const RenderParams& params, const KernelFrame& frame);
    [[nodiscard]] Status PutOnOutput(const RenderParams& params, const KernelFrame& in, Placing& placing);
    [[nodiscard]] Status Blend(Placing placing) const;

    double mCentreX = 0.0;
    double mCentreY = 0.0;
    float mSize = 0.0F;
    float mOpacity = 0.0F;
    bool mHasFieldSymbol = false;
    TimecodeText mText;

    std::unique_ptr<Kiln::DeviceScratchBuffer> mGlyphs;
    std::int32_t mTextWidth = 0;
    std::int32_t mTextHeight = 0;

    // Ticks, of the description; read once.
    bool mIsLearnt = false;
    bool mHasMediaTimecode = false;
    std::int64_t mOwnOffset = 0;
    std::int64_t mMediaOffset = 0;
    std::int64_t mMediaStart = 0;
};

}  // namespace Vantrel
