// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/CorrectorNode.h"

#include "Kiln/Frames.h"

namespace Vantrel {

SplitView SplitView::Read(const ParameterReader& read, std::int32_t first) {
    SplitView split;
    if (!read.Flag(first)) return split;
    const bool columns = read.Integer(first + 1) == kSplitLayout_Columns;
    (columns ? split.columns : split.rows) = read.Number(first + 2);
    return split;
}

void SplitView::Cut(std::int32_t& width, std::int32_t& height) const {
    if (columns != 1.0F) {
        width = static_cast<std::int32_t>(static_cast<float>(width) * columns);
    } else if (rows != 1.0F) {
        height = static_cast<std::int32_t>(static_cast<float>(height) * rows);
    }
}

Status CorrectorPass::Launch(EffectKernel& kernel, std::initializer_list<DeviceValue> buffers, const float* values,
                             std::size_t count) const {
    const std::uint64_t handle = kernel.Find(mDevice);
    if (handle == 0) return Ostrand::kStatus_Failure;
    KernelArgs args(mDevice->GetFramework(), handle);
    const auto add = [&args](const auto& value) {
        const auto packed = PackArgument(value);
        args.Add(&packed, sizeof packed);
    };
    add(mFrame.Data());
    add(mFrame.Pitch());
    add(mMask);
    add(mMaskPitch);
    add(mFrame.Format());
    add(mWidth);
    add(mHeight);
    for (const DeviceValue buffer : buffers) add(buffer);
    for (std::size_t i = 0; i < count; ++i) add(values[i]);
    const Status status = args.Finish();
    if (Ostrand::Failed(status)) return status;
    const GridSize grid = GridFor(mWidth, mHeight);
    const BlockSize block;
    return mDevice->GetCommands()->Launch(handle, grid.x, grid.y, block.x, block.y, 0);
}

CorrectorNode::Shared CorrectorNode::ReadShared(const ParameterReader& read, const CorrectorLayout& layout,
                                                const RenderParams& params) const {
    Shared shared{};
    if (read.Flag(layout.showMask)) {
        shared.output = kCorrectorOutput_Mask;
    } else if (layout.showTonalRange >= 0 && read.Flag(layout.showTonalRange)) {
        shared.output = kCorrectorOutput_TonalRange;
    } else {
        shared.output = read.Integer(0);
    }
    shared.split = SplitView::Read(read, layout.splitView);
    const Vellum::PixelAspectRatio aspect = mFrameSlot->GetPixelAspectRatio();
    const auto narrowAspect = static_cast<float>(static_cast<double>(aspect.numerator) / aspect.denominator);
    shared.selection = ReadSecondaryParameters(read, layout.selection, narrowAspect, params);
    return shared;
}

Status CorrectorNode::BeginPass(const Shared& shared, CorrectorPass& pass, VideoFrameRef& maskFrame,
                                bool& nothingToDo) const {
    const KernelFrame& frame = pass.mFrame;
    pass.mWidth = frame.Width();
    pass.mHeight = frame.Height();
    shared.split.Cut(pass.mWidth, pass.mHeight);
    nothingToDo = pass.mWidth < 1 || pass.mHeight < 1;
    if (nothingToDo || !HasSecondarySelection(shared.selection)) return Ostrand::kStatus_OK;

    // One float a pixel, in a format of as many bytes.
    if (Ostrand::Failed(Kiln::CreateGPUVideoFrame(maskFrame, mDevice, Marl::kPixelFormat_BGRA_4444_8u, pass.mWidth,
                                                  pass.mHeight, mFrameSlot->GetPixelAspectRatio(),
                                                  Vellum::kFieldType_Progressive, {0, 0}))) {
        return Ostrand::kStatus_OutOfMemory;
    }
    const KernelFrame mask(maskFrame);
    const Status status = RenderSecondaryMask(mDevice, frame.Data(), frame.RowBytes(), mask.Data(), mask.RowBytes(),
                                              frame.Format(), pass.mWidth, pass.mHeight, shared.selection);
    pass.mMask = mask.Data();
    pass.mMaskPitch = mask.RowBytes() / static_cast<std::int32_t>(sizeof(float));
    return status;
}

}  // namespace Vantrel
