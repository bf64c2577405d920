// SPDX-FileCopyrightText: The Vantrel contributors
// SPDX-License-Identifier: Apache-2.0
#include "Src/Filters/AdjustmentNode.h"

#include <algorithm>

#include "Kiln/Frames.h"
#include "Src/Filters/Effects/OneKernelEffect.h"
#include "Src/Nodes/FrameBuffer.h"

namespace Vantrel {
namespace {

EffectKernel gAdjustment{R"(..\..\Src\Filters\AdjustmentNode)", "AdjustmentLayerKernel", {}};

void AdjustmentLayerKernel(DeviceValue /*processed*/, std::int32_t /*processedPitch*/, DeviceValue /*matte*/,
                           std::int32_t /*mattePitch*/, DeviceValue /*out*/, std::int32_t /*outPitch*/,
                           Vellum::PixelFormat /*format*/, std::int32_t /*width*/, std::int32_t /*height*/,
                           float /*opacity*/, std::int32_t /*blendMode*/) {}

enum Input : std::size_t { kBelow = 0, kProcessed = 1, kMatte = 2 };

}  // namespace

AdjustmentNode::AdjustmentNode() : FilterNode(true, false) {}

Status AdjustmentNode::Render(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results) {
    Layer layer;
    layer.motion.overDestination = true;
    Status status = RenderInputs(token, params, results, layer);
    if (Ostrand::Failed(status)) {
        mFrameSlot.Reset();
        return status;
    }
    if (!mFrameSlot) throw Ostrand::NullInterfaceException();
    if (!layer.matte) {
        status = MakeWholeMatte(token, params, results, layer.matte);
        if (Ostrand::Failed(status)) return status;
    }
    // The matte goes where the layer goes; opacity and blend mode wait for the blend.
    LayerMotion place = layer.motion;
    place.opacity = 1.0F;
    place.blendMode = Kiln::kBlend_Normal;
    place.overDestination = false;
    layer.matte = Place(token, params, results, place, layer.matte);
    return Blend(layer);
}

Status AdjustmentNode::RenderInputs(const RenderToken& token, const RenderParams& params,
                                    const RenderResultsRef& results, Layer& layer) {
    for (std::size_t i = 0; i < GetInputCount(); ++i) {
        const RenderNodeRef input = GetInput(i);
        if (!input) throw Ostrand::NullInterfaceException();
        const auto filter = i == kProcessed ? Ostrand::Query<FilterNode>(input) : FilterNodeRef();
        if (filter) ReadLayerMotion(layer.motion, *filter, params, results, true, true);

        VideoFrameRef frame;
        Status status =
            TryWithPurge(token, params, results, [&] { return input->RenderFrame(token, params, results, frame); });
        if (!Ostrand::Failed(status) && i == kBelow) status = CopyBelow(token, params, results, frame);
        if (Ostrand::Failed(status)) return status;
        if (i == kProcessed) {
            layer.processed = Place(token, params, results, LayerMotion(), frame);
            if (!layer.processed) return Ostrand::kStatus_OutOfMemory;
        } else if (i == kMatte) {
            layer.matte = frame;
        }
    }
    return Ostrand::kStatus_OK;
}

Status AdjustmentNode::CopyBelow(const RenderToken& token, const RenderParams& params, const RenderResultsRef& results,
                                 const VideoFrameRef& below) {
    mFrameSlot = Kiln::CreateSimilarFrame(below);
    if (!mFrameSlot) {
        Purge(token, params, results);
        mFrameSlot = Kiln::CreateSimilarFrame(below);
    }
    if (!mFrameSlot) return Ostrand::kStatus_OK;
    return Kiln::CopyFrame(below, mFrameSlot, Vellum::ToRenderQuality(params.quality));
}

Status AdjustmentNode::MakeWholeMatte(const RenderToken& token, const RenderParams& params,
                                      const RenderResultsRef& results, VideoFrameRef& matte) {
    const Vellum::PixelFormat format = mFrameSlot->GetPixelFormat();
    const Status status =
        TryWithPurge(token, params, results, [&] { return CreateLayerTarget(mDevice, format, params, matte); });
    return Ostrand::Failed(status) ? status : Ostrand::Demand<Kiln::IOpaqueFill>(matte)->FillOpaque();
}

VideoFrameRef AdjustmentNode::Place(const RenderToken& token, const RenderParams& params,
                                    const RenderResultsRef& results, const LayerMotion& motion,
                                    const VideoFrameRef& frame) {
    VideoFrameRef placed = TransformFrame(mDevice, params, motion, frame);
    if (!placed) {
        Purge(token, params, results);
        placed = TransformFrame(mDevice, params, motion, frame);
    }
    return placed;
}

Status AdjustmentNode::Blend(const Layer& layer) const {
    const FrameBuffer processed = FrameBuffer::Demand(layer.processed);
    const FrameBuffer out = FrameBuffer::Demand(mFrameSlot);
    FrameBuffer matte;
    static_cast<void>(FrameBuffer::Find(layer.matte, matte));
    const std::uint64_t kernel = gAdjustment.Find(mDevice);
    if (kernel == 0 || processed.format != out.format) return Ostrand::kStatus_Failure;
    if (matte.data != 0 && matte.format != out.format) return Ostrand::kStatus_Failure;

    // A picture below that isn't of the output's size has no pixels beside the layer's.
    const std::int32_t width = std::min(out.Width(), processed.Width());
    const std::int32_t height = std::min(out.Height(), processed.Height());
    const auto pitch = [&out](const FrameBuffer& buffer) { return PitchInPixels(buffer.rowBytes, out.format); };
    return Launch2D(mDevice, kernel, GridFor(width, height), {}, AdjustmentLayerKernel, processed.data,
                    pitch(processed), matte.data, pitch(matte), out.data, pitch(out), out.format, width, height,
                    layer.motion.opacity, layer.motion.blendMode);
}

}  // namespace Vantrel
