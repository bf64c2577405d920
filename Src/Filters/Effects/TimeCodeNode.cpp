// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/TimeCodeNode.h"

#include <algorithm>
#include <cstring>

#include "Kiln/FrameOperations.h"
#include "Kiln/Frames.h"
#include "Src/Filters/Effects/ParameterReader.h"
#include "Src/VideoNodes/VideoMediaNode.h"
#include "Tarn/Text.h"

namespace Vantrel {
namespace {

constexpr std::int32_t kGlyphBytes = 4;
constexpr std::int32_t kSource_Media = 1;

EffectKernel gTimecode{R"(..\..\Src\Filters\Effects\TimeCodeNode)", "cuda_kernel_timecode", {}};

void TimecodeKernel(DeviceValue /*glyphs*/, std::int32_t /*skipX*/, std::int32_t /*skipY*/, DeviceValue /*frame*/,
                    std::int32_t /*width*/, std::int32_t /*height*/, std::int32_t /*x*/, std::int32_t /*y*/,
                    std::int32_t /*glyphPitch*/, std::int32_t /*pitch*/, float /*opacity*/,
                    Vellum::PixelFormat /*format*/) {}

/// Truncated; far outside where it is no place.
std::int32_t PlaceOf(double place) {
    constexpr double kFar = 1e6;
    return place > -kFar && place < kFar ? static_cast<std::int32_t>(place) : static_cast<std::int32_t>(-kFar);
}

/// What lies on each side of a picture in the middle of a longer frame.
std::int32_t Margin(std::int32_t longer, std::int32_t length) {
    return longer > length ? (longer - length + 1) / 2 : 0;
}

}  // namespace

void TimeCodeNode::ReadParameters(std::int64_t time) {
    const ParameterReader read(*mDescription, kTimecodeEffect, time);
    mDescription->GetPointParam(kTimecode_Position, time, mCentreX, mCentreY);
    mSize = read.Number(kTimecode_Size);
    mOpacity = read.Number(kTimecode_Opacity);
    mHasFieldSymbol = read.Flag(kTimecode_FieldSymbol);
    mText.format = read.Integer(kTimecode_Format);
    mText.source = read.Integer(kTimecode_Source);
    mText.timeDisplay = read.Integer(kTimecode_TimeDisplay);
    mText.offset = read.Number(kTimecode_Offset);
    mText.startingFrame = read.Integer(kTimecode_StartingFrame);
    mText.label = read.Integer(kTimecode_Label);
}

void TimeCodeNode::LearnTimes() {
    if (mIsLearnt) return;
    const VideoMediaNodeRef media = GetMediaDescription();
    mHasMediaTimecode = media && !media->IsStill();
    if (mHasMediaTimecode) {
        mMediaOffset = media->GetTimeOffset();
        mMediaStart = media->GetStartTimecodeOffset() + media->GetContentStart();
    }
    mOwnOffset = mDescription->GetTimeOffset();
    mIsLearnt = true;
}

std::int64_t TimeCodeNode::GetShownTime(const RenderParams& params) const {
    if (mText.source == kSource_Media && mHasMediaTimecode) {
        return mDescription->ToNodeTime(mOwnOffset - mMediaOffset + params.clipTime, true) + mMediaStart;
    }
    return std::max<std::int64_t>(0, params.clipTime - mOwnOffset - std::max<std::int64_t>(0, mMediaOffset));
}

Status TimeCodeNode::PrepareText(const RenderParams& params, const KernelFrame& frame) {
    ReadParameters(GetNodeTime(params.clipTime, false));
    LearnTimes();
    const auto aspect = static_cast<float>(mFrameSlot->GetPixelAspectRatio().Value());
    Tarn::TextLine line;
    line.text = FormatTimecode(mText, GetShownTime(params), params.sequenceFrameTicks);
    line.hasFieldSymbol = mHasFieldSymbol;
    line.fieldType = params.sequenceFieldType;
    line.fieldSelection = params.fieldSelection;
    line.size = mSize;
    line.scaleX = 1.0F / (aspect * params.scaleX);
    line.scaleY = 1.0F / params.scaleY;
    mTextWidth = std::max(params.outputRect.Width(), frame.Width());
    mTextHeight = std::max(params.outputRect.Height(), frame.Height());
    Tarn::DrawText(line, mTextWidth, mTextHeight, 0, nullptr);
    mGlyphs.reset();
    if (mTextWidth <= 0 || mTextHeight <= 0) return Ostrand::kStatus_OK;

    const std::int32_t stride = mTextWidth * kGlyphBytes;
    const std::size_t bytes = static_cast<std::size_t>(stride) * static_cast<std::size_t>(mTextHeight);
    mGlyphs = std::make_unique<Kiln::DeviceScratchBuffer>(mDevice, bytes);
    if (mGlyphs->GetHandle() == 0) return Ostrand::kStatus_OutOfMemory;
    Kiln::ScopedRecordedHostMemory block(mDevice, bytes);
    if (!block.GetBlock()) return Ostrand::kStatus_OutOfMemory;
    std::memset(block.GetBlock(), 0, bytes);
    Tarn::DrawText(line, mTextWidth, mTextHeight, stride, block.GetBlock());
    return mDevice->GetCommands()->CopyHostToDevice(block.GetBlock(), mGlyphs->GetHandle(), bytes, &block.GetMark());
}

Status TimeCodeNode::PutOnOutput(const RenderParams& params, const KernelFrame& in, Placing& placing) {
    const std::int32_t width = std::max(in.Width(), params.outputRect.Width());
    const std::int32_t height = std::max(in.Height(), params.outputRect.Height());
    const bool isInside = placing.x >= 0 && placing.y >= 0 && placing.x + placing.width <= in.Width() &&
                          placing.y + placing.height <= in.Height();
    if (isInside || (in.Width() == width && in.Height() == height)) return Ostrand::kStatus_OK;
    const Vellum::PixelAspectRatio aspect = mFrameSlot->GetPixelAspectRatio();
    if (Ostrand::Failed(Kiln::CreateGPUVideoFrame(mFrameSlot, mDevice, in.Format(), width, height, aspect,
                                                  Vellum::kFieldType_Progressive, {0, 0}))) {
        return Ostrand::kStatus_OutOfMemory;
    }
    const KernelFrame out(mFrameSlot);
    const std::int32_t left = Margin(width, in.Width()), top = Margin(height, in.Height());
    placing.x += left;
    placing.y += top;
    const Status status =
        Kiln::FillWithTransparentBlack(mDevice, out.Data(), out.RowBytes(), out.Format(), 0, 0, width, height);
    if (Ostrand::Failed(status)) return status;
    return Kiln::DeviceCopyRect(mDevice, in.Data(), in.RowBytes(), out.Data(), out.RowBytes(), out.Format(), 0, 0, left,
                                top, in.Width(), in.Height());
}

Status TimeCodeNode::Blend(Placing placing) const {
    const KernelFrame target(mFrameSlot);
    const auto clip = [](std::int32_t& place, std::int32_t& skip, std::int32_t& length, std::int32_t limit) {
        if (place < 0) {
            skip = -place;
            length += place;
            place = 0;
        }
        length = std::min(length, limit - place);
    };
    clip(placing.x, placing.skipX, placing.width, target.Width());
    clip(placing.y, placing.skipY, placing.height, target.Height());
    if (placing.width < 1 || placing.height < 1) return Ostrand::kStatus_OK;
    const std::uint64_t kernel = gTimecode.Find(mDevice);
    if (kernel == 0) return Ostrand::kStatus_Failure;
    return Launch2D(mDevice, kernel, GridFor(placing.width, placing.height), {}, TimecodeKernel, mGlyphs->GetHandle(),
                    placing.skipX, placing.skipY, target.Data(), placing.width, placing.height, placing.x, placing.y,
                    mTextWidth, target.Pitch(), mOpacity, target.Format());
}

Status TimeCodeNode::Render(const RenderToken& /*token*/, const RenderParams& params,
                            const RenderResultsRef& /*results*/) {
    const VideoFrameRef source = mFrameSlot;
    const KernelFrame in(source);
    Status status = PrepareText(params, in);
    if (Ostrand::Failed(status) || !mGlyphs) return status;
    Placing placing{PlaceOf(in.Width() * mCentreX - mTextWidth * 0.5 + 0.5),
                    PlaceOf(in.Height() * mCentreY - mTextHeight * 0.5 + 0.5),
                    0,
                    0,
                    mTextWidth,
                    mTextHeight};
    status = PutOnOutput(params, in, placing);
    if (!Ostrand::Failed(status)) status = Blend(placing);
    mGlyphs.reset();
    // Another try starts from the same place.
    if (Ostrand::Failed(status)) mFrameSlot = source;
    return status;
}

}  // namespace Vantrel
