// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/VideoLimiterNode.h"

#include "Src/Filters/Effects/CorrectorNode.h"
#include "Vantrel/Effects/VideoLimiter.h"

namespace Vantrel {
namespace {

EffectKernel gLimiter{R"(..\..\Src\Filters\Effects\VideoLimiterNode)", "VideoLimiter", {}};

}  // namespace

Status VideoLimiterNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                                const RenderResultsRef& /*results*/) {
    DemandInputFrame();
    const ParameterReader read(*mDescription, kVideoLimiterEffect, GetNodeTime(params.clipTime, false));
    const SplitView split = SplitView::Read(read, 0);
    const std::int32_t axis = read.Integer(3), method = read.Integer(10);
    std::array<float, 6> limits{};
    read.Numbers(4, limits, 0, limits.size());
    std::array<float, 4> range{};
    for (std::size_t i = 0; i < range.size(); ++i) {
        const std::int32_t index = 13 + static_cast<std::int32_t>(i);
        range[i] = static_cast<float>(read.GetEffect().GetDoubleParam(index, read.GetTime()) / 255.0);
    }
    const Vellum::Rect bounds = mFrameSlot->GetBounds();
    std::int32_t width = bounds.Width(), height = bounds.Height();
    split.Cut(width, height);
    if (width < 1 || height < 1) return Ostrand::kStatus_OK;
    return RenderInPlace(gLimiter, [&](std::uint64_t kernel, const KernelFrame& frame) {
        return LaunchList(mDevice, kernel, GridFor(width, height), frame.Data(), frame.Pitch(), frame.Format(), width,
                          height, axis, method, limits, range);
    });
}

}  // namespace Vantrel
