// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/Effects/CropNode.h"

#include <algorithm>

#include "Kiln/FrameOperations.h"
#include "Kiln/Frames.h"
#include "Src/Filters/Effects/ParameterReader.h"
#include "Src/Filters/StreamGeometry.h"
#include "Src/Nodes/FrameBuffer.h"
#include "Vantrel/Effects/Crop.h"

namespace Vantrel {
namespace {

/// A place between 0 and `length`, towards zero; what isn't a number is 0.
std::int32_t PlaceWithin(float place, std::int32_t length) {
    if (!(place > 0.0F)) return 0;
    return place < static_cast<float>(length) ? static_cast<std::int32_t>(place) : length;
}

std::int32_t FirstKept(std::int32_t length, float cut) {
    return PlaceWithin(static_cast<float>(length) * cut + 0.5F, length);
}

std::int32_t EndOfKept(std::int32_t length, float cut) {
    const auto whole = static_cast<float>(length);
    return PlaceWithin(whole - whole * cut + 0.5F, length);
}

/// One axis of a clip's frame seen from the frame at hand, whose size is 1.
struct ClipAxis {
    ClipAxis(std::int32_t clipLength, std::int32_t outputLength, std::int32_t frameLength, std::int32_t origin)
        : scale(static_cast<double>(static_cast<float>(clipLength) / static_cast<float>(frameLength))),
          start(StartOf(origin - (clipLength - outputLength) / 2, frameLength)) {}

    /// A place in pixels as a share of the frame.
    [[nodiscard]] static double StartOf(std::int32_t place, std::int32_t frameLength) {
        return static_cast<double>(place) / frameLength;
    }

    [[nodiscard]] float FirstCut(float cut) const {
        return static_cast<float>(std::max(0.0, static_cast<double>(cut) * scale + start));
    }
    [[nodiscard]] float LastCut(float cut) const {
        return static_cast<float>(std::max(0.0, 1.0 - static_cast<double>(1.0F - cut) * scale - start));
    }

    double scale;
    double start;
};

}  // namespace

void CropNode::LearnClipFrame(const RenderParams& params) {
    if (mClipRect != Vellum::Rect() && mClipAspect != Vellum::kPixelAspectRatio_Unknown) return;
    mClipAspect = params.pixelAspectRatio;
    mClipRect = params.sequenceRect;
    if (const VideoMediaNodeRef media = GetMediaDescription()) {
        const StreamGeometry stream = StreamGeometry::Read(*media);
        RenderParams fullSize = params;
        fullSize.scaleX = fullSize.scaleY = 1.0F;
        const Vellum::Point size = stream.GetRenderSize(fullSize);
        mClipAspect = stream.aspect;
        mClipRect = {0, 0, size.x, size.y};
    }
}

CropNode::Cuts CropNode::OfFrameAtHand(const Cuts& ofClip, const RenderParams& params) const {
    if (mClipRect == Vellum::Rect() || mClipAspect == Vellum::kPixelAspectRatio_Unknown) return ofClip;
    const Vellum::Rect frame = mFrameSlot->GetBounds();
    const Vellum::Point origin = mFrameSlot->GetOrigin();
    const std::int32_t outputWidth = params.outputRect.Width(), outputHeight = params.outputRect.Height();
    const double reducedX = static_cast<double>(outputWidth) / params.sequenceRect.Width();
    const double reducedY = static_cast<double>(outputHeight) / params.sequenceRect.Height();
    const double aspect = mClipAspect.Value() / mFrameSlot->GetPixelAspectRatio().Value();
    const ClipAxis across(ScaleLength(mClipRect.Width() * aspect * reducedX, 1.0), outputWidth, frame.Width(),
                          origin.x);
    const ClipAxis down(ScaleLength(mClipRect.Height() * reducedY, 1.0), outputHeight, frame.Height(), origin.y);
    return {across.FirstCut(ofClip.left), down.FirstCut(ofClip.top), across.LastCut(ofClip.right),
            down.LastCut(ofClip.bottom)};
}

Status CropNode::Render(const RenderToken& /*token*/, const RenderParams& params, const RenderResultsRef& /*results*/) {
    if (!mFrameSlot) throw Ostrand::NullInterfaceException();
    const ParameterReader read(*mDescription, kCropEffect, GetNodeTime(params.clipTime, false));
    const Cuts ofClip{read.Number(kCrop_Left), read.Number(kCrop_Top), read.Number(kCrop_Right),
                      read.Number(kCrop_Bottom)};
    const bool zoom = read.Flag(kCrop_Zoom);
    LearnClipFrame(params);
    const Cuts cuts = OfFrameAtHand(ofClip, params);
    if (cuts.left == 0.0F && cuts.top == 0.0F && cuts.right == 0.0F && cuts.bottom == 0.0F && !zoom) {
        return Ostrand::kStatus_OK;
    }
    const VideoFrameRef source = mFrameSlot;
    const Status status = RenderCut(cuts, zoom, params, source);
    // Another try starts from the same place.
    if (Ostrand::Failed(status)) mFrameSlot = source;
    return status;
}

Status CropNode::RenderCut(const Cuts& cuts, bool zoom, const RenderParams& params, const VideoFrameRef& source) {
    const FrameBuffer in = FrameBuffer::Demand(source);
    const Vellum::Rect kept{FirstKept(in.Width(), cuts.left), FirstKept(in.Height(), cuts.top),
                            EndOfKept(in.Width(), cuts.right), EndOfKept(in.Height(), cuts.bottom)};
    std::int32_t width = in.Width(), height = in.Height();
    Vellum::Point origin = source->GetOrigin();
    if (zoom && width < params.outputRect.Width()) {
        width = params.outputRect.Width();
        origin.x = 0;
    }
    if (zoom && height < params.outputRect.Height()) {
        height = params.outputRect.Height();
        origin.y = 0;
    }
    const Vellum::PixelAspectRatio aspect = zoom ? params.pixelAspectRatio : source->GetPixelAspectRatio();
    if (Ostrand::Failed(Kiln::CreateGPUVideoFrame(mFrameSlot, mDevice, in.format, width, height, aspect,
                                                  Vellum::kFieldType_Progressive, origin))) {
        return Ostrand::kStatus_OutOfMemory;
    }
    const FrameBuffer out = FrameBuffer::Demand(mFrameSlot);
    const bool leavesNothing = kept.Width() <= 0 || kept.Height() <= 0;
    if (!zoom || leavesNothing) {
        const Status status =
            Kiln::FillWithTransparentBlack(mDevice, out.data, out.rowBytes, out.format, 0, 0, width, height);
        if (Ostrand::Failed(status) || leavesNothing) return status;
    }
    return Kiln::CopyFrameRect(source, kept, mFrameSlot, zoom ? mFrameSlot->GetBounds() : kept,
                               Vellum::ToRenderQuality(params.quality));
}

}  // namespace Vantrel
